// SPDX-License-Identifier: Apache-2.0
//
// What each method of the vendor's interface makes the driver see, phone by phone: the journal, word
// for word, of one call after another.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/system/extension_calls.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

struct Call {
    const char* words;
    int exception;
    std::vector<std::string> journal;
};

void expectJournals(const Phone& phone, const std::vector<Call>& calls) {
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    size_t seen = journalInWords(phone).size();
    for (const Call& call : calls) {
        EXPECT_EQ(phone.call(extensionCall(call.words))["exception"], call.exception) << call.words;
        EXPECT_EQ(journalInWords(phone, seen), call.journal) << call.words;
        seen += call.journal.size();
    }
}

// A text with the zero byte that ends it.
std::string queued(const std::string& text) {
    return "write cp_trigger_queue " + text + '\0';
}

TEST(ExtensionJournal, OfTheLedClass) {
    const Phone phone("leds");
    expectJournals(
            phone,
            {
                    {"setAmplitude 5000", 0, {"open intensity O_RDWR", "write intensity 5000\n"}},
                    {"setForceTouchAmplitude 1",
                     0,
                     {"open force_touch_intensity O_RDWR", "write force_touch_intensity 1\n"}},
                    {"setFrequencyType 4", 0, {"open multi_freq O_RDWR", "write multi_freq 4\n"}},
                    {"setFolderStatus 0",
                     0,
                     {"open event_cmd O_RDWR", "write event_cmd FOLDER_OPEN\n"}},
                    {"setFolderStatus 1",
                     0,
                     {"open event_cmd O_RDWR", "write event_cmd FOLDER_CLOSE\n"}},
                    {"setFolderTentModeStatus 0",
                     0,
                     {"open event_cmd O_RDWR", "write event_cmd FOLDER_TENT_OPEN\n"}},
                    {"setFolderTentModeStatus 1",
                     0,
                     {"open event_cmd O_RDWR", "write event_cmd FOLDER_TENT_CLOSE\n"}},
                    {"performHapticEngine 5000 7,10000,2050,0 1,2000,3,-4",
                     0,
                     {"open haptic_engine O_RDWR",
                      "write haptic_engine 8 7 5000 2050 0 1 1000 3 -4\n", "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1\n",
                      "open activate O_RDWR", "write activate 1\n"}},
                    {"performHapticEngine 1",
                     0,
                     {"open haptic_engine O_RDWR", "write haptic_engine 0\n", "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1\n",
                      "open activate O_RDWR", "write activate 1\n"}},
                    {"performPrebakedHapticPattern 23 6700 false",
                     0,
                     {"open intensity O_RDWR", "write intensity 6700\n",
                      "open cp_trigger_index O_RDWR", "write cp_trigger_index 23\n",
                      "open state O_RDWR", "write state 1\n", "open duration O_RDWR",
                      "write duration 1000\n", "open activate O_RDWR", "write activate 1\n"}},
                    {"performPrebakedHapticPattern 0 5000 false",
                     0,
                     {"open intensity O_RDWR", "write intensity 5000\n",
                      "open cp_trigger_index O_RDWR", "write cp_trigger_index 0\n"}},
                    {"performPrebakedHapticPattern 7 10000 true",
                     0,
                     {"open cp_trigger_index O_RDWR", "write cp_trigger_index 65534\n",
                      "open cp_trigger_queue O_RDWR", queued("7.100, 10, 0~"), "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1000\n",
                      "open activate O_RDWR", "write activate 1\n"}},
                    {"perform HEAVY_CLICK 4321",
                     0,
                     {"open intensity O_RDWR", "write intensity 4321\n",
                      "open cp_trigger_index O_RDWR", "write cp_trigger_index 23\n",
                      "open state O_RDWR", "write state 1\n", "open duration O_RDWR",
                      "write duration 1000\n", "open activate O_RDWR", "write activate 1\n"}},
                    {"performPlaybackEngine false -5 5,100,0 7,80,3",
                     0,
                     {"open cp_trigger_index O_RDWR", "write cp_trigger_index 65534\n",
                      "open cp_trigger_queue O_RDWR", queued("5.100,7.80,3"), "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1000\n",
                      "open activate O_RDWR", "write activate 1\n"}},
                    {"performFifoHapticEngine 25", 0, {"open fifo O_RDWR", "write fifo 25\n"}},
                    {"performHybridHapticEngine 10000 5,5000,1,3,170 1,2,0,-3,4",
                     0,
                     {"open hybrid_haptic_engine O_RDWR",
                      "write hybrid_haptic_engine 8 5 5000 #3 170 1 2 -3 4\n", "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1\n",
                      "open activate O_RDWR", "write activate 1\n"}},
                    {"performHybridHapticEngine 10000 5,5000,2,3,170",
                     0,
                     {"open hybrid_haptic_engine O_RDWR",
                      "write hybrid_haptic_engine 4 5 5000 170\n", "open state O_RDWR",
                      "write state 1\n", "open duration O_RDWR", "write duration 1\n",
                      "open activate O_RDWR", "write activate 1\n"}},
            });
}

