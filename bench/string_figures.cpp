// SPDX-License-Identifier: Apache-2.0
//
// What strings and parcels cost on this machine, each beside the least that does something like it.
//
// The composite compiler for each token of its text, beside a bare scan: a pass over the same bytes that
// finds where the tokens begin and does nothing with them. Both start from a fresh copy of the text,
// because the compiler cuts it up. The texts are those the service sends: the loop of one wavetable
// entry, the longest composition that a client may ask for, and a text that fills the driver's buffer.
//
// The strings of the packet nodes and of the queue, and a parcel with packets written and read, at the
// most there can be, for each packet or entry: beside the digits of the same numbers, and beside copies of
// structures of the same size.
#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <cstring>
#include <functional>
#include <initializer_list>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include <aidl/vendor/quorvan/hardware/vibrator/ZelHapticEnginePacket.h>
#include <android/binder_parcel_utils.h>
#include <benchmark/benchmark.h>
#include <fmt/format.h>

#include "HwApi.h"
#include "driver/PacketText.h"
#include "hwapi/TextBuffer.h"

namespace {

using aidl::android::hardware::vibrator::HwApi;
using aidl::android::hardware::vibrator::kPacketsMax;
using aidl::android::hardware::vibrator::PacketText;
using aidl::android::hardware::vibrator::TextBuffer;
using aidl::android::hardware::vibrator::WT_TYPE10_COMP_BUFFER_SIZE;
using aidl::vendor::quorvan::hardware::vibrator::ZelHapticEnginePacket;

constexpr int kEntriesMax = 200;  // of a queue
constexpr int kRepetitions = 9;

struct Text {
    const char* name;
    std::string text;
};

std::string repeated(const std::string& piece, int count) {
    std::string text;
    for (int i = 0; i < count; ++i) text += piece;
    return text;
}

const std::vector<Text>& texts() {
    static const std::vector<Text> kTexts = {
            {"loop of one entry", "5.100, 10, ~"},
            {"ten primitives", repeated("1000,11.100,", 10)},
            {"full buffer", repeated("5.100.20,10,", 95)},
    };
    return kTexts;
}

bool isSeparator(char character) {
    return character == ',' || character == ' ' || character == '\n';
}

int countTokens(const char* text) {
    int tokens = 0;
    bool inToken = false;
    for (; *text != '\0'; ++text) {
        const bool separator = isSeparator(*text);
        if (!separator && !inToken) ++tokens;
        inToken = !separator;
    }
    return tokens;
}

// Repeats `pass` and reports the nanoseconds for each of its pieces.
template <typename Pass>
void measure(benchmark::State& state, int pieces, Pass pass) {
    for ([[maybe_unused]] auto _ : state) {
        benchmark::ClobberMemory();
        benchmark::DoNotOptimize(pass());
    }
    state.counters["per_piece"] =
            benchmark::Counter(pieces * static_cast<double>(state.iterations()),
                               benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}

// Work in so many pieces, and what it stands beside.
struct Comparison {
    std::string name;
    const char* pieces;
    const char* baseline;
    int count;
    std::function<int()> work;
    std::function<int()> bare;
};

// `pass` on a fresh copy of the text each time.
std::function<int()> onCopies(const std::string& text, const std::function<int(char*)>& pass) {
    return [text, pass, copy = std::vector<char>(text.size() + 1)]() mutable {
        memcpy(copy.data(), text.c_str(), copy.size());
        benchmark::DoNotOptimize(copy.data());
        return pass(copy.data());
    };
}

// The numbers of so many pieces as decimal digits, each behind the one before.
int digits(int pieces, std::initializer_list<int32_t> numbers) {
    static char text[16384];
    char* end = text;
    for (int piece = 0; piece < pieces; ++piece) {
        for (const int32_t number : numbers) end = std::to_chars(end, std::end(text), number).ptr;
    }
    benchmark::DoNotOptimize(text);
    return static_cast<int>(end - text);
}

// So many structures copied in and out, each on its own.
int copies(int pieces) {
    static std::array<int32_t, 6> structure;  // as long as in a parcel
    static std::vector<std::array<int32_t, 6>> parcel(kPacketsMax);
    for (int piece = 0; piece < pieces; ++piece) {
        benchmark::DoNotOptimize(parcel[piece] = structure);
        benchmark::DoNotOptimize(structure = parcel[piece]);
    }
    return pieces;
}

int packetString() {
    PacketText text(kPacketsMax);
    for (size_t i = 0; i < kPacketsMax; ++i) {
        for (const int32_t value : {7, 10000, 2050, 0}) text.append(value);
    }
    const std::string_view whole = text.finish();
    benchmark::DoNotOptimize(whole.data());
    return static_cast<int>(whole.size());
}

int queueString() {
    TextBuffer<8192> text;
    for (int i = 0; i < kEntriesMax; ++i) text.append("%d.%d,", 5, 100);
    benchmark::DoNotOptimize(text.get().data());
    return static_cast<int>(text.get().size());
}

int packetParcel() {
    static const std::vector<ZelHapticEnginePacket> packets(
            kPacketsMax, {.time = 7, .intensity = 10000, .frequency = 2050});
    std::vector<ZelHapticEnginePacket> read;
    const ndk::ScopedAParcel parcel(AParcel_create());
    ndk::AParcel_writeVector(parcel.get(), packets);
    AParcel_setDataPosition(parcel.get(), 0);
    ndk::AParcel_readVector(parcel.get(), &read);
    benchmark::DoNotOptimize(read.data());
    return AParcel_getDataSize(parcel.get());
}

std::vector<Comparison> comparisons() {
    std::vector<Comparison> all;
    for (const Text& text : texts()) {
        const auto compile = [](char* copy) {
            alignas(int16_t) static uint8_t bytes[WT_TYPE10_COMP_BUFFER_SIZE];
            return HwApi::wt_type10_comp_str_to_bin(copy, bytes);
        };
        all.push_back({text.name, "tokens", "scan", countTokens(text.text.c_str()),
                       onCopies(text.text, compile), onCopies(text.text, countTokens)});
    }
    all.push_back({"packet string", "packets", "digits", kPacketsMax, packetString, [] {
                       return digits(kPacketsMax, {7, 10000, 2050, 0});
                   }});
    all.push_back({"queue string", "entries", "digits", kEntriesMax, queueString, [] {
                       return digits(kEntriesMax, {5, 100});
                   }});
    all.push_back({"packet parcel", "packets", "copies", kPacketsMax, packetParcel,
                   [] { return copies(kPacketsMax); }});
    return all;
}

// Keeps each benchmark's best time for a piece: whatever else the machine does only ever adds to
// it.
class BestReporter : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context& /*context*/) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            const auto counter = run.counters.find("per_piece");
            if (run.run_type != Run::RT_Iteration || counter == run.counters.end()) continue;
            const double nanoseconds = counter->second.value * 1e9;
            const auto [best, isNew] = mBest.emplace(run.run_name.function_name, nanoseconds);
            if (!isNew) best->second = std::min(best->second, nanoseconds);
        }
    }

    double best(const std::string& name) const {
        const auto found = mBest.find(name);
        return found == mBest.end() ? 0 : found->second;
    }

  private:
    std::map<std::string, double> mBest;
};

void add(const std::string& name, int pieces, const std::function<int()>& work) {
    benchmark::RegisterBenchmark(
            name.c_str(), [pieces, work](benchmark::State& state) { measure(state, pieces, work); })
            ->MinTime(0.05)
            ->Repetitions(kRepetitions);
}

}  // namespace

int main(int argc, char** argv) {
    const std::vector<Comparison> all = comparisons();
    for (const Comparison& comparison : all) {
        add(comparison.name, comparison.count, comparison.work);
        add("bare " + comparison.name, comparison.count, comparison.bare);
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;

    BestReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    for (const auto& [name, pieces, baseline, count, work, bare] : all) {
        const double whole = reporter.best(name);
        const double least = reporter.best("bare " + name);
        if (whole == 0 || least == 0) continue;  // filtered out
        fmt::print("{:<18} {:>4} {:<7}: {:6.1f} ns each, bare {} {:5.1f} ns: {:.1f} times\n", name,
                   count, pieces, whole, baseline, least, whole / least);
    }
    return 0;
}
