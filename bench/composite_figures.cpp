// SPDX-License-Identifier: Apache-2.0
//
// What compiling a composite waveform costs for each token of its text, beside a bare scan: a pass
// over the same bytes that finds where the tokens begin and does nothing with them. Both start from
// a fresh copy of the text, because the compiler cuts it up.
//
// The texts are those the service sends: the loop of one wavetable entry, the longest composition
// that a client may ask for, and a text that fills the driver's buffer.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>
#include <fmt/format.h>

#include "HwApi.h"

namespace {

using aidl::android::hardware::vibrator::HwApi;
using aidl::android::hardware::vibrator::WT_TYPE10_COMP_BUFFER_SIZE;

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

// Runs `pass` on fresh copies of the text and reports the nanoseconds for each of its tokens.
template <typename Pass>
void measure(benchmark::State& state, const std::string& text, Pass pass) {
    std::vector<char> copy(text.size() + 1);
    for ([[maybe_unused]] auto _ : state) {
        memcpy(copy.data(), text.c_str(), copy.size());
        benchmark::DoNotOptimize(copy.data());
        benchmark::ClobberMemory();
        benchmark::DoNotOptimize(pass(copy.data()));
    }
    const double tokens = countTokens(text.c_str()) * static_cast<double>(state.iterations());
    state.counters["per_token"] =
            benchmark::Counter(tokens, benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}

// Keeps each benchmark's best time for a token: whatever else the machine does only ever adds to
// it.
class BestReporter : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(const Context& /*context*/) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            const auto counter = run.counters.find("per_token");
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

}  // namespace

int main(int argc, char** argv) {
    for (const Text& text : texts()) {
        benchmark::RegisterBenchmark((std::string("compile ") + text.name).c_str(),
                                     [&text](benchmark::State& state) {
                                         alignas(int16_t)
                                                 uint8_t bytes[WT_TYPE10_COMP_BUFFER_SIZE] = {};
                                         measure(state, text.text, [&bytes](char* copy) {
                                             return HwApi::wt_type10_comp_str_to_bin(copy, bytes);
                                         });
                                     })
                ->MinTime(0.05)
                ->Repetitions(kRepetitions);
        benchmark::RegisterBenchmark(
                (std::string("scan ") + text.name).c_str(),
                [&text](benchmark::State& state) { measure(state, text.text, countTokens); })
                ->MinTime(0.05)
                ->Repetitions(kRepetitions);
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;

    BestReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    for (const Text& text : texts()) {
        const double compile = reporter.best(std::string("compile ") + text.name);
        const double scan = reporter.best(std::string("scan ") + text.name);
        if (compile == 0 || scan == 0) continue;  // filtered out
        fmt::print("{:<18} {:>4} tokens: {:5.1f} ns a token, bare scan {:5.1f} ns: {:.1f} times\n",
                   text.name, countTokens(text.text.c_str()), compile, scan, compile / scan);
    }
    return 0;
}
