// SPDX-License-Identifier: Apache-2.0
//
// Runs where request_figures runs, and prints what requests cost as they grow: 1 to 8 clients, 1 to 339
// packets, 1 to 200 entries of a queue, 1 to 10 primitives, 1 to 1,000 registered names. Ends with
// status 1 when something grows faster than in proportion.
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include <android-base/unique_fd.h>
#include <android/binder_manager.h>
#include <fmt/format.h>

#include "bench/guest_figures.h"

namespace bench {
namespace {

namespace hal = aidl::android::hardware::vibrator;
namespace vendor = aidl::vendor::quorvan::hardware::vibrator;

constexpr int kCalls = 20;
constexpr int kClientsMax = 8;
constexpr int kPings = 200;
// How far above the straight line through the first two points the last one may lie.
constexpr double kTolerance = 1.05;

struct Growth {
    const char* what;
    std::vector<int> sizes;                 // ascending
    std::function<int64_t(int size)> cost;  // instructions
};

// `after` is run after each call and not counted.
template <typename Call>
int64_t medianOf(
        const Call& call, const std::function<void()>& after = [] {}) {
    Series series;
    for (int i = 0; i < kCalls; ++i) {
        series.measure(call);
        after();
    }
    return series.median();
}

// Clients, each a process that was forked before this one used binder, as the driver wants it.
class Clients {
  public:
    Clients() {
        for (int i = 0; i < kClientsMax; ++i) {
            android::base::unique_fd order;
            android::base::unique_fd answer;
            Client client;
            if (!Pipe(&order, &client.order) || !Pipe(&client.answer, &answer)) fail("no pipe");
            client.process = inChild(kNoLog, [&] { pingOnOrder(order.get(), answer.get()); });
            mClients.push_back(std::move(client));
        }
    }
    ~Clients() {
        for (const Client& client : mClients) endChild(client.process);
    }

    // Lets so many of them ping the service at the same time: what a ping of each costs.
    int64_t ping(int clients) {
        const int64_t start = now();
        for (int i = 0; i < clients; ++i) tell(mClients[i].order.get());
        for (int i = 0; i < clients; ++i) await(mClients[i].answer.get());
        return (now() - start) / kPings;
    }

  private:
    struct Client {
        android::base::unique_fd order;
        android::base::unique_fd answer;
        pid_t process = 0;
    };

    static void tell(int fd) {
        if (write(fd, "x", 1) != 1) _exit(1);
    }
    static void await(int fd) {
        char byte = 0;
        if (read(fd, &byte, 1) != 1) fail("a client has ended");
    }

    static void pingOnOrder(int order, int answer) {
        ndk::SpAIBinder service;
        for (;;) {
            await(order);
            if (service.get() == nullptr) service.set(AServiceManager_checkService(kInstance));
            for (int i = 0; i < kPings; ++i) {
                if (AIBinder_ping(service.get()) != STATUS_OK) return;
            }
            tell(answer);
        }
    }

    std::vector<Client> mClients;
};

// Registers names until there are so many, each an object of this process.
void registerNames(int count) {
    static int registered = 0;
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "bench.IName", [](void* args) { return args; }, [](void* /*data*/) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    static const ndk::SpAIBinder object(AIBinder_new(clazz, nullptr));
    for (; registered < count; ++registered) {
        const std::string name = fmt::format("bench.IName/{:04}", registered);
        if (AServiceManager_addService(object.get(), name.c_str()) != EX_NONE)
            fail("a name was not registered");
    }
}

int64_t lookUp(int names) {
    registerNames(names);
    return medianOf(
            [&] { const ndk::SpAIBinder found(AServiceManager_checkService("bench.IName/0000")); });
}

void check(const ndk::ScopedAStatus& status) {
    if (!status.isOk()) fail("a request failed: " + status.getDescription());
}

std::vector<Growth> growths(Clients& clients, const qvx::test::Services& services) {
    const auto& standard = services.standard;
    const auto& extension = services.extension;
    return {{"clients that ping", {1, 2, 4, 8}, [&](int size) { return clients.ping(size); }},
            {"packets played",
             {1, 85, 170, 339},
             [&](int size) {
                 const std::vector<vendor::ZelHapticEnginePacket> packets(
                         size, {.time = 7, .intensity = 100, .frequency = 0});
                 return medianOf([&] { check(extension->performHapticEngine(packets, 10000)); });
             }},
            {"entries of a queue",
             {1, 50, 100, 200},
             [&](int size) {
                 const std::vector<vendor::ZelPlaybackPacket> packets(
                         size, {.patternIndex = 5, .level = 100});
                 return medianOf(
                         [&] { check(extension->performPlaybackEngine(packets, false, 0)); });
             }},
            {"primitives composed",
             {1, 4, 7, 10},
             [&](int size) {
                 const std::vector<hal::CompositeEffect> effects(
                         size, {.delayMs = 0,
                                .primitive = hal::CompositePrimitive::CLICK,
                                .scale = 1.0F});
                 return medianOf([&] { check(standard->compose(effects, nullptr)); },
                                 letThreadsEnd);
             }},
            {"registered names, one looked up", {1, 250, 500, 1000}, lookUp}};
}

// The straight line through the first two points, at the last size; where costs fall, the first.
double expectedAtLast(const std::vector<int>& sizes, const std::vector<int64_t>& costs) {
    const double slope = static_cast<double>(costs[1] - costs[0]) / (sizes[1] - sizes[0]);
    return static_cast<double>(costs[0]) + std::max(slope, 0.0) * (sizes.back() - sizes[0]);
}

// False when it grows faster than in proportion.
bool print(const Growth& growth) {
    std::vector<int64_t> costs;
    costs.reserve(growth.sizes.size());
    for (const int size : growth.sizes) costs.push_back(growth.cost(size));
    const double ratio = static_cast<double>(costs.back()) / expectedAtLast(growth.sizes, costs);
    for (size_t i = 0; i < costs.size(); ++i) {
        fmt::print("{:>5} {:>8}  {}\n", growth.sizes[i], costs[i], growth.what);
    }
    fmt::print("{:>14}  the last beside a straight line through the first two: {:.2f}\n", "",
               ratio);
    fflush(stdout);
    return ratio <= kTolerance;
}

int run() {
    bool isLinear = true;
    runSteadily(0);
    fmt::print("{:>5} {:>8}  of\n", "size", "median");
    withPhone("leds", [&] {
        Clients clients;
        const Service service(kNoLog);
        for (const Growth& growth : growths(clients, service.clients)) {
            if (print(growth)) continue;
            fmt::print(stderr, "growth_figures: {}: grows faster than in proportion\n",
                       growth.what);
            isLinear = false;
        }
    });
    return isLinear ? 0 : 1;
}

}  // namespace
}  // namespace bench

int main() {
    return bench::run();
}
