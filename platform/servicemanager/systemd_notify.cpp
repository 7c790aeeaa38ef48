// SPDX-License-Identifier: Apache-2.0
//
// What a daemon tells systemd about itself: see systemd_notify.h. The protocol is a datagram to a
// socket; systemd promises to keep it, so no library is linked for it.
#include "platform/servicemanager/systemd_notify.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include <android-base/unique_fd.h>

namespace servicemanager {

void notifySystemd(const char* state) {
    const char* const named = std::getenv("NOTIFY_SOCKET");
    if (named == nullptr) return;
    const std::string_view path(named);
    sockaddr_un address{};
    if (path.empty() || path.size() >= sizeof address.sun_path) return;
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, path.size());
    // "@" stands for the zero byte that an abstract name begins with.
    if (address.sun_path[0] == '@') address.sun_path[0] = '\0';
    const android::base::unique_fd client(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    const auto size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + path.size());
    // A failure costs a restart, which systemd explains.
    static_cast<void>(sendto(client.get(), state, std::strlen(state), MSG_NOSIGNAL,
                             reinterpret_cast<const sockaddr*>(&address), size));
}

bool systemdWatches() {
    return std::getenv("WATCHDOG_USEC") != nullptr;
}

}  // namespace servicemanager
