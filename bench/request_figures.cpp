// SPDX-License-Identifier: Apache-2.0
//
// Runs in a guest whose clock counts instructions, without a phone but with the kernel module
// (handset/run --counted --driver kernel --profile off), and prints what each request of both
// interfaces costs on each device class: client, kernel and service together, beside its floor.
//
// The floor is a bare program that does the same: a round trip with one ioctl of the client, the same
// calls of the driver, the same lines through the platform's logger. What a request makes the service
// do is traced first; then both run, their lines to /dev/null, a call of one and a call of the other in
// turn, so that whatever else the guest does falls on both alike.
#include <fcntl.h>
#include <signal.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include <android-base/file.h>
#include <android-base/strings.h>
#include <android/binder_manager.h>
#include <fmt/format.h>

#include "bench/bare_binder.h"
#include "bench/recorded_request.h"
#include "handset/common/raw_binder.h"
#include "tests/support/all_requests.h"
#include "tests/support/command.h"

namespace {

// What the binder library sends and how much it gets back, while somebody listens.
struct Overheard {
    std::vector<uint8_t> request;
    size_t replySize = 0;
};
Overheard* listener = nullptr;

template <typename Handle>
void forEachCommand(binder_uintptr_t begin, binder_size_t size, const Handle& handle) {
    const auto* bytes = reinterpret_cast<const uint8_t*>(begin);  // NOLINT
    for (size_t at = 0; at + 4 <= size;) {
        uint32_t command = 0;
        memcpy(&command, bytes + at, sizeof(command));
        binder_transaction_data data{};
        if (_IOC_SIZE(command) == sizeof(data)) memcpy(&data, bytes + at + 4, sizeof(data));
        handle(command, data);
        at += sizeof(command) + _IOC_SIZE(command);
    }
}

}  // namespace

// In place of the C library's, for the binder library.
extern "C" int ioctl(int fd, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (listener == nullptr || request != BINDER_WRITE_READ)
        return static_cast<int>(syscall(SYS_ioctl, fd, request, argument));
    const auto* exchange = static_cast<const binder_write_read*>(argument);
    forEachCommand(exchange->write_buffer, exchange->write_size,
                   [](uint32_t command, const binder_transaction_data& data) {
                       if (command != BC_TRANSACTION) return;
                       const auto* bytes =
                               reinterpret_cast<const uint8_t*>(data.data.ptr.buffer);  // NOLINT
                       listener->request.assign(bytes, bytes + data.data_size);
                   });
    const auto status = static_cast<int>(syscall(SYS_ioctl, fd, request, argument));
    forEachCommand(exchange->read_buffer, exchange->read_consumed,
                   [](uint32_t command, const binder_transaction_data& data) {
                       if (command == BR_REPLY) listener->replySize = data.data_size;
                   });
    return status;
}

