// SPDX-License-Identifier: Apache-2.0
//
// Step patterns as calls: see plan.h.
#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/play/plan.h"

namespace vibctl {

namespace {

constexpr int64_t kLongestStepMs = 600000;

Problem parseAmplitudes(const Pattern& pattern, std::vector<float>& amplitudes) {
    if (pattern.amplitudes.empty()) return std::nullopt;
    for (const std::string& word : android::base::Split(pattern.amplitudes, ",")) {
        float& amplitude = amplitudes.emplace_back();
        const Problem problem = Argument<float>::parse("amplitude", word, amplitude);
        if (problem || !(amplitude >= 0 && amplitude <= 1)) {
            return fmt::format("--amplitudes {} is not a number from 0 to 1", inQuotes(word));
        }
    }
    if (amplitudes.size() == pattern.durations.size()) return std::nullopt;
    return fmt::format("--amplitudes has {} numbers for {} steps", amplitudes.size(),
                       pattern.durations.size());
}

}  // namespace

Problem planPattern(const Pattern& pattern, const Offers& offers, Plan& plan) {
    std::vector<int64_t> durations;
    for (const std::string& word : pattern.durations) {
        Problem problem = parseInteger("step", word, 0, kLongestStepMs, durations.emplace_back());
        if (problem) return problem;
    }
    std::vector<float> amplitudes;
    if (Problem problem = parseAmplitudes(pattern, amplitudes)) return problem;

    std::chrono::milliseconds at{};
    for (int round = 0; round < pattern.repeat; ++round) {
        for (size_t i = 0; i < durations.size(); ++i) {
            const float amplitude = amplitudes.empty() ? static_cast<float>(i % 2) : amplitudes[i];
            if (amplitude > 0 && durations[i] > 0) {
                if (!amplitudes.empty() && offers.amplitude) {
                    plan.calls.push_back(
                            {at, "std", {"setAmplitude", fmt::format("{}", amplitude)}});
                }
                plan.calls.push_back({at, "std", {"on", std::to_string(durations[i])}});
            }
            at += std::chrono::milliseconds(durations[i]);
        }
    }
    if (!amplitudes.empty() && !offers.amplitude) {
        plan.notes.emplace_back("amplitudes are lost: the phone has no amplitude control");
    }
    return std::nullopt;
}

}  // namespace vibctl
