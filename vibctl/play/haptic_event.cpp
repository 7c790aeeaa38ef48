// SPDX-License-Identifier: Apache-2.0
//
// From events to calls: see haptic_event.h.
#include "vibctl/play/haptic_event.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdint>

#include <fmt/format.h>

namespace vibctl {

namespace {

// A stretch of time with one intensity; no two of them overlap.
struct Stretch {
    int64_t start = 0;  // in milliseconds, as is the end
    int64_t end = 0;
    int intensity = 0;  // 1 to 10000
    int frequency = 0;  // in tenths of a hertz
};

// A curve is followed in steps of this many milliseconds.
constexpr int64_t kCurveStepMs = 20;

int64_t toMs(double seconds) {
    return std::llround(seconds * 1000);
}

double levelAt(const std::vector<CurvePoint>& points, double time) {
    double level = 1;
    for (size_t i = 0; i < points.size() && points[i].time <= time; ++i) {
        level = points[i].level;
        if (i + 1 == points.size() || points[i + 1].time <= time || points[i + 1].jumps) continue;
        const CurvePoint& next = points[i + 1];
        const double part = (time - points[i].time) / (next.time - points[i].time);
        level += part * (next.level - points[i].level);
    }
    return std::clamp(level, 0.0, 1.0);
}

class Planner {
  public:
    Planner(const HapticDesign& design, const Offers& offers, Plan& plan)
        : mDesign(design), mOffers(offers), mPlan(plan), mCurve(design.curve) {
        std::stable_sort(mCurve.begin(), mCurve.end(),
                         [](const auto& a, const auto& b) { return a.time < b.time; });
    }

    void run() {
        const bool allTransient =
                std::all_of(mDesign.events.begin(), mDesign.events.end(),
                            [](const HapticEvent& event) { return event.isTransient; });
        if (mOffers.packets) {
            makeStretches("packets");
            addPackets();
        } else if (mOffers.compositions && allTransient) {
            addCompositions();
        } else {
            makeStretches(mOffers.amplitude ? "steps of amplitude"
                                            : "on and off: its intensity is lost");
            addSteps();
        }
    }

  private:
    void add(int64_t atMs, const char* iface, std::vector<std::string> words) {
        mPlan.calls.push_back({std::chrono::milliseconds(atMs), iface, std::move(words)});
    }

    void explain(const HapticEvent& event, const std::string& what) {
        mPlan.notes.push_back(
                fmt::format("line {}: {} at {} ms, intensity {}, sharpness {}: {}", event.line,
                            event.isTransient ? "transient" : "continuous", toMs(event.time),
                            event.intensity, event.sharpness, what));
    }

    int intensityAt(const HapticEvent& event, int64_t ms) const {
        const double level = levelAt(mCurve, static_cast<double>(ms) / 1000);
        return static_cast<int>(std::lround(event.intensity * level * 10000));
    }

    // Of events that overlap, the later one goes on alone.
    void makeStretches(const char* what) {
        for (size_t i = 0; i < mDesign.events.size(); ++i) {
            const HapticEvent& event = mDesign.events[i];
            const int64_t start = toMs(event.time);
            int64_t end = start + toMs(event.duration);
            const bool isCut =
                    i + 1 < mDesign.events.size() && toMs(mDesign.events[i + 1].time) < end;
            if (isCut) end = toMs(mDesign.events[i + 1].time);
            explain(event, isCut ? fmt::format("{}, cut off at {} ms by the next event", what, end)
                                 : what);
            const int64_t step = mCurve.empty() ? std::max<int64_t>(end - start, 1) : kCurveStepMs;
            for (int64_t at = start; at < end; at += step) {
                addStretch({at, std::min(at + step, end), intensityAt(event, at),
                            static_cast<int>(std::lround(1500 + 1000 * event.sharpness))});
            }
        }
    }

    void addStretch(const Stretch& stretch) {
        if (stretch.intensity == 0) return;
        const bool goesOn = !mStretches.empty() && mStretches.back().end == stretch.start &&
                            mStretches.back().intensity == stretch.intensity &&
                            mStretches.back().frequency == stretch.frequency;
        if (goesOn) {
            mStretches.back().end = stretch.end;
        } else {
            mStretches.push_back(stretch);
        }
    }

    // Time, intensity, frequency and overdrive; a gap is a packet without intensity.
    void addPackets() {
        constexpr size_t kMost = 300;
        std::vector<std::string> words;
        int64_t callAt = 0;
        int64_t end = 0;
        const auto flush = [&] {
            if (!words.empty()) add(callAt, "ext", std::move(words));
            words.clear();
        };
        for (const Stretch& one : mStretches) {
            if (words.size() >= kMost) flush();
            if (words.empty()) {
                words = {"performHapticEngine", "10000"};
                callAt = one.start;
            } else if (one.start > end) {
                words.push_back(fmt::format("{},0,{},0", one.start - end, one.frequency));
            }
            words.push_back(
                    fmt::format("{},{},{},0", one.end - one.start, one.intensity, one.frequency));
            end = one.end;
        }
        flush();
    }

    // Ten primitives each, a second of pause at most before each.
    void addCompositions() {
        constexpr size_t kMost = 11;
        constexpr int64_t kLongestPauseMs = 1000;
        std::vector<std::string> words;
        int64_t callAt = 0;
        int64_t end = 0;
        const auto flush = [&] {
            if (!words.empty()) add(callAt, "std", std::move(words));
            words.clear();
        };
        for (const HapticEvent& event : mDesign.events) {
            const int64_t start = toMs(event.time);
            const int intensity = intensityAt(event, start);
            const char* const primitive = event.sharpness < 0.5 ? "LOW_TICK" : "CLICK";
            const int64_t late = words.empty() ? 0 : std::max<int64_t>(end - start, 0);
            explain(event, late > 0 ? fmt::format("{}, {} ms late", primitive, late) : primitive);
            if (words.size() >= kMost || start - end > kLongestPauseMs) flush();
            int64_t pause = 0;
            if (words.empty()) {
                words = {"compose"};
                callAt = start;
                end = start;
            } else {
                pause = std::max<int64_t>(start - end, 0);
            }
            words.push_back(fmt::format("{},{},{}", pause, primitive, intensity / 10000.0));
            end += pause + toMs(event.duration);
        }
        flush();
    }

    // What goes on without a gap is one vibration whose amplitude changes.
    void addSteps() {
        for (size_t i = 0; i < mStretches.size(); ++i) {
            const Stretch& one = mStretches[i];
            if (mOffers.amplitude) {
                add(one.start, "std", {"setAmplitude", fmt::format("{}", one.intensity / 10000.0)});
            }
            if (i > 0 && mStretches[i - 1].end == one.start) continue;
            size_t last = i;
            while (last + 1 < mStretches.size() &&
                   mStretches[last + 1].start == mStretches[last].end) {
                ++last;
            }
            add(one.start, "std", {"on", std::to_string(mStretches[last].end - one.start)});
        }
    }

    const HapticDesign& mDesign;
    const Offers& mOffers;
    Plan& mPlan;
    std::vector<CurvePoint> mCurve;
    std::vector<Stretch> mStretches;
};

}  // namespace

void planDesign(const HapticDesign& design, const Offers& offers, Plan& plan) {
    Planner(design, offers, plan).run();
}

}  // namespace vibctl
