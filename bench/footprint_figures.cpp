// SPDX-License-Identifier: Apache-2.0
//
// Runs in a guest without a phone (handset/run --profile off) and prints what the service's process
// holds on the LED class: while idle, after many requests, and after parcels of a megabyte.
#include <cstdio>
#include <cstdlib>
#include <string>

#include <android-base/parseint.h>
#include <fmt/format.h>

#include "bench/guest_figures.h"
#include "handset/common/raw_binder.h"
#include "tests/support/process_view.h"

namespace bench {
namespace {

constexpr uint64_t kRequests = 1'000'000;
constexpr int kLargeRequests = 20;
constexpr uint32_t kCompose = 12;
constexpr int kElements = 44'000;  // of a composition, as many as a request can hold

void print(pid_t service, const std::string& when) {
    fmt::print("{:>8.2f} {:>8} {:>12}  {}\n", qvx::test::privateMemory(service) / 1024.0,
               qvx::test::entriesOf(service, "task").size(),
               qvx::test::entriesOf(service, "fd").size(), when);
    fflush(stdout);
}

void sendLarge() {
    handset::RawBinder client;
    const auto service = client.checkService(kInstance);
    if (!service) fail("the service is not registered");
    handset::RequestBytes request =
            handset::RequestBytes().token("android.hardware.vibrator.IVibrator").int32(kElements);
    for (int i = 0; i < kElements; ++i) request.int32(1).int32(16).int32(0).int32(1).int32(0);
    request.nullBinder();
    for (int i = 0; i < kLargeRequests; ++i) {
        const auto kind = client.transact(*service, kCompose, request).kind;
        if (kind != handset::RawReply::Kind::kData) fail("a parcel of a megabyte was not taken");
    }
}

int run(uint64_t requests) {
    phone({"up", "--no-service", "--profile", "leds"});
    {
        const Service service(kNoLog);
        fmt::print("{:>8} {:>8} {:>12}\n", "MiB", "threads", "descriptors");
        print(service.pid, "idle, private memory (aim: at most 3)");
        for (uint64_t i = 0; i < requests; ++i) {
            int32_t value = 0;
            service.clients.standard->getCompositionDelayMax(&value);
        }
        print(service.pid, fmt::format("after {} requests", requests));
        sendLarge();
        print(service.pid, fmt::format("after {} parcels of a megabyte", kLargeRequests));
    }
    phone({"down"});
    return 0;
}

}  // namespace
}  // namespace bench

// Takes how many requests to make, 1,000,000 without.
int main(int argc, char** argv) {
    uint64_t requests = bench::kRequests;
    if (argc > 2 || (argc == 2 && !android::base::ParseUint(argv[1], &requests))) {
        fmt::print(stderr, "footprint_figures: takes a number of requests, or nothing\n");
        return 2;
    }
    return bench::run(requests);
}
