// SPDX-License-Identifier: Apache-2.0
//
// Prints what a predefined effect costs on each kind of phone: the system calls of one perform()
// and the user-space instructions that it takes, beside a bare loop that makes the same calls on
// the same nodes. Both are counted, not timed, so a busy machine prints the same figures as an idle
// one (but for a few calls of the double click's thread, which share the C library's memory pools
// with the log). Instructions are counted by Valgrind, in a second run of this program ("--play").
#include <fcntl.h>
#include <linux/input.h>
#include <spawn.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <thread>

#include <android-base/logging.h>
#include <fmt/format.h>
#include <valgrind/callgrind.h>

#include "HwApi.h"
#include "Vibrator.h"
#include "bench/counted_calls.h"
#include "bench/driver_files.h"
#include "bench/effect_phones.h"
#include "bench/temporary_work.h"

namespace {

using aidl::android::hardware::vibrator::Effect;
using aidl::android::hardware::vibrator::EffectStrength;
using aidl::android::hardware::vibrator::HwApi;
using aidl::android::hardware::vibrator::Vibrator;
using bench::CallCounts;
using bench::countCalls;
using bench::DriverCall;
using bench::DriverCalls;
using bench::effectPhones;
using bench::kMotor;
using bench::Phone;

constexpr const char* kEffectNames[] = {"CLICK", "DOUBLE_CLICK", "TICK", "HEAVY_CLICK"};
constexpr Effect kEffects[] = {Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK,
                               Effect::HEAVY_CLICK};
// Requests before the counted one: the first ones bind symbols and open the motor.
constexpr int kWarmUps = 3;

// The least that can be done: the calls alone, without a look at their results.
void playBare(const DriverCalls& calls, int motor) {
    static ff_effect effect = {};
    static const input_event event = {};
    for (const DriverCall& call : calls) {
        switch (call.kind) {
            case DriverCall::Kind::kNode: {
                const int descriptor = open(call.node.c_str(), O_RDWR);
                if (write(descriptor, call.text.data(), call.text.size()) < 0) abort();
                close(descriptor);
                break;
            }
            case DriverCall::Kind::kEvent:
                if (write(motor, &event, sizeof(event)) < 0) abort();
                break;
            case DriverCall::Kind::kErase:
                ioctl(motor, EVIOCRMFF, 0);
                break;
            case DriverCall::Kind::kUpload:
                ioctl(motor, EVIOCSFF, &effect);
                break;
        }
    }
}

// One effect of one phone, played by the service and bare.
class Player {
  public:
    Player(const Phone& phone, const std::string& directory) : mPhone(phone) {
        bench::enterPhone(phone.files, directory);
        mService = ndk::SharedRefBase::make<Vibrator>(std::make_shared<HwApi>());
        mMotor = open(kMotor, O_RDWR);
    }

    void perform(size_t effect) {
        int32_t milliseconds = 0;
        if (!mService->perform(kEffects[effect], EffectStrength::STRONG, nullptr, &milliseconds)
                     .isOk()) {
            abort();
        }
    }

    void performBare(size_t effect) { playBare(mPhone.calls[effect], mMotor); }

    void warmUp(size_t effect) {
        for (int i = 0; i < kWarmUps; ++i) {
            perform(effect);
            performBare(effect);
            bench::joinThreads();
        }
    }

  private:
    const Phone& mPhone;
    std::shared_ptr<Vibrator> mService;
    int mMotor = -1;
};

// How often memory was taken from the heap since this was last set to 0.
size_t heapUses = 0;

// Log lines are written, as on a phone, but nobody has to read them.
void discardLog() {
    const int nowhere = open("/dev/null", O_WRONLY);
    dup2(nowhere, STDERR_FILENO);
    close(nowhere);
}

// The calls of one effect: as it ships, with the log off, and bare. Empty when one fails.
struct EffectCalls {
    CallCounts shipped;
    CallCounts quiet;
    CallCounts bare;
    size_t quietHeap;  // takings of memory
};

// A number that a process and its forks share.
class SharedCount {
  public:
    SharedCount()
        : mCount(static_cast<size_t*>(mmap(nullptr, sizeof(size_t), PROT_READ | PROT_WRITE,
                                           MAP_SHARED | MAP_ANONYMOUS, -1, 0))) {
        if (mCount == MAP_FAILED) abort();
    }
    ~SharedCount() { munmap(mCount, sizeof(size_t)); }
    SharedCount(const SharedCount&) = delete;
    SharedCount& operator=(const SharedCount&) = delete;
    size_t& operator*() const { return *mCount; }