TEST(ExtensionJournal, OfTheLegacyClassWhichLacksPatternsFifoAndHybrid) {
    const Phone phone("legacy");
    expectJournals(
            phone,
            {
                    {"setAmplitude 10000", 0, {"open intensity O_RDWR", "write intensity 10000\n"}},
                    {"setForceTouchAmplitude 10000",
                     0,
                     {"open force_touch_intensity O_RDWR", "write force_touch_intensity 10000\n"}},
                    {"setFrequencyType 0", 0, {"open multi_freq O_RDWR", "write multi_freq 0\n"}},
                    {"setFolderStatus 0", kIllegalState, {}},
                    {"setFolderTentModeStatus 0", kIllegalState, {}},
                    {"performHapticEngine 10000 7,10000,2050,0",
                     0,
                     {"open haptic_engine O_RDWR", "write haptic_engine 4 7 10000 2050 0\n",
                      "open enable O_RDWR", "write enable 1\n"}},
                    // The intensity stays: nothing that was written is taken back.
                    {"performPrebakedHapticPattern 23 6700 false",
                     kIllegalState,
                     {"open intensity O_RDWR", "write intensity 6700\n"}},
                    {"performPrebakedHapticPattern 23 6700 true", kIllegalState, {}},
                    {"perform TICK 5000",
                     0,
                     {"open haptic_engine O_RDWR", "write haptic_engine 4 7 2500 2050 0\n",
                      "open enable O_RDWR", "write enable 1\n"}},
                    {"perform CLICK 5000",
                     0,
                     {"open intensity O_RDWR", "write intensity 5000\n", "open enable O_RDWR",
                      "write enable 7\n"}},
                    {"performPlaybackEngine true 0 5,100,0", kIllegalState, {}},
                    {"performFifoHapticEngine 0", kIllegalState, {}},
                    {"performHybridHapticEngine 10000 5,5000,1,3,170", kIllegalState, {}},
            });
}

TEST(ExtensionJournal, OfForceFeedback) {
    const Phone phone("ff");
    expectJournals(
            phone,
            {
                    {"setAmplitude 5000", 0, {"open motor O_RDWR", "event 96 5000"}},
                    {"setForceTouchAmplitude 5000", kIllegalState, {}},
                    {"setFrequencyType 0", kIllegalState, {}},
                    {"setFolderStatus 1",
                     0,
                     {"open event_cmd O_RDWR", "write event_cmd FOLDER_CLOSE\n"}},
                    {"performPrebakedHapticPattern 23 6700 false",
                     0,
                     {"event 96 6700", "upload 0 00001700", "event 0 1"}},
                    {"performPrebakedHapticPattern 0 6700 false",
                     0,
                     {"event 96 6700", "erase 0", "upload 0 00000000"}},
                    // Pattern 5 is 14 in the platform's numbering, which this driver was asked for.
                    {"performPrebakedHapticPattern 5 6700 true",
                     0,
                     {"event 96 6700", "erase 0", "upload 0 000001ff00640e000000000a",
                      "event 0 1"}},
                    {"performPrebakedHapticPattern 0 6700 true", kIllegalState, {}},
                    {"perform CLICK 4321",
                     0,
                     {"event 96 4321", "erase 0", "upload 0 00000a00", "event 0 1"}},
                    {"performHapticEngine 10000 7,10000,2050,0", 0, {}},
                    {"performPlaybackEngine true 0 5,100,0", kIllegalState, {}},
                    {"performFifoHapticEngine 0", kIllegalState, {}},
                    {"performHybridHapticEngine 10000 5,5000,1,3,170", kIllegalState, {}},
            });
    EXPECT_EQ(phone.call({"ext", "performHapticEngine", "10000", "7,10000,2050,0"})["exception"],
              0);
    EXPECT_THAT(phone.log(),
                HasSubstr("V_4_0: performHapticEngine Fail - unsupported when forcefeedback\n"));
}

TEST(ExtensionJournal, QueriesOnlyRead) {
    const Phone phone("leds");
    expectJournals(
            phone,
            {
                    {"supportsFolderStatusSetting",
                     0,
                     {"open event_cmd O_RDWR", "read event_cmd 511"}},
                    {"supportsFolderTentModeStatusSetting",
                     0,
                     {"open event_cmd O_RDWR", "read event_cmd 511"}},
                    {"supportsHasFeature", 0, {"open functions O_RDONLY"}},
                    {"hasFeature INTENSITY",
                     0,
                     {"open functions O_RDONLY", "open functions O_RDONLY", "read functions 511"}},
                    {"getNumberOfPrebakedHapticPattern",
                     0,
                     {"open num_waves O_RDONLY", "open num_waves O_RDONLY", "read num_waves 7"}},
            });
}

TEST(ExtensionJournal, AccessesAreTheSystemUsersWhoeverCalls) {
    const Phone phone("leds");
    phone.reset();
    EXPECT_EQ(phone.call({"ext", "performFifoHapticEngine", "1"})["exception"], 0);
    const std::vector<json> journal = phone.journal();
    ASSERT_GE(journal.size(), 2U);
    for (const json& entry : journal) EXPECT_EQ(entry["uid"], 1000);
}

}  // namespace
}  // namespace qvx::test
