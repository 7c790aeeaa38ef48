// SPDX-License-Identifier: Apache-2.0
//
// The socket through which a running driver is asked for things.
#include "handset/driver/control_socket.h"

#include <sys/epoll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

#include <fmt/format.h>

namespace handset {
namespace {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

constexpr size_t kLongestRequest = 1 << 20;

void watch(int events, int fd) {
    epoll_event event{};
    event.events = EPOLLIN;
    event.data.fd = fd;
    epoll_ctl(events, EPOLL_CTL_ADD, fd, &event);
}

}  // namespace

Result<std::unique_ptr<ControlSocket>> ControlSocket::listenAt(const std::string& path,
                                                               Answer answer) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path) {
        return Error() << fmt::format("control socket {}: longer than {} characters", path,
                                      sizeof address.sun_path - 1);
    }
    path.copy(address.sun_path, path.size());

    std::unique_ptr<ControlSocket> control(new ControlSocket(std::move(answer)));
    control->mListener.reset(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    control->mEvents.reset(epoll_create1(EPOLL_CLOEXEC));
    if (!control->mListener.ok() || !control->mEvents.ok()) return ErrnoError() << "control socket";
    struct stat existing {};
    if (lstat(path.c_str(), &existing) == 0 && S_ISSOCK(existing.st_mode)) unlink(path.c_str());
    const int listener = control->mListener.get();
    if (bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) {
        return ErrnoError() << "control socket " + path;
    }
    control->mPath = path;
    if (chmod(path.c_str(), 0600) != 0 || listen(listener, SOMAXCONN) != 0) {
        return ErrnoError() << "control socket " + path;
    }
    watch(control->mEvents.get(), listener);
    return control;
}

ControlSocket::~ControlSocket() {
    if (!mPath.empty()) unlink(mPath.c_str());
}

void ControlSocket::serve() {
    std::array<epoll_event, 8> ready;
    const int count = epoll_wait(mEvents.get(), ready.data(), static_cast<int>(ready.size()), 0);
    for (int i = 0; i < count; ++i) {
        const int fd = ready[static_cast<size_t>(i)].data.fd;
        if (fd == mListener.get()) {
            accept();
        } else if (const auto client = mClients.find(fd);
                   client != mClients.end() && !serveClient(client->second)) {
            mClients.erase(client);
        }
    }
}

void ControlSocket::accept() {
    const int fd = accept4(mListener.get(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK);
    if (fd < 0) return;
    mClients[fd].socket.reset(fd);
    watch(mEvents.get(), fd);
}

// Answers the whole lines that have arrived. False when the client is done with.
bool ControlSocket::serveClient(Client& client) {
    std::array<char, 4096> part;
    const ssize_t size = recv(client.socket.get(), part.data(), part.size(), 0);
    if (size < 0) return errno == EINTR || errno == EAGAIN;
    if (size == 0) return false;
    client.received.append(part.data(), static_cast<size_t>(size));
    for (size_t end = client.received.find('\n'); end != std::string::npos;
         end = client.received.find('\n')) {
        const std::string reply = mAnswer(std::string_view(client.received).substr(0, end)) + "\n";
        client.received.erase(0, end + 1);
        const ssize_t sent = send(client.socket.get(), reply.data(), reply.size(), MSG_NOSIGNAL);
        if (sent != static_cast<ssize_t>(reply.size())) return false;
    }
    return client.received.size() <= kLongestRequest;
}

}  // namespace handset
