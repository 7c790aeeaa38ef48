// SPDX-License-Identifier: Apache-2.0
#include "bench/guest_figures.h"

#include <fcntl.h>
#include <linux/random.h>
#include <sched.h>
#include <signal.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <thread>

#include <android-base/file.h>
#include <android-base/strings.h>
#include <android/binder_manager.h>
#include <fmt/format.h>

#include "bench/bare_binder.h"
#include "tests/support/command.h"

namespace bench {

using aidl::android::hardware::vibrator::IVibrator;
using aidl::vendor::quorvan::hardware::vibrator::IZelVibrator;
using qvx::test::runCommand;
using std::chrono::milliseconds;

namespace {

constexpr const char* kReportSwitch = "/sys/module/qvx_vibrator/parameters/report";
constexpr const char* kServiceName = "android.hardware.vibrator-service.quorvan";
constexpr const char* kBareDevice = "/dev/hwbinder";
constexpr uid_t kServiceUser = 1000;
constexpr milliseconds kThreadsEnd{150};
constexpr int kTries = 5000;
constexpr milliseconds kBetweenTries{2};

qvx::test::Services connect() {
    for (int tries = 0; tries < kTries; ++tries) {
        const ndk::SpAIBinder binder(AServiceManager_checkService(kInstance));
        // The last one may not be forgotten yet.
        if (binder.get() != nullptr && AIBinder_ping(binder.get()) == STATUS_OK) {
            ndk::SpAIBinder extension;
            AIBinder_getExtension(binder.get(), extension.getR());
            return {IVibrator::fromBinder(binder), IZelVibrator::fromBinder(extension)};
        }
        std::this_thread::sleep_for(kBetweenTries);
    }
    fail("the service is not registered");
}

}  // namespace

void fail(const std::string& what) {
    fmt::print(stderr, "{}: {}\n", program_invocation_short_name, what);
    exit(1);
}

void phone(const std::vector<std::string>& words) {
    std::vector<std::string> command = {"phone"};
    command.insert(command.end(), words.begin(), words.end());
    if (runCommand(command).status != 0) fail("phone " + words.front() + " failed");
}

void withPhone(const char* name, const std::function<void()>& work) {
    if (getenv("PHONE_MODULE") == nullptr) fail("run it with handset/run --driver kernel");
    phone({"up", "--no-service", "--profile", name});
    android::base::WriteStringToFile("N", kReportSwitch);
    work();
    phone({"down"});
}

std::string serviceProgram() {
    return android::base::Trim(runCommand({"which", kServiceName}).out);
}

void runSteadily(pid_t process) {
    // Nor does the kernel take from such processes for the others.
    android::base::WriteStringToFile("-1", "/proc/sys/kernel/sched_rt_runtime_us");
    const sched_param lowest{sched_get_priority_min(SCHED_FIFO)};
    // A thread that it starts has its turn when nobody waits for an answer.
    if (sched_setscheduler(process, SCHED_FIFO | SCHED_RESET_ON_FORK, &lowest) != 0)
        fail("no real-time scheduling");
}

pid_t inChild(const char* log, const std::function<void()>& work) {
    const pid_t child = fork();
    if (child != 0) return child;
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    dup2(open(log, O_WRONLY | O_CREAT | O_TRUNC | O_APPEND, 0644), STDERR_FILENO);
    runSteadily(0);
    work();
    _exit(1);
}

void endChild(pid_t child) {
    kill(child, SIGTERM);
    waitpid(child, nullptr, 0);
}

Service::Service(const char* log)
    : pid(inChild(log,
                  [] {
                      execlp("phone", "phone", "exec", "--user", "1000", "--",
                             serviceProgram().c_str(), nullptr);
                  })),
      clients(connect()) {}

pid_t startBareService(const std::function<bool()>& prepare,
                       const std::function<size_t(uint32_t code)>& work) {
    return inChild(kNoLog, [&] {
        const int binder = openBareBinder(kBareDevice);
        if (prepare() && setresuid(kServiceUser, kServiceUser, kServiceUser) == 0)
            serveBare(binder, work);
    });
}

int connectBare() {
    const int fd = openBareBinder(kBareDevice);
    for (int tries = 0; tries < kTries; ++tries) {
        if (BareClient(fd, 0, 0, {}).call()) return fd;
        std::this_thread::sleep_for(kBetweenTries);
    }
    fail("the bare service does not answer");
}

void letThreadsEnd() {
    std::this_thread::sleep_for(kThreadsEnd);
}

int64_t now() {
    return std::chrono::nanoseconds(std::chrono::steady_clock::now().time_since_epoch()).count();
}

// The kernel mixes each input event's time into its random pool and hashes that whenever a block of
// it is full. A new seed begins a new block, so the hashing falls into the same place of every call.
void alignRandomPool() {
    static const int pool = open("/dev/random", O_RDWR | O_CLOEXEC);
    if (ioctl(pool, RNDRESEEDCRNG) != 0) fail("the random pool takes no new seed");
}

int64_t Series::quantile(double q) {
    std::sort(mSamples.begin(), mSamples.end());
    return mSamples[static_cast<size_t>(q * static_cast<double>(mSamples.size() - 1))];
}

}  // namespace bench
