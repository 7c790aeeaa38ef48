// SPDX-License-Identifier: Apache-2.0
#include "bench/recorded_request.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <map>
#include <optional>
#include <regex>
#include <sstream>
#include <system_error>
#include <thread>

#include <android/log.h>
#include <fmt/format.h>

namespace bench {
namespace {

using Kind = DriverCall::Kind;
using SystemCall = __ptrace_syscall_info;

constexpr int kSystemCallStop = SIGTRAP | 0x80;  // PTRACE_O_TRACESYSGOOD

bool isDriversFile(const std::string& path) {
    return path.starts_with("/sys/") || path.starts_with("/dev/input/") ||
           path.starts_with("/proc/bus/input/") || path.starts_with("/efs/");
}

// Reads the service's system calls out of its stops.
class CallReader {
  public:
    explicit CallReader(pid_t service) : mService(service) {}

    void enter(const SystemCall& call) {
        const uint64_t* words = call.entry.args;
        mEntered = decode(static_cast<long>(call.entry.nr), words);
        mDescriptor = static_cast<int>(words[0]);
    }

    void leave(const SystemCall& call) {
        if (!mEntered) return;
        if (mEntered->kind == Kind::kOpen)
            mPaths[static_cast<int>(call.exit.rval)] = mEntered->path;
        if (mEntered->kind == Kind::kClose) mPaths.erase(mDescriptor);
        calls.push_back(std::move(*mEntered));
        mEntered.reset();
    }

    std::vector<DriverCall> calls;

  private:
    // Empty for a call that is none of the driver's.
    std::optional<DriverCall> decode(long number, const uint64_t* words) {
        if (number == SYS_clone3 || number == SYS_clone) return DriverCall{Kind::kThread};
        if (number == SYS_openat) return opened(words);
        const std::string path = pathOf(static_cast<int>(words[0]));
        if (!isDriversFile(path)) return std::nullopt;
        DriverCall call{Kind::kClose, path};
        if (number == SYS_close) return call;
        if (number == SYS_ioctl) return motorRequest(call, words);
        call.size = words[2];
        call.kind = number == SYS_read ? Kind::kRead : Kind::kWrite;
        if (number == SYS_read) return call;
        if (number != SYS_write) return std::nullopt;
        call.data.resize(call.size);
        fetch(words[1], call.data.data(), call.size);
        if (path.starts_with("/dev/input/")) {
            call.kind = Kind::kEvent;
            call.data.copy(reinterpret_cast<char*>(&call.event), sizeof(call.event));
        }
        return call;
    }

    std::optional<DriverCall> opened(const uint64_t* words) const {
        std::array<char, 256> path{};
        fetch(words[1], path.data(), path.size() - 1);
        if (!isDriversFile(path.data())) return std::nullopt;
        return DriverCall{Kind::kOpen, path.data(), static_cast<int>(words[2])};
    }

    std::optional<DriverCall> motorRequest(DriverCall call, const uint64_t* words) const {
        call.kind = words[1] == EVIOCSFF ? Kind::kUpload : Kind::kErase;
        if (call.kind == Kind::kErase) return call;
        fetch(words[2], &call.effect, sizeof(call.effect));
        const ff_periodic_effect& periodic = call.effect.u.periodic;
        call.samples.resize(periodic.custom_len);
        fetch(reinterpret_cast<uint64_t>(periodic.custom_data), call.samples.data(),
              call.samples.size() * sizeof(int16_t));
        return call;
    }

    // What was opened before this one looked is asked of the kernel.
    std::string pathOf(int descriptor) {
        if (const auto known = mPaths.find(descriptor); known != mPaths.end()) return known->second;
        std::error_code error;
        return std::filesystem::read_symlink(fmt::format("/proc/{}/fd/{}", mService, descriptor),
                                             error);
    }

    void fetch(uint64_t address, void* to, size_t size) const {
        iovec here{to, size};
        iovec there{reinterpret_cast<void*>(address), size};  // NOLINT
        process_vm_readv(mService, &here, 1, &there, 1, 0);
    }