  private:
    size_t* const mCount;
};

std::optional<EffectCalls> countEffect(const Phone& phone, size_t effect,
                                       const std::string& directory) {
    std::unique_ptr<Player> player;
    const auto prepare = [&] {
        discardLog();
        player = std::make_unique<Player>(phone, directory + "/" + phone.files.name);
        player->warmUp(effect);
    };
    const auto prepareQuiet = [&] {
        prepare();
        android::base::SetMinimumLogSeverity(android::base::FATAL);
    };
    const auto perform = [&] { player->perform(effect); };
    const auto performBare = [&] { player->performBare(effect); };
    const SharedCount heap;
    const auto performCounted = [&] {
        heapUses = 0;
        perform();
        *heap = heapUses;
    };
    const auto shipped = countCalls(prepare, perform, bench::joinThreads);
    const auto quiet = countCalls(prepareQuiet, performCounted, bench::joinThreads);
    const auto bare = countCalls(prepare, performBare, bench::joinThreads);
    if (!shipped || !quiet || !bare) return std::nullopt;
    return EffectCalls{*shipped, *quiet, *bare, *heap};
}

bool printCalls(const std::string& directory) {
    fmt::print(
            "System calls of one perform(): those on the driver's nodes beside a bare loop that "
            "makes the same,\nwhat else it takes with the log off, what the log adds,\n"
            "and how often it takes memory from the heap with the log off\n\n"
            "{:<22}{:<14}{:>7}{:>7}{:>7}{:>7}{:>7}{:>7}\n",
            "phone", "effect", "nodes", "bare", "ratio", "else", "log", "heap");
    std::map<std::string, int> others;
    for (const Phone& phone : effectPhones()) {
        for (size_t effect = 0; effect < std::size(kEffects); ++effect) {
            const auto calls = countEffect(phone, effect, directory);
            if (!calls) {
                fmt::print(stderr,
                           "effect_figures: {} {}: the request failed, or a process may not be "
                           "traced here\n",
                           phone.files.name, kEffectNames[effect]);
                return false;
            }
            fmt::print("{:<22}{:<14}{:>7}{:>7}{:>7.2f}{:>7}{:>7}{:>7}\n", phone.files.name,
                       kEffectNames[effect], calls->quiet.node, calls->bare.node,
                       1.0 * calls->quiet.node / calls->bare.node, calls->quiet.otherTotal(),
                       calls->shipped.total() - calls->quiet.total(), calls->quietHeap);
            if (!calls->quiet.other.empty()) others = calls->quiet.other;
        }
    }
    fmt::print("\nelse, in the last row that has any:");
    for (const auto& [name, count] : others) fmt::print(" {} {}", name, count);
    fmt::print("\n\n");
    return true;
}

// The three ways in which an effect is played under Valgrind, in this order.
constexpr const char* kWays[] = {"as it ships", "log off", "bare"};

void countInstructions(const std::function<void()>& request) {
    CALLGRIND_START_INSTRUMENTATION;
    CALLGRIND_ZERO_STATS;
    request();
    CALLGRIND_STOP_INSTRUMENTATION;
    CALLGRIND_DUMP_STATS;
}

// The second run: plays every effect of every phone in each way, one dump of Valgrind's each.
int playAll(const std::string& directory) {
    discardLog();
    // A process that has had a thread takes a longer way through the C library's system calls; the
    // service has from its first double click on, and so have all that is counted here.
    std::thread([] {}).detach();
    bench::joinThreads();
    for (const Phone& phone : effectPhones()) {
        Player player(phone, directory + "/" + phone.files.name);
        for (size_t effect = 0; effect < std::size(kEffects); ++effect) {
            const auto perform = [&] {
                player.perform(effect);
                bench::joinThreads();
            };
            player.warmUp(effect);
            countInstructions(perform);
            {
                const android::base::ScopedLogSeverity off(android::base::FATAL);
                countInstructions(perform);
            }
            countInstructions([&] { player.performBare(effect); });
        }
    }
    return 0;
}

// The instructions of the dump, from its line "totals: N".
std::optional<uint64_t> readTotal(const std::string& path) {
    std::ifstream file(path);
    for (std::string line; std::getline(file, line);) {
        if (line.starts_with("totals: ")) return std::stoull(line.substr(8));
    }
    return std::nullopt;
}

bool runUnderValgrind(const std::string& directory, const std::string& dumps) {
    const std::string self = std::filesystem::read_symlink("/proc/self/exe");
    const std::string output = "--callgrind-out-file=" + dumps;
    // Without --vgdb=no a run that is interrupted leaves valgrind's debugger pipes behind.
    const char* const words[] = {
            "valgrind",           "-q",           "--tool=callgrind", "--vgdb=no",
            "--instr-atstart=no", output.c_str(), self.c_str(),       "--play",
            directory.c_str(),    nullptr};
    pid_t process = 0;
    const int error = posix_spawnp(&process, words[0], nullptr, nullptr,
                                   const_cast<char* const*>(words), environ);
    int status = 0;
    return error == 0 && waitpid(process, &status, 0) == process && status == 0;
}

bool printInstructions(const std::string& directory) {
    const std::string dumps = directory + "/instructions";
    if (!runUnderValgrind(directory, dumps)) {
        fmt::print(stderr, "effect_figures: valgrind is missing or failed\n");
        return false;
    }
    fmt::print(
            "User-space instructions of one perform(), beside the bare loop\n\n"
            "{:<22}{:<14}{:>12}{:>10}{:>7}{:>14}{:>11}\n",
            "phone", "effect", kWays[0], kWays[1], kWays[2], "log off/bare", "log share");
    int dump = 0;
    for (const Phone& phone : effectPhones()) {
        for (const char* effect : kEffectNames) {
            uint64_t counts[3] = {};
            for (uint64_t& count : counts) {
                const auto total = readTotal(dumps + "." + std::to_string(++dump));
                if (!total) {
                    fmt::print(stderr, "effect_figures: valgrind left no count {}\n", dump);
                    return false;
                }
                count = *total;
            }
            const auto [shipped, quiet, bare] = counts;
            fmt::print("{:<22}{:<14}{:>12}{:>10}{:>7}{:>14.2f}{:>10.0f}%\n", phone.files.name,
                       effect, shipped, quiet, bare,
                       static_cast<double>(quiet) / static_cast<double>(bare),
                       100.0 * static_cast<double>(shipped - quiet) / static_cast<double>(shipped));
        }
    }
    return true;
}

}  // namespace

// In place of the C++ library's, for everything in this program.
void* operator new(size_t size) {
    ++heapUses;
    void* const memory = malloc(size);
    if (memory == nullptr) abort();
    return memory;
}
void operator delete(void* memory) noexcept {
    free(memory);
}
void operator delete(void* memory, size_t /*size*/) noexcept {
    free(memory);
}

int main(int argc, char** argv) {
    if (argc == 3 && std::string(argv[1]) == "--play") return playAll(argv[2]);
    if (argc != 1) {
        fmt::print(stderr, "effect_figures: takes no arguments\n");
        return 2;
    }
    return bench::runInTemporaryDirectory([](const std::string& directory) {
        return printCalls(directory) && printInstructions(directory) ? 0 : 1;
    });
}