namespace bench {
namespace {

using aidl::android::hardware::vibrator::IVibrator;
using aidl::vendor::quorvan::hardware::vibrator::IZelVibrator;
using qvx::test::allRequests;
using qvx::test::runCommand;
using qvx::test::Services;
using std::chrono::milliseconds;

constexpr const char* kInstance = "android.hardware.vibrator.IVibrator/default";
constexpr const char* kService = "android.hardware.vibrator-service.quorvan";
constexpr const char* kReportSwitch = "/sys/module/qvx_vibrator/parameters/report";
constexpr const char* kNoLog = "/dev/null";
constexpr const char* kRecordedLog = "/run/recorded.log";
constexpr uint32_t kPing = 0x5f504e47;
constexpr int kCalls = 40;
constexpr milliseconds kThreadsEnd{150};  // after this the threads a request starts are over
constexpr const char* kClasses[] = {"legacy", "leds", "ff"};

// How much of a request the bare service does.
enum Share { kTripAlone, kWithDriver, kWhole, kShares };

struct Recorded {
    const qvx::test::Request* request;
    Overheard bytes;
    RecordedRequest done;
};

[[noreturn]] void fail(const std::string& text) {
    fmt::print(stderr, "request_figures: {}\n", text);
    exit(1);
}

void phone(const std::vector<std::string>& words) {
    std::vector<std::string> command = {"phone"};
    command.insert(command.end(), words.begin(), words.end());
    if (runCommand(command).status != 0) fail("phone " + words.front() + " failed");
}

Services connect() {
    for (int tries = 0; tries < 5000; ++tries) {
        const ndk::SpAIBinder binder(AServiceManager_checkService(kInstance));
        // The last one may not be forgotten yet.
        if (binder.get() != nullptr && AIBinder_ping(binder.get()) == STATUS_OK) {
            ndk::SpAIBinder extension;
            AIBinder_getExtension(binder.get(), extension.getR());
            return {IVibrator::fromBinder(binder), IZelVibrator::fromBinder(extension)};
        }
        std::this_thread::sleep_for(milliseconds(2));
    }
    fail("the service is not registered");
}

// Some requests end on a thread of the service's own.
bool startsThread(const std::string& name) {
    return name.find("DOUBLE_CLICK") != std::string::npos || name == "std compose";
}

void letThreadsEnd(const std::string& name) {
    if (startsThread(name)) std::this_thread::sleep_for(kThreadsEnd);
}

// What has been added to a file.
class Appended {
  public:
    explicit Appended(std::string path) : mPath(std::move(path)) {}

    std::string take() {
        std::string text;
        android::base::ReadFileToString(mPath, &text);
        std::string added = text.substr(std::min(mSeen, text.size()));
        mSeen = text.size();
        return added;
    }

  private:
    std::string mPath;
    size_t mSeen = 0;
};

pid_t inChild(const char* log, const std::function<void()>& work) {
    const pid_t child = fork();
    if (child != 0) return child;
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    dup2(open(log, O_WRONLY | O_CREAT | O_TRUNC | O_APPEND, 0644), STDERR_FILENO);
    work();
    _exit(1);
}

void endChild(pid_t child) {
    kill(child, SIGTERM);
    waitpid(child, nullptr, 0);
}

// The service, alone and with its own log, while the object lives.
struct Service {
    explicit Service(const char* log)
        : pid(inChild(log,
                      [] {
                          const std::string path = runCommand({"which", kService}).out;
                          execlp("phone", "phone", "exec", "--user", "1000", "--",
                                 android::base::Trim(path).c_str(), nullptr);
                      })),
          clients(connect()) {}
    ~Service() { endChild(pid); }
    Service(const Service&) = delete;
    Service& operator=(const Service&) = delete;

    const pid_t pid;
    const Services clients;
};

// Each request's second call: the first one may find things that are done but once.
std::vector<Recorded> record(BareDriver* driver) {
    const Service service(kRecordedLog);
    Appended log(kRecordedLog);
    std::vector<Recorded> all;
    for (const qvx::test::Request& request : allRequests()) {
        Recorded recorded = {&request, {}, {}};
        request.ask(service.clients);
        letThreadsEnd(request.name);
        log.take();
        recorded.done.calls = traceCalls(service.pid, [&] {
            listener = &recorded.bytes;
            request.ask(service.clients);
            listener = nullptr;
        });
        recorded.done.lines = linesOf(log.take(), service.pid);
        letThreadsEnd(request.name);
        driver->prepare(recorded.done.calls);
        all.push_back(std::move(recorded));
    }
    return all;
}

pid_t startBareService(BareDriver& driver, const std::vector<Recorded>& all) {
    return inChild(kNoLog, [&] {
        const int binder = openBareBinder("/dev/hwbinder");
        if (!driver.open() || setresuid(1000, 1000, 1000) != 0) return;
        serveBare(binder, [&](uint32_t code) {
            const Recorded& recorded = all[code / kShares % all.size()];
            if (code % kShares >= kWithDriver) {
                for (const DriverCall& call : recorded.done.calls) driver.carryOut(call);
            }
            if (code % kShares >= kWhole) {
                for (const LogLine& line : recorded.done.lines) write(line);
            }
            return recorded.bytes.replySize;
        });
    });
}

struct Series {
    std::vector<int64_t> samples;

