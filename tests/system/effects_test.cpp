// SPDX-License-Identifier: Apache-2.0
//
// Predefined effects through real binder: what each phone's driver sees of each effect at each
// strength, how long it is said to last, what is refused, and the times of a double click.
#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <ostream>
#include <string_view>
#include <thread>
#include <utility>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/journal_words.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using std::chrono::milliseconds;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::ValuesIn;

constexpr int kUnsupportedOperation = -7;

// What the driver saw that drives its motor, in words: "LEAF DATA" of a write, and of a
// force-feedback motor uploads, erasures and events (journal_words.h).
std::vector<std::string> driverRequests(const Phone& phone) {
    constexpr std::string_view kWrite = "write ";
    std::vector<std::string> requests;
    for (const json& line : phone.journal()) {
        std::string words = inWords(line);
        if (words.starts_with(kWrite)) {
            requests.push_back(words.substr(kWrite.size()));
        } else if (line.value("node", "") == "motor" && line.value("op", "") != "open") {
            requests.push_back(std::move(words));
        }
    }
    return requests;
}

// The requests after the first `seen`, once there are `count` of them: some of a double click's
// come after its answer.
std::vector<std::string> awaitRequests(const Phone& phone, size_t seen, size_t count) {
    const auto end = std::chrono::steady_clock::now() + milliseconds(5000);
    std::vector<std::string> requests = driverRequests(phone);
    while (requests.size() < seen + count && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(milliseconds(20));
        requests = driverRequests(phone);
    }
    requests.erase(requests.begin(),
                   requests.begin() + static_cast<ptrdiff_t>(std::min(seen, requests.size())));
    return requests;
}

struct Played {
    const char* effect;
    const char* strength;
    int durationMs;
    std::vector<std::string> requests;
};

struct EffectsOfPhone {
    const char* profile;
    const char* testName;
    std::vector<Played> effects;
};

void PrintTo(const EffectsOfPhone& phone, std::ostream* out) {
    *out << phone.profile;
}

