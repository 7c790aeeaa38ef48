// SPDX-License-Identifier: Apache-2.0
//
// handset-agent: process 1 of the guest. Sets up the file systems, then runs the commands that the
// launcher sends over the virtio-serial port, one at a time, and reaps every orphan. When the
// launcher goes away, or asks for it, the guest powers off.
#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/klog.h>
#include <sys/reboot.h>
#include <sys/signalfd.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>
#include <string_view>

#include <android-base/unique_fd.h>

#include "handset/guest/command.h"
#include "handset/guest/file_systems.h"
#include "handset/guest/frames.h"

namespace handset {
namespace {

using android::base::unique_fd;

constexpr const char* kPort = "/dev/vport0p1";
constexpr const char* kJoinPort = "/dev/vport0p2";

// Opens a port once the kernel has made it and the other end is connected, both of which happen in
// the background; gives up after ten seconds of attempts every `pauseUs` microseconds.
unique_fd openPort(const char* path, unsigned pauseUs) {
    for (unsigned attempt = 0; attempt < 10'000'000 / pauseUs; ++attempt) {
        unique_fd port(open(path, O_RDWR | O_CLOEXEC));
        pollfd state{.fd = port.get(), .events = POLLOUT, .revents = 0};
        if (port.ok() && poll(&state, 1, 0) == 1 && (state.revents & POLLHUP) == 0) return port;
        usleep(pauseUs);
    }
    return unique_fd();
}

// Serves one launcher.
class Agent {
  public:
    Agent(int port, int childSignals) : mPort(port), mChildSignals(childSignals), mChannel(port) {}

    // Returns when the launcher has gone or wants the guest to end.
    void serve();

  private:
    bool handleRequests();
    bool handle(const Frame& frame);
    bool start();
    bool setTerminal(TerminalSize size);
    bool writeInput();
    bool forward(unique_fd& source, Reply kind);
    bool drain(unique_fd& source, Reply kind);
    bool reapChildren();
    bool finishCommand(int status);
    bool sendKernelLog();