    const pid_t mService;
    std::optional<DriverCall> mEntered;
    int mDescriptor = -1;
    std::map<int, std::string> mPaths;
};

}  // namespace

std::vector<DriverCall> traceCalls(pid_t service, const std::function<void()>& request) {
    CallReader reader(service);
    if (ptrace(PTRACE_SEIZE, service, nullptr, PTRACE_O_TRACESYSGOOD) != 0) return {};
    ptrace(PTRACE_INTERRUPT, service, nullptr, nullptr);
    int status = 0;
    waitpid(service, &status, __WALL);
    ptrace(PTRACE_SYSCALL, service, nullptr, nullptr);
    std::atomic<bool> isAnswered = false;
    std::thread client([&] {
        request();
        isAnswered = true;
    });
    for (;;) {
        // Read before the look: what the service did until its answer is seen then.
        const bool isLast = isAnswered;
        const pid_t stopped = waitpid(service, &status, __WALL | WNOHANG);
        if (stopped == 0 && isLast) break;
        if (stopped == 0) {
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
            continue;
        }
        if (WSTOPSIG(status) == kSystemCallStop) {
            SystemCall call{};
            ptrace(PTRACE_GET_SYSCALL_INFO, service, sizeof(call), &call);
            call.op == PTRACE_SYSCALL_INFO_ENTRY ? reader.enter(call) : reader.leave(call);
        }
        ptrace(PTRACE_SYSCALL, service, nullptr, nullptr);
    }
    client.join();
    ptrace(PTRACE_INTERRUPT, service, nullptr, nullptr);
    waitpid(service, &status, __WALL);
    ptrace(PTRACE_DETACH, service, nullptr, nullptr);
    return std::move(reader.calls);
}

std::vector<LogLine> linesOf(std::string_view log, pid_t service) {
    // "TAG I 11-21 20:50:47   211   211 Vibrator.cpp:41] text"; without file and line where it was
    // written in one piece.
    static const std::regex kLine(
            R"((\S+) ([VDIWEF]) \d\d-\d\d \d\d:\d\d:\d\d +\d+ +(\d+) (\S+\.(?:cpp|h):\d+\] )?(.*))");
    static constexpr std::string_view kLetters = "VDIWEF";
    std::vector<LogLine> lines;
    std::istringstream text{std::string(log)};
    for (std::string line; std::getline(text, line);) {
        std::smatch found;
        if (!std::regex_match(line, found, kLine) || std::stoi(found[3]) != service) continue;
        lines.push_back({found[1],
                         static_cast<android::base::LogSeverity>(kLetters.find(found[2].str()[0])),
                         found[5], found[4].matched});
    }
    return lines;
}

void BareDriver::prepare(std::vector<DriverCall>& calls) {
    for (DriverCall& call : calls) {
        const auto known = std::find_if(mFiles.begin(), mFiles.end(),
                                        [&](const File& file) { return file.path == call.path; });
        call.file = static_cast<size_t>(known - mFiles.begin());
        if (known == mFiles.end()) mFiles.push_back({call.path});
        if (call.kind == Kind::kOpen || call.kind == Kind::kThread)
            mFiles[call.file].isOpened = true;
    }
}

bool BareDriver::open() {
    for (File& file : mFiles) {
        if (file.isOpened) continue;
        file.fd = ::open(file.path.c_str(), O_RDWR);
        if (file.fd < 0) return false;
    }
    return true;
}

void BareDriver::carryOut(const DriverCall& call) {
    File& file = mFiles[call.file];
    std::array<char, 8192> text;
    ssize_t done = 0;
    switch (call.kind) {
        case Kind::kOpen:
            file.fd = ::open(file.path.c_str(), call.flags, 0);
            break;
        case Kind::kRead:
            done = ::read(file.fd, text.data(), std::min(call.size, text.size()));
            break;
        case Kind::kWrite:
            done = ::write(file.fd, call.data.data(), call.data.size());
            break;
        case Kind::kClose:
            ::close(file.fd);
            break;
        case Kind::kUpload: {
            ff_effect effect = call.effect;
            effect.id = -1;
            effect.u.periodic.custom_data = const_cast<int16_t*>(call.samples.data());
            ioctl(file.fd, EVIOCSFF, &effect);
            mEffect = effect.id;
            break;
        }
        case Kind::kErase:
            ioctl(file.fd, EVIOCRMFF, static_cast<int>(mEffect));
            break;
        case Kind::kEvent: {
            input_event event = call.event;
            if (event.code != FF_GAIN) event.code = static_cast<uint16_t>(mEffect);
            done = ::write(file.fd, &event, sizeof(event));
            break;
        }
        case Kind::kThread:
            std::thread([] {}).detach();
            break;
    }
    if (done < 0) errno = 0;
}

void write(const LogLine& line) {
    // As the logger's own macros do.
    if (!line.isStreamed) {
        __android_log_write(int{line.severity} + ANDROID_LOG_VERBOSE, line.tag.c_str(),
                            line.text.c_str());
    } else if (android::base::ShouldLog(line.severity, line.tag.c_str())) {
        android::base::LogMessage("bare.cpp", 1, line.severity, line.tag.c_str(), -1).stream()
                << line.text;
    }
}

}  // namespace bench
