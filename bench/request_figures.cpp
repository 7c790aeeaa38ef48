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
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include <android-base/file.h>
#include <fmt/format.h>

#include "bench/bare_binder.h"
#include "bench/guest_figures.h"
#include "bench/library_calls.h"
#include "bench/overheard.h"
#include "bench/recorded_request.h"
#include "handset/common/raw_binder.h"
#include "tests/support/all_requests.h"

namespace bench {
namespace {

using qvx::test::allRequests;

constexpr const char* kRecordedLog = "/run/recorded.log";
constexpr uint32_t kPing = 0x5f504e47;
constexpr int kCalls = 40;
constexpr const char* kClasses[] = {"legacy", "leds", "ff"};

// How much of a request the bare service does.
enum Share { kTripAlone, kWithDriver, kWhole, kShares };

struct Recorded {
    const qvx::test::Request* request;
    Overheard bytes;
    RecordedRequest done;
};

bool startsThread(const std::string& name) {
    return name.find("DOUBLE_CLICK") != std::string::npos || name == "std compose";
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

// Each request's second call: the first one may find things that are done but once.
std::vector<Recorded> record(BareDriver* driver) {
    const Service service(kRecordedLog);
    Appended log(kRecordedLog);
    std::vector<Recorded> all;
    for (const qvx::test::Request& request : allRequests()) {
        Recorded recorded = {&request, {}, {}};
        request.ask(service.clients);
        if (startsThread(request.name)) letThreadsEnd();
        log.take();
        recorded.done.calls = traceCalls(service.pid, [&] {
            recorded.bytes = overhear([&] { request.ask(service.clients); });
        });
        recorded.done.lines = linesOf(log.take(), service.pid);
        if (startsThread(request.name)) letThreadsEnd();
        driver->prepare(recorded.done.calls);
        all.push_back(std::move(recorded));
    }
    return all;
}

pid_t startBare(BareDriver& driver, const std::vector<Recorded>& all) {
    return startBareService([&] { return driver.open(); },
                            [&](uint32_t code) {
                                const Recorded& recorded = all[code / kShares % all.size()];
                                if (code % kShares >= kWithDriver) {
                                    for (const DriverCall& call : recorded.done.calls)
                                        driver.carryOut(call);
                                }
                                if (code % kShares >= kWhole) {
                                    for (const LogLine& line : recorded.done.lines) write(line);
                                }
                                return recorded.bytes.replySize;
                            });
}

void printHead(const char* what) {
    fmt::print("{:>5} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8}  {}\n", "ratio", "median", "99 %",
               "floor", "trip", "driver", "logger", "ours", what);
}

void printRow(Series& request, Series& trip, Series& withDriver, Series& whole,
              const std::string& name) {
    const int64_t median = request.median();
    const int64_t floor = whole.median();
    const int64_t driver = withDriver.median();
    fmt::print("{:>5.2f} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8} {:>8}  {}\n",
               static_cast<double>(median) / static_cast<double>(floor), median,
               request.quantile(0.99), floor, trip.median(), driver - trip.median(), floor - driver,
               median - floor, name);
    fflush(stdout);
}

// A call of the library beside a bare one: of the same service, and with the same parcel.
void printLibrary() {
    const pid_t libraryService = startLibraryService();
    const Service service(kNoLog);
    handset::RawBinder raw;
    const auto handle = raw.checkService(kInstance);
    if (!handle) fail("the service is not registered");
    BareClient bare(raw.descriptor(), *handle, kPing, {});
    Series library;
    Series floor;
    const ndk::SpAIBinder binder = service.clients.standard->asBinder();
    for (int i = 0; i < 10 * kCalls; ++i) {
        library.measure([&] { AIBinder_ping(binder.get()); });
        floor.measure([&] { bare.call(); });
    }
    printRow(library, floor, floor, floor, "ping, beside a bare client of the service");
    for (LibraryCall& call : countLibraryCalls(libraryService, kCalls))
        printRow(call.library, call.bare, call.bare, call.bare, call.name);
}

void printClass(const char* phoneClass, const std::string& only) {
    BareDriver driver;
    const std::vector<Recorded> all = record(&driver);
    const Service service(kNoLog);
    const pid_t bareService = startBare(driver, all);
    const int fd = connectBare();
    for (size_t i = 0; i < all.size(); ++i) {
        const std::string name = all[i].request->name;
        if (name.find(only) == std::string::npos) continue;
        Series request;
        Series bare[kShares];
        std::vector<BareClient> clients;
        for (uint32_t share = kTripAlone; share < kShares; ++share) {
            clients.emplace_back(fd, 0, static_cast<uint32_t>(i) * kShares + share,
                                 all[i].bytes.request);
        }
        // Those whose threads have to end take long.
        const int calls = startsThread(name) ? kCalls / 4 : kCalls;
        for (int call = 0; call < calls; ++call) {
            request.measure([&] { all[i].request->ask(service.clients); });
            if (startsThread(name)) letThreadsEnd();
            for (uint32_t share = kTripAlone; share < kShares; ++share)
                bare[share].measure([&] { clients[share].call(); });
        }
        printRow(request, bare[kTripAlone], bare[kWithDriver], bare[kWhole],
                 fmt::format("{} {}", phoneClass, name));
    }
    close(fd);
    endChild(bareService);
}

int run(const std::string& only) {
    runSteadily(0);
    printHead("request");
    withPhone(kClasses[0], printLibrary);
    for (const char* const phoneClass : kClasses)
        withPhone(phoneClass, [&] { printClass(phoneClass, only); });
    return 0;
}

}  // namespace
}  // namespace bench

// Takes a part of the names of the requests to count; without it counts all.
int main(int argc, char** argv) {
    return bench::run(argc > 1 ? argv[1] : "");
}