    int mPort;
    int mChildSignals;
    Channel mChannel;
    CommandDescription mDescription;
    Command mCommand;
    std::string mPendingInput;
    bool mInputEnds = false;
};

void Agent::serve() {
    if (!mChannel.send(Reply::Ready, std::string_view())) return;
    for (;;) {
        const short inputEvents = mPendingInput.empty() && !mInputEnds ? 0 : POLLOUT;
        std::array<pollfd, 5> waits{{
                {.fd = mPort, .events = POLLIN, .revents = 0},
                {.fd = mChildSignals, .events = POLLIN, .revents = 0},
                {.fd = mCommand.output.get(), .events = POLLIN, .revents = 0},
                {.fd = mCommand.errors.get(), .events = POLLIN, .revents = 0},
                {.fd = inputEvents ? mCommand.input.get() : -1,
                 .events = inputEvents,
                 .revents = 0},
        }};
        if (poll(waits.data(), waits.size(), -1) < 0 && errno != EINTR) return;
        if (waits[2].revents && !forward(mCommand.output, Reply::Output)) return;
        if (waits[3].revents && !forward(mCommand.errors, Reply::Error)) return;
        if (waits[4].revents && !writeInput()) return;
        if (waits[1].revents && !reapChildren()) return;
        if (waits[0].revents && !handleRequests()) return;
    }
}

// False when the session is over.
bool Agent::handleRequests() {
    if (!mChannel.receive()) return false;
    while (const std::optional<Frame> frame = mChannel.next()) {
        if (!handle(*frame)) return false;
    }
    return true;
}

bool Agent::handle(const Frame& frame) {
    switch (frame.kind) {
        case Request::Argument:
            mDescription.arguments.push_back(frame.payload);
            return true;
        case Request::Environment:
            mDescription.environment.push_back(frame.payload);
            return true;
        case Request::Directory:
            mDescription.directory = frame.payload;
            return true;
        case Request::Terminal:
            return setTerminal({number16At(frame.payload, 0), number16At(frame.payload, 2)});
        case Request::Start:
            return start();
        case Request::Input:
            mPendingInput += frame.payload;
            mInputEnds = mInputEnds || frame.payload.empty();
            return true;
        case Request::KernelLog:
            return sendKernelLog();
        case Request::PowerOff:
            break;
    }
    return false;
}

bool Agent::start() {
    mPendingInput.clear();
    mInputEnds = false;
    const std::optional<StartFailure> failure = startCommand(mDescription, mCommand);
    mDescription = CommandDescription{};
    if (!failure) return true;
    return mChannel.send(Reply::Failed, static_cast<std::uint32_t>(failure->error), failure->what);
}

bool Agent::setTerminal(TerminalSize size) {
    if (mCommand.pid > 0) {
        resizeTerminal(mCommand.output.get(), size);
    } else {
        mDescription.terminal = size;
    }
    return true;
}

// Writes what the command's standard input takes now. A command that does not read any more
// swallows the rest.
bool Agent::writeInput() {
    std::size_t consumed = mPendingInput.size();
    if (!mPendingInput.empty()) {
        const ssize_t written =
                write(mCommand.input.get(), mPendingInput.data(), mPendingInput.size());
        if (written < 0 && (errno == EAGAIN || errno == EINTR)) return true;
        if (written < 0) {
            mInputEnds = true;
        } else {
            consumed = static_cast<std::size_t>(written);
        }
        mPendingInput.erase(0, consumed);
    }
    if (mPendingInput.empty() && mInputEnds) mCommand.input.reset();
    return consumed == 0 || mChannel.send(Reply::Consumed, static_cast<std::uint32_t>(consumed));
}

// Sends what `source` has to the launcher; closes it at its end.
bool Agent::forward(unique_fd& source, Reply kind) {
    std::array<char, 32UL * 1024> chunk;
    const ssize_t got = read(source.get(), chunk.data(), chunk.size());
    if (got < 0 && (errno == EAGAIN || errno == EINTR)) return true;
    if (got <= 0) {
        source.reset();
        return true;
    }
    return mChannel.send(kind, std::string_view(chunk.data(), static_cast<std::size_t>(got)));
}

bool Agent::reapChildren() {
    signalfd_siginfo ignored{};
    while (read(mChildSignals, &ignored, sizeof(ignored)) > 0) {
    }
    int status = 0;
    for (pid_t pid = waitpid(-1, &status, WNOHANG); pid > 0; pid = waitpid(-1, &status, WNOHANG)) {
        if (pid == mCommand.pid && !finishCommand(status)) return false;
    }
    return true;
}

// Sends what an ended command has left in `source`. What runs on in the background may hold the
// other end open and go on writing: nobody waits for it, and no more than the largest pipe holds
// is taken. A terminal delivers its last bytes a moment late.
bool Agent::drain(unique_fd& source, Reply kind) {
    constexpr int kLargestPipeInChunks = 64;
    const int timeoutMs = mCommand.errors.ok() ? 0 : 20;
    pollfd wait{.fd = source.get(), .events = POLLIN, .revents = 0};
    for (int chunk = 0; chunk < kLargestPipeInChunks && source.ok(); ++chunk) {
        if (poll(&wait, 1, timeoutMs) != 1) break;
        if (!forward(source, kind)) return false;
    }
    return true;
}

bool Agent::finishCommand(int status) {
    if (!drain(mCommand.output, Reply::Output) || !drain(mCommand.errors, Reply::Error)) {
        return false;
    }
    mCommand = Command{};
    return mChannel.send(Reply::Exited, static_cast<std::uint32_t>(status));
}

bool Agent::sendKernelLog() {
    constexpr int kReadAll = 3;
    constexpr int kBufferSize = 10;
    std::string log(static_cast<std::size_t>(std::max(klogctl(kBufferSize, nullptr, 0), 1)), '\0');
    const int length = klogctl(kReadAll, log.data(), static_cast<int>(log.size()));
    std::string_view rest(log.data(), static_cast<std::size_t>(std::max(length, 0)));
    while (!rest.empty()) {
        const std::string_view part = rest.substr(0, kMaxPayload);
        if (!mChannel.send(Reply::KernelLog, part)) return false;
        rest.remove_prefix(part.size());
    }
    return mChannel.send(Reply::KernelLog, std::string_view());
}

// Makes the end of children readable on a descriptor.
unique_fd watchChildren() {
    sigset_t children;
    sigemptyset(&children);
    sigaddset(&children, SIGCHLD);
    sigprocmask(SIG_BLOCK, &children, nullptr);
    return unique_fd(signalfd(-1, &children, SFD_CLOEXEC | SFD_NONBLOCK));
}

// Serves, one after the other, the terminals that join the guest; ends with it.
[[noreturn]] void serveJoined() {
    const unique_fd children = watchChildren();
    for (;;) {
        constexpr unsigned kPauseUs = 250'000;
        const unique_fd port = openPort(kJoinPort, kPauseUs);
        if (port.ok()) Agent(port.get(), children.get()).serve();
    }
}

void run() {
    if (const std::string failure = setUpFileSystems(); !failure.empty()) {
        std::fprintf(stderr, "handset-agent: %s\n", failure.c_str());
        return;
    }
    const char* joinable = std::getenv("handset_join");
    if (joinable != nullptr && std::string_view(joinable) == "1" && fork() == 0) serveJoined();
    const unique_fd children = watchChildren();
    const unique_fd port = openPort(kPort, 5000);
    if (!port.ok()) {
        std::fprintf(stderr, "handset-agent: %s did not appear\n", kPort);
        return;
    }
    Agent(port.get(), children.get()).serve();
}

}  // namespace
}  // namespace handset

int main() {
    // A command that stops reading its input must not end process 1.
    signal(SIGPIPE, SIG_IGN);
    try {
        handset::run();
    } catch (const std::exception& failure) {
        // Process 1 must reach the power-off, or the guest stands there until the host's timeout.
        std::fprintf(stderr, "handset-agent: %s\n", failure.what());
    }
    sync();
    reboot(RB_POWER_OFF);
}
