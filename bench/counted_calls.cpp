// SPDX-License-Identifier: Apache-2.0
//
// The tracer. The traced process says where the counted part begins and ends with two signals,
// which it is never given.
#include "bench/counted_calls.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <cstring>
#include <numeric>
#include <set>

namespace bench {
namespace {

constexpr int kBegin = SIGUSR1;
constexpr int kEnd = SIGUSR2;
constexpr int kSystemCallStop = SIGTRAP | 0x80;  // PTRACE_O_TRACESYSGOOD

constexpr struct {
    long number;
    const char* name;
} kNames[] = {
        {SYS_brk, "brk"},
        {SYS_clock_nanosleep, "clock_nanosleep"},
        {SYS_clone, "clone"},
        {SYS_clone3, "clone3"},
        {SYS_close, "close"},
        {SYS_exit, "exit"},
        {SYS_futex, "futex"},
        {SYS_getpid, "getpid"},
        {SYS_gettid, "gettid"},
        {SYS_ioctl, "ioctl"},
        {SYS_madvise, "madvise"},
        {SYS_mmap, "mmap"},
        {SYS_mprotect, "mprotect"},
        {SYS_munmap, "munmap"},
        {SYS_openat, "openat"},
        {SYS_read, "read"},
        {SYS_rseq, "rseq"},
        {SYS_rt_sigprocmask, "rt_sigprocmask"},
        {SYS_set_robust_list, "set_robust_list"},
        {SYS_write, "write"},
};

std::string nameOf(long number) {
    for (const auto& [known, name] : kNames) {
        if (known == number) return name;
    }
    return "call " + std::to_string(number);
}

[[noreturn]] void runTraced(const std::function<void()>& prepare,
                            const std::function<void()>& request,
                            const std::function<void()>& finish) {
    if (ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0) _exit(1);
    const pid_t process = getpid();
    raise(SIGSTOP);  // until the tracer has set its options
    prepare();
    syscall(SYS_tgkill, process, process, kBegin);
    request();
    syscall(SYS_tgkill, process, process, kEnd);
    finish();
    _exit(0);
}

class Tracer {
  public:
    explicit Tracer(pid_t process) : mProcess(process) {}

    std::optional<CallCounts> run();

  private:
    bool serve(pid_t thread, int status);
    void enter(pid_t thread, uint64_t number, const uint64_t* arguments);
    void leave(pid_t thread, int64_t result);
    static bool isNodePath(pid_t thread, uint64_t address);
    bool counts(pid_t thread) const { return mBegun && (thread != mProcess || !mEnded); }

    const pid_t mProcess;
    bool mBegun = false;
    bool mEnded = false;
    std::set<pid_t> mOpeningNode;  // threads within an open of a driver's file
    std::set<uint64_t> mNodes;     // descriptors of the driver's files
    CallCounts mCounts;
};

std::optional<CallCounts> Tracer::run() {
    int status = 0;
    if (waitpid(mProcess, &status, 0) != mProcess || !WIFSTOPPED(status)) return std::nullopt;
    constexpr long kOptions = PTRACE_O_TRACESYSGOOD | PTRACE_O_TRACECLONE | PTRACE_O_EXITKILL;
    ptrace(PTRACE_SETOPTIONS, mProcess, nullptr, kOptions);
    ptrace(PTRACE_SYSCALL, mProcess, nullptr, nullptr);
    for (;;) {
        const pid_t thread = waitpid(-1, &status, __WALL);
        if (thread < 0) return std::nullopt;
        if (!WIFSTOPPED(status)) {
            if (thread != mProcess) continue;
            const bool isWhole = WIFEXITED(status) && WEXITSTATUS(status) == 0 && mEnded;
            return isWhole ? std::optional(mCounts) : std::nullopt;
        }
        const int signal = serve(thread, status) ? 0 : WSTOPSIG(status);
        ptrace(PTRACE_SYSCALL, thread, nullptr, signal);
    }
}

// False for a signal that is the process's own.
bool Tracer::serve(pid_t thread, int status) {
    switch (WSTOPSIG(status)) {
        case kSystemCallStop: {
            __ptrace_syscall_info info = {};
            ptrace(PTRACE_GET_SYSCALL_INFO, thread, sizeof(info), &info);
            if (info.op == PTRACE_SYSCALL_INFO_ENTRY) {
                enter(thread, info.entry.nr, info.entry.args);
            } else {
                leave(thread, info.exit.rval);
            }
            return true;
        }
        case kBegin:
            mBegun = true;
            return true;
        case kEnd:
            mEnded = true;
            return true;
        case SIGTRAP:  // a thread was made
        case SIGSTOP:  // it begins
            return true;
        default:
            return false;
    }
}

void Tracer::enter(pid_t thread, uint64_t number, const uint64_t* arguments) {
    const uint64_t descriptor = arguments[0];
    bool isNode = false;
    if (number == SYS_openat) {
        isNode = isNodePath(thread, arguments[1]);
        if (isNode) mOpeningNode.insert(thread);
    } else if (number == SYS_write || number == SYS_ioctl || number == SYS_close) {
        isNode = mNodes.count(descriptor) != 0;
        if (number == SYS_close) mNodes.erase(descriptor);
    }
    if (!counts(thread) || number == SYS_tgkill) return;
    if (isNode) {
        ++mCounts.node;
    } else {
        ++mCounts.other[nameOf(static_cast<long>(number))];
    }
}

void Tracer::leave(pid_t thread, int64_t result) {
    if (mOpeningNode.erase(thread) != 0 && result >= 0)
        mNodes.insert(static_cast<uint64_t>(result));
}

// The driver's files are opened below the working directory, everything else from the root.
bool Tracer::isNodePath(pid_t thread, uint64_t address) {
    const long word = ptrace(PTRACE_PEEKDATA, thread, address, nullptr);
    char first = '\0';
    memcpy(&first, &word, 1);
    return first != '/' && first != '\0';
}

}  // namespace

int CallCounts::otherTotal() const {
    return std::accumulate(other.begin(), other.end(), 0,
                           [](int sum, const auto& call) { return sum + call.second; });
}

std::optional<CallCounts> countCalls(const std::function<void()>& prepare,
                                     const std::function<void()>& request,
                                     const std::function<void()>& finish) {
    const pid_t process = fork();
    if (process < 0) return std::nullopt;
    if (process == 0) runTraced(prepare, request, finish);
    return Tracer(process).run();
}

}  // namespace bench