    int64_t quantile(double q) {
        std::sort(samples.begin(), samples.end());
        return samples[static_cast<size_t>(q * static_cast<double>(samples.size() - 1))];
    }
};

int64_t now() {
    return std::chrono::nanoseconds(std::chrono::steady_clock::now().time_since_epoch()).count();
}

template <typename Call>
void measure(Series* series, const Call& call) {
    const int64_t start = now();
    call();
    series->samples.push_back(now() - start);
}

void printHead(const char* what) {
    fmt::print("{:>5} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8}  {}\n", "ratio", "median", "99 %",
               "floor", "trip", "driver", "logger", "ours", what);
}

void printRow(Series& request, Series& trip, Series& withDriver, Series& whole,
              const std::string& name) {
    const int64_t median = request.quantile(0.5);
    const int64_t floor = whole.quantile(0.5);
    const int64_t driver = withDriver.quantile(0.5);
    fmt::print("{:>5.2f} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8}  {}\n",
               static_cast<double>(median) / static_cast<double>(floor), median,
               request.quantile(0.99), floor, trip.quantile(0.5), driver - trip.quantile(0.5),
               floor - driver, median - floor, name);
    fflush(stdout);
}

// A call of the library beside a bare one of the same service.
void printPing(const Services& services) {
    handset::RawBinder raw;
    const auto handle = raw.checkService(kInstance);
    if (!handle) fail("the service is not registered");
    BareClient bare(raw.descriptor(), *handle, kPing, {});
    Series library;
    Series floor;
    const ndk::SpAIBinder binder = services.standard->asBinder();
    for (int i = 0; i < 10 * kCalls; ++i) {
        measure(&library, [&] { AIBinder_ping(binder.get()); });
        measure(&floor, [&] { bare.call(); });
    }
    printRow(library, floor, floor, floor, "ping, beside a bare client of the service");
}

void printClass(const char* phoneClass) {
    BareDriver driver;
    const std::vector<Recorded> all = record(&driver);
    const Service service(kNoLog);
    const pid_t bareService = startBareService(driver, all);
    if (phoneClass == kClasses[0]) printPing(service.clients);
    const int fd = openBareBinder("/dev/hwbinder");
    while (!BareClient(fd, 0, kTripAlone, {}).call()) std::this_thread::sleep_for(milliseconds(2));
    for (size_t i = 0; i < all.size(); ++i) {
        const std::string name = all[i].request->name;
        Series request;
        Series bare[kShares];
        std::vector<BareClient> clients;
        for (uint32_t share = kTripAlone; share < kShares; ++share) {
            clients.emplace_back(fd, 0, static_cast<uint32_t>(i) * kShares + share,
                                 all[i].bytes.request);
        }
        for (int call = 0; call < kCalls; ++call) {
            measure(&request, [&] { all[i].request->ask(service.clients); });
            letThreadsEnd(name);
            for (uint32_t share = kTripAlone; share < kShares; ++share)
                measure(&bare[share], [&] { clients[share].call(); });
        }
        printRow(request, bare[kTripAlone], bare[kWithDriver], bare[kWhole],
                 fmt::format("{} {}", phoneClass, name));
    }
    close(fd);
    endChild(bareService);
}

int run() {
    if (getenv("PHONE_MODULE") == nullptr) fail("run it with handset/run --driver kernel");
    printHead("request");
    for (const char* const phoneClass : kClasses) {
        phone({"up", "--no-service", "--profile", phoneClass});
        android::base::WriteStringToFile("N", kReportSwitch);
        printClass(phoneClass);
        phone({"down"});
    }
    return 0;
}

}  // namespace
}  // namespace bench

int main() {
    return bench::run();
}