// clang-format off
const EffectsOfPhone kPhones[] = {
    {"legacy-prebaked-index", "LegacyPrebakedIndex", {
        {"CLICK",        "LIGHT",   60, {"intensity 3400\n",  "cp_trigger_index 10\n", "enable 1000\n"}},
        {"CLICK",        "MEDIUM",  60, {"intensity 6700\n",  "cp_trigger_index 10\n", "enable 1000\n"}},
        {"CLICK",        "STRONG",  60, {"intensity 10000\n", "cp_trigger_index 10\n", "enable 1000\n"}},
        {"DOUBLE_CLICK", "LIGHT",  110, {"intensity 3400\n",  "cp_trigger_index 14\n", "enable 1000\n"}},
        {"DOUBLE_CLICK", "MEDIUM", 110, {"intensity 6700\n",  "cp_trigger_index 14\n", "enable 1000\n"}},
        {"DOUBLE_CLICK", "STRONG", 110, {"intensity 10000\n", "cp_trigger_index 14\n", "enable 1000\n"}},
        {"TICK",         "LIGHT",   60, {"intensity 3400\n",  "cp_trigger_index 50\n", "enable 1000\n"}},
        {"TICK",         "MEDIUM",  60, {"intensity 6700\n",  "cp_trigger_index 50\n", "enable 1000\n"}},
        {"TICK",         "STRONG",  60, {"intensity 10000\n", "cp_trigger_index 50\n", "enable 1000\n"}},
        {"HEAVY_CLICK",  "LIGHT",  110, {"intensity 3400\n",  "cp_trigger_index 23\n", "enable 1000\n"}},
        {"HEAVY_CLICK",  "MEDIUM", 110, {"intensity 6700\n",  "cp_trigger_index 23\n", "enable 1000\n"}},
        {"HEAVY_CLICK",  "STRONG", 110, {"intensity 10000\n", "cp_trigger_index 23\n", "enable 1000\n"}}}},
    {"legacy-haptic-engine", "LegacyHapticEngine", {
        {"CLICK",        "LIGHT",   17, {"intensity 3400\n",  "enable 7\n"}},
        {"CLICK",        "MEDIUM",  17, {"intensity 6700\n",  "enable 7\n"}},
        {"CLICK",        "STRONG",  17, {"intensity 10000\n", "enable 7\n"}},
        {"DOUBLE_CLICK", "LIGHT",   95, {"intensity 3400\n",  "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"DOUBLE_CLICK", "MEDIUM",  95, {"intensity 6700\n",  "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"DOUBLE_CLICK", "STRONG",  95, {"intensity 10000\n", "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"TICK",         "LIGHT",   17, {"haptic_engine 4 7 1156 2050 0\n",  "enable 1\n"}},
        {"TICK",         "MEDIUM",  17, {"haptic_engine 4 7 4489 2050 0\n",  "enable 1\n"}},
        {"TICK",         "STRONG",  17, {"haptic_engine 4 7 10000 2050 0\n", "enable 1\n"}},
        {"HEAVY_CLICK",  "LIGHT",   17, {"haptic_engine 4 7 1156 2000 1\n",  "enable 1\n"}},
        {"HEAVY_CLICK",  "MEDIUM",  17, {"haptic_engine 4 7 4489 2000 1\n",  "enable 1\n"}},
        {"HEAVY_CLICK",  "STRONG",  17, {"haptic_engine 4 7 10000 2000 1\n", "enable 1\n"}}}},
    {"legacy-amplitude", "LegacyAmplitude", {
        {"CLICK",        "LIGHT",   17, {"intensity 3400\n",  "enable 7\n"}},
        {"CLICK",        "MEDIUM",  17, {"intensity 6700\n",  "enable 7\n"}},
        {"CLICK",        "STRONG",  17, {"intensity 10000\n", "enable 7\n"}},
        {"DOUBLE_CLICK", "LIGHT",   95, {"intensity 3400\n",  "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"DOUBLE_CLICK", "MEDIUM",  95, {"intensity 6700\n",  "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"DOUBLE_CLICK", "STRONG",  95, {"intensity 10000\n", "enable 0\n", "enable 10\n", "enable 15\n"}},
        {"TICK",         "LIGHT",   17, {"intensity 3400\n",  "enable 7\n"}},
        {"TICK",         "MEDIUM",  17, {"intensity 6700\n",  "enable 7\n"}},
        {"TICK",         "STRONG",  17, {"intensity 10000\n", "enable 7\n"}},
        {"HEAVY_CLICK",  "LIGHT",   17, {"intensity 3400\n",  "enable 7\n"}},
        {"HEAVY_CLICK",  "MEDIUM",  17, {"intensity 6700\n",  "enable 7\n"}},
        {"HEAVY_CLICK",  "STRONG",  17, {"intensity 10000\n", "enable 7\n"}}}},
    {"leds-prebaked-index", "LedsPrebakedIndex", {
        {"CLICK",        "LIGHT",   60, {"intensity 3400\n",  "cp_trigger_index 10\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"CLICK",        "MEDIUM",  60, {"intensity 6700\n",  "cp_trigger_index 10\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"CLICK",        "STRONG",  60, {"intensity 10000\n", "cp_trigger_index 10\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "LIGHT",  110, {"intensity 3400\n",  "cp_trigger_index 14\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "MEDIUM", 110, {"intensity 6700\n",  "cp_trigger_index 14\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "STRONG", 110, {"intensity 10000\n", "cp_trigger_index 14\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"TICK",         "LIGHT",   60, {"intensity 3400\n",  "cp_trigger_index 50\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"TICK",         "MEDIUM",  60, {"intensity 6700\n",  "cp_trigger_index 50\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"TICK",         "STRONG",  60, {"intensity 10000\n", "cp_trigger_index 50\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "LIGHT",  110, {"intensity 3400\n",  "cp_trigger_index 23\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "MEDIUM", 110, {"intensity 6700\n",  "cp_trigger_index 23\n", "state 1\n", "duration 1000\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "STRONG", 110, {"intensity 10000\n", "cp_trigger_index 23\n", "state 1\n", "duration 1000\n", "activate 1\n"}}}},
    {"leds-haptic-engine", "LedsHapticEngine", {
        {"CLICK",        "LIGHT",   17, {"intensity 3400\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"CLICK",        "MEDIUM",  17, {"intensity 6700\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"CLICK",        "STRONG",  17, {"intensity 10000\n", "state 1\n", "duration 7\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "LIGHT",   95, {"intensity 3400\n",  "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "MEDIUM",  95, {"intensity 6700\n",  "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "STRONG",  95, {"intensity 10000\n", "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"TICK",         "LIGHT",   17, {"haptic_engine 4 7 1156 2050 0\n",  "state 1\n", "duration 1\n", "activate 1\n"}},
        {"TICK",         "MEDIUM",  17, {"haptic_engine 4 7 4489 2050 0\n",  "state 1\n", "duration 1\n", "activate 1\n"}},
        {"TICK",         "STRONG",  17, {"haptic_engine 4 7 10000 2050 0\n", "state 1\n", "duration 1\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "LIGHT",   17, {"haptic_engine 4 7 1156 2000 1\n",  "state 1\n", "duration 1\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "MEDIUM",  17, {"haptic_engine 4 7 4489 2000 1\n",  "state 1\n", "duration 1\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "STRONG",  17, {"haptic_engine 4 7 10000 2000 1\n", "state 1\n", "duration 1\n", "activate 1\n"}}}},
    {"leds-amplitude", "LedsAmplitude", {
        {"CLICK",        "LIGHT",   17, {"intensity 3400\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"CLICK",        "MEDIUM",  17, {"intensity 6700\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"CLICK",        "STRONG",  17, {"intensity 10000\n", "state 1\n", "duration 7\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "LIGHT",   95, {"intensity 3400\n",  "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "MEDIUM",  95, {"intensity 6700\n",  "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"DOUBLE_CLICK", "STRONG",  95, {"intensity 10000\n", "activate 0\n", "state 1\n", "duration 10\n", "activate 1\n", "state 1\n", "duration 15\n", "activate 1\n"}},
        {"TICK",         "LIGHT",   17, {"intensity 3400\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"TICK",         "MEDIUM",  17, {"intensity 6700\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"TICK",         "STRONG",  17, {"intensity 10000\n", "state 1\n", "duration 7\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "LIGHT",   17, {"intensity 3400\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "MEDIUM",  17, {"intensity 6700\n",  "state 1\n", "duration 7\n", "activate 1\n"}},
        {"HEAVY_CLICK",  "STRONG",  17, {"intensity 10000\n", "state 1\n", "duration 7\n", "activate 1\n"}}}},
    {"ff", "ForceFeedback", {
        {"CLICK",        "LIGHT",   60, {"event 96 3400",             "upload 0 00000a00", "event 0 1"}},
        {"CLICK",        "MEDIUM",  60, {"event 96 6700",  "erase 0", "upload 0 00000a00", "event 0 1"}},
        {"CLICK",        "STRONG",  60, {"event 96 10000", "erase 0", "upload 0 00000a00", "event 0 1"}},
        {"DOUBLE_CLICK", "LIGHT",  110, {"event 96 3400",  "erase 0", "upload 0 00000e00", "event 0 1"}},
        {"DOUBLE_CLICK", "MEDIUM", 110, {"event 96 6700",  "erase 0", "upload 0 00000e00", "event 0 1"}},
        {"DOUBLE_CLICK", "STRONG", 110, {"event 96 10000", "erase 0", "upload 0 00000e00", "event 0 1"}},
        {"TICK",         "LIGHT",   60, {"event 96 3400",  "erase 0", "upload 0 00003200", "event 0 1"}},
        {"TICK",         "MEDIUM",  60, {"event 96 6700",  "erase 0", "upload 0 00003200", "event 0 1"}},
        {"TICK",         "STRONG",  60, {"event 96 10000", "erase 0", "upload 0 00003200", "event 0 1"}},
        {"HEAVY_CLICK",  "LIGHT",  110, {"event 96 3400",  "erase 0", "upload 0 00001700", "event 0 1"}},
        {"HEAVY_CLICK",  "MEDIUM", 110, {"event 96 6700",  "erase 0", "upload 0 00001700", "event 0 1"}},
        {"HEAVY_CLICK",  "STRONG", 110, {"event 96 10000", "erase 0", "upload 0 00001700", "event 0 1"}}}},
};
// clang-format on

class PhoneWithEffects : public testing::TestWithParam<EffectsOfPhone> {};

TEST_P(PhoneWithEffects, PlaysFourAtEachStrengthAndRefusesTheRest) {
    const Phone phone(GetParam().profile);
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    const json four = json::array({0, 1, 2, 5});
    EXPECT_EQ(phone.call({"std", "getSupportedEffects"})["result"], four);
    EXPECT_EQ(phone.call({"std", "getSupportedAlwaysOnEffects"})["result"], four);

    phone.reset();
    size_t seen = 0;
    for (const Played& played : GetParam().effects) {
        const json answer = phone.call({"std", "perform", played.effect, played.strength});
        EXPECT_EQ(answer["exception"], 0) << played.effect << " " << played.strength;
        EXPECT_EQ(answer["result"], played.durationMs) << played.effect << " " << played.strength;
        EXPECT_THAT(awaitRequests(phone, seen, played.requests.size()),
                    ElementsAreArray(played.requests))
                << played.effect << " " << played.strength;
        seen += played.requests.size();
    }

    const std::vector<std::vector<std::string>> refused = {
            {"std", "perform", "THUD", "STRONG"},
            {"std", "perform", "POP", "STRONG"},
            {"std", "perform", "99", "STRONG"},
            {"std", "perform", "CLICK", "3"},
            {"std", "perform", "CLICK", "-1"},
            {"std", "perform", "CLICK", "STRONG", "--callback"},
            {"std", "alwaysOnEnable", "1", "CLICK", "STRONG"},
    };
    for (const auto& call : refused) {
        const json answer = phone.call(call);
        EXPECT_EQ(answer["exception"], kUnsupportedOperation) << call[2] << " " << call[3];
        EXPECT_TRUE(answer["result"].is_null()) << call[2] << " " << call[3];
    }
    EXPECT_EQ(driverRequests(phone).size(), seen);
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: Unsupport vibrator perform effect\n"));
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: Unsupport vibrator perform strength\n"));
    EXPECT_THAT(phone.log(), HasSubstr("] Not support perform() callback\n"));
}

INSTANTIATE_TEST_SUITE_P(Effects, PhoneWithEffects, ValuesIn(kPhones),
                         [](const auto& row) { return row.param.testName; });

class PhoneWithoutEffects : public testing::TestWithParam<const char*> {};

TEST_P(PhoneWithoutEffects, SupportsNoneAndRefusesAllWithoutTouchingTheDriver) {
    const Phone phone(GetParam());
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    EXPECT_EQ(phone.call({"std", "getSupportedEffects"})["result"], json::array());
    EXPECT_EQ(phone.call({"std", "getSupportedAlwaysOnEffects"})["result"], json::array());
    phone.reset();
    for (const char* effect : {"CLICK", "DOUBLE_CLICK", "TICK", "HEAVY_CLICK", "THUD"}) {
        const json answer = phone.call({"std", "perform", effect, "STRONG"});
        EXPECT_EQ(answer["exception"], kUnsupportedOperation) << effect;
    }
    EXPECT_THAT(driverRequests(phone), IsEmpty());
    EXPECT_THAT(phone.log(), HasSubstr("V_2_0: performEffect PERFORM_NONE\n"));
}

INSTANTIATE_TEST_SUITE_P(Effects, PhoneWithoutEffects,
                         testing::Values("legacy-none", "leds-none", "none"), [](const auto& row) {
                             std::string name = row.param;
                             for (char& c : name) c = c == '-' ? '_' : c;
                             return name;
                         });

TEST(EffectOnAFailingDriver, IsAnIllegalState) {
    const Phone phone("leds-amplitude");
    phone.reset();
    phone.fault({{"node", "/sys/class/leds/vibrator/intensity"},
                 {"op", "write"},
                 {"errno", "EIO"},
                 {"times", 1}});
    const json answer = phone.call({"std", "perform", "CLICK", "STRONG"});
    EXPECT_EQ(answer["exception"], kIllegalState);
    EXPECT_TRUE(answer["result"].is_null());
    EXPECT_EQ(phone.call({"std", "perform", "CLICK", "STRONG"})["exception"], 0);
}

// When a write of the journal was made, on the guest's monotonic clock.
struct TimedWrite {
    std::string text;
    int64_t us;
};

std::vector<TimedWrite> timedWrites(const Phone& phone) {
    std::vector<TimedWrite> writes;
    for (const json& entry : phone.journal()) {
        if (entry.value("op", "") != "write") continue;
        const std::string node = entry.value("node", "");
        writes.push_back({node.substr(node.rfind('/') + 1) + " " + entry.value("data", ""),
                          entry.value("us", int64_t{0})});
    }
    return writes;
}

// The sleep is 70 ms at least; how much more depends on the emulated machine.
constexpr int64_t kPauseUs = 70'000;
constexpr int64_t kGenerousUs = 1'000'000;

TEST(DoubleClickTiming, IsOffThenTenMillisecondsThenFifteenAfterAPause) {
    const Phone phone("legacy-amplitude");
    phone.reset();
    EXPECT_EQ(phone.call({"std", "perform", "DOUBLE_CLICK", "STRONG"})["result"], 95);
    awaitRequests(phone, 0, 4);
    const std::vector<TimedWrite> writes = timedWrites(phone);
    ASSERT_EQ(writes.size(), 4U);
    EXPECT_EQ(writes[0].text, "intensity 10000\n");
    EXPECT_EQ(writes[1].text, "enable 0\n");
    EXPECT_EQ(writes[2].text, "enable 10\n");
    EXPECT_EQ(writes[3].text, "enable 15\n");
    // The first pulse follows the stop at once, the second one the pause.
    EXPECT_LT(writes[2].us - writes[1].us, kGenerousUs);
    EXPECT_GE(writes[3].us - writes[2].us, kPauseUs);
    EXPECT_LT(writes[3].us - writes[2].us, kPauseUs + kGenerousUs);
}

// How much earlier than the second pulse's first write the answer to a double click came, at
// least; negative when that cannot be told.
int64_t answerLeadUs(const Phone& phone) {
    phone.reset();
    const json answer = phone.call({"std", "perform", "DOUBLE_CLICK", "STRONG"});
    awaitRequests(phone, 0, 8);
    const std::vector<TimedWrite> writes = timedWrites(phone);
    if (writes.size() != 8 || writes[0].text != "intensity 10000\n" ||
        writes[5].text != "state 1\n" || writes[6].text != "duration 15\n") {
        ADD_FAILURE() << "not a double click";
        return -1;
    }
    // The call had begun when the amplitude was written, so its answer came no later after that
    // than the whole call took.
    return (writes[5].us - writes[0].us) - answer.value("us", INT64_MAX);
}

TEST(DoubleClickTiming, AnswerComesBeforeTheSecondPulse) {
    const Phone phone("leds-haptic-engine");
    phone.call({"std", "getCapabilities"});
    // A busy machine may delay an answer past the pause; one that waits for the pulse always is.
    int64_t leadUs = -1;
    for (int attempt = 0; attempt < 5 && leadUs <= 0; ++attempt) leadUs = answerLeadUs(phone);
    EXPECT_GT(leadUs, 0);
}

}  // namespace
}  // namespace qvx::test
