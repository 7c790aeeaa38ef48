// SPDX-License-Identifier: Apache-2.0
//
// AHAP documents: see plan.h.
#include <algorithm>
#include <cmath>

#include <fmt/format.h>

#include "vibctl/play/haptic_event.h"
#include "vibctl/play/json_fields.h"
#include "vibctl/play/plan.h"

namespace vibctl {

namespace {

constexpr double kLongestSeconds = 60;

// Reads the members of "Pattern"; the first thing that is wrong goes to `problem`.
class AhapReader {
  public:
    AhapReader(const std::string& text, Plan& plan, Problem& problem)
        : mText(text), mPlan(plan), mProblem(problem) {}

    HapticDesign read(const Json::Value& root) {
        JsonFields document = fieldsOf(root);
        document.expectKeys({"Version", "Metadata", "Pattern"});
        for (const Json::Value& member : document.list("Pattern")) {
            JsonFields fields = fieldsOf(member);
            fields.expectKeys({"Event", "Parameter", "ParameterCurve"});
            if (mProblem) break;
            if (member.isMember("Event")) readEvent(member["Event"]);
            if (member.isMember("Parameter")) readParameter(member["Parameter"]);
            if (member.isMember("ParameterCurve")) readCurve(member["ParameterCurve"]);
        }
        if (!mProblem && mDesign.events.empty())
            mProblem = "Pattern: at least one event is accepted";
        std::stable_sort(mDesign.events.begin(), mDesign.events.end(),
                         [](const auto& a, const auto& b) { return a.time < b.time; });
        return std::move(mDesign);
    }

  private:
    JsonFields fieldsOf(const Json::Value& object) { return {object, mText, 1, mProblem}; }

    void readEvent(const Json::Value& value) {
        JsonFields fields = fieldsOf(value);
        fields.expectKeys(
                {"Time", "EventType", "EventDuration", "EventParameters", "EventWaveformPath"});
        HapticEvent event;
        event.line = fields.lineOf(value);
        event.time = fields.number("Time", 0, kLongestSeconds, 0);
        const std::string type = fields.string("EventType", "");
        event.isTransient = type == "HapticTransient";
        event.duration = event.isTransient ? kTransientSeconds
                                           : fields.number("EventDuration", 0, kLongestSeconds, 0);
        for (const Json::Value& one : fields.list("EventParameters"))
            readEventParameter(one, event);
        if (type.starts_with("Audio")) {
            mPlan.notes.push_back(
                    fmt::format("line {}: {} is lost: no sound here", event.line, type));
        } else if (event.isTransient || type == "HapticContinuous") {
            mDesign.events.push_back(event);
        } else {
            fields.complain(value,
                            "EventType: HapticTransient, HapticContinuous, AudioCustom and "
                            "AudioContinuous are accepted");
        }
    }

    void readEventParameter(const Json::Value& value, HapticEvent& event) {
        JsonFields fields = fieldsOf(value);
        fields.expectKeys({"ParameterID", "ParameterValue"});
        const std::string id = fields.string("ParameterID", "");
        if (id == "HapticIntensity") {
            event.intensity = fields.number("ParameterValue", 0, 1, 1);
        } else if (id == "HapticSharpness") {
            event.sharpness = fields.number("ParameterValue", 0, 1, 0.5);
        } else {
            mPlan.notes.push_back(fmt::format("line {}: {} is lost", fields.lineOf(value), id));
        }
    }

    void readParameter(const Json::Value& value) {
        JsonFields fields = fieldsOf(value);
        fields.expectKeys({"ParameterID", "ParameterValue", "Time"});
        const double time = fields.number("Time", 0, kLongestSeconds, 0);
        const double level = fields.number("ParameterValue", -1, 1, 1);
        if (isIntensity(fields, value)) mDesign.curve.push_back({time, level, true});
    }

    void readCurve(const Json::Value& value) {
        JsonFields fields = fieldsOf(value);
        fields.expectKeys({"ParameterID", "Time", "ParameterCurveControlPoints"});
        const double start = fields.number("Time", 0, kLongestSeconds, 0);
        if (!isIntensity(fields, value)) return;
        bool isFirst = true;
        for (const Json::Value& one : fields.list("ParameterCurveControlPoints")) {
            JsonFields point = fieldsOf(one);
            point.expectKeys({"Time", "ParameterValue"});
            const double time = start + point.number("Time", 0, kLongestSeconds, 0);
            mDesign.curve.push_back({time, point.number("ParameterValue", 0, 1, 1), isFirst});
            isFirst = false;
        }
    }

    bool isIntensity(JsonFields& fields, const Json::Value& value) {
        const std::string id = fields.string("ParameterID", "");
        if (id == "HapticIntensityControl") return true;
        mPlan.notes.push_back(fmt::format("line {}: {} is lost", fields.lineOf(value), id));
        return false;
    }

    const std::string& mText;
    Plan& mPlan;
    Problem& mProblem;
    HapticDesign mDesign;
};

}  // namespace

Problem planAhap(const std::string& text, const Offers& offers, Plan& plan) {
    Json::Value root;
    Problem problem = parseJson(text, 1, root);
    if (problem) return problem;
    const HapticDesign design = AhapReader(text, plan, problem).read(root);
    if (problem) return problem;
    planDesign(design, offers, plan);
    return std::nullopt;
}

bool isAhap(const std::string& text) {
    Json::Value root;
    return !parseJson(text, 1, root) && root.isObject() && root.isMember("Pattern");
}

}  // namespace vibctl
