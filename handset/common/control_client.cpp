// SPDX-License-Identifier: Apache-2.0
//
// Asking the running driver for something.
#include "handset/common/control_client.h"

#include <sys/socket.h>
#include <sys/time.h>
#include <sys/un.h>

#include <array>
#include <cerrno>
#include <cstring>

#include <android-base/unique_fd.h>
#include <fmt/format.h>

namespace handset {
namespace {

using android::base::Error;
using android::base::Result;
using android::base::ResultError;
using android::base::unique_fd;

constexpr timeval kTimeout{5, 0};

ResultError noAnswer() {
    return {fmt::format("the driver does not answer: {}", strerror(errno)), errno};
}

}  // namespace

Result<std::string> askDriver(const std::string& socketPath, std::string_view request) {
    if (request.find('\n') != std::string_view::npos) {
        return Error() << "a request is one line";
    }
    const unique_fd socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    socketPath.copy(address.sun_path, sizeof address.sun_path - 1);
    setsockopt(socket.get(), SOL_SOCKET, SO_RCVTIMEO, &kTimeout, sizeof kTimeout);
    if (connect(socket.get(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) {
        return noAnswer();
    }
    const std::string line = fmt::format("{}\n", request);
    if (send(socket.get(), line.data(), line.size(), MSG_NOSIGNAL) !=
        static_cast<ssize_t>(line.size())) {
        return noAnswer();
    }
    std::string answer;
    while (!answer.ends_with('\n')) {
        std::array<char, 16384> part;
        const ssize_t size = recv(socket.get(), part.data(), part.size(), 0);
        if (size < 0 && errno == EINTR) continue;
        if (size < 0) return noAnswer();
        if (size == 0) return Error() << "the driver ended before it answered";
        answer.append(part.data(), static_cast<size_t>(size));
    }
    answer.pop_back();
    constexpr std::string_view kRefused = "error ";
    if (answer.starts_with(kRefused)) return Error() << answer.substr(kRefused.size());
    return answer.size() > 3 ? answer.substr(3) : std::string();
}

}  // namespace handset
