// SPDX-License-Identifier: Apache-2.0
//
// A run in words.
#include "handset/phone/listing.h"

#include <fstream>

#include <gtest/gtest.h>

#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

std::string journalWords(const std::string& line) {
    const std::vector<ListingLine> lines = fromJournal(line);
    return lines.size() == 1 ? lines[0].text : "";
}

TEST(Listing, AWriteShowsWhatWasWritten) {
    EXPECT_EQ(journalWords(R"({"n":1,"us":7,"pid":1,"uid":0,"op":"write",)"
                           R"("node":"/sys/class/leds/vibrator/duration","data":"500\n",)"
                           R"("result":4})"),
              R"(write   leds/vibrator/duration <- "500\n")");
}

TEST(Listing, AFaultIsMarkedWithWhatItDid) {
    EXPECT_EQ(journalWords(R"({"us":7,"op":"write","node":"/sys/class/leds/vibrator/state",)"
                           R"("data":"1\n","result":"EIO","fault":{"errno":"EIO","delay":5000},)"
                           R"("took":5000482})"),
              R"(write   leds/vibrator/state <- "1\n" = EIO )"
              R"([fault errno=EIO delay=5000 ms, took 5000.5 ms])");
}

TEST(Listing, AnUploadShowsItsSamples) {
    EXPECT_EQ(journalWords(R"({"us":7,"op":"upload","node":"motor","id":-1,"result":0,"type":81,)"
                           R"("waveform":93,"length":60,"delay":0,"custom_len":3,)"
                           R"("custom_hex":"00000a00ffff"})"),
              "upload  id -1 = 0: custom effect, 60 ms: 0 10 -1");
}

TEST(Listing, EventsSayWhatTheyMean) {
    const auto event = [](const std::string& code, const std::string& value) {
        return journalWords(R"({"us":7,"op":"event","node":"motor","type":21,"code":)" + code +
                            R"(,"value":)" + value + R"(,"result":24})");
    };
    EXPECT_EQ(event("3", "1"), "event   play effect 3");
    EXPECT_EQ(event("3", "0"), "event   stop effect 3");
    EXPECT_EQ(event("96", "5000"), "event   gain 5000 (50 %)");
}

TEST(Listing, ACallIsAskedAndAnswered) {
    const std::vector<ListingLine> lines =
            fromCalls(R"({"us":8122500,"pid":230,"uid":0,"call":["std","on","500"],"answer":)"
                      R"({"exception":0,"status":0,"result":null,"us":1412}})");
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_EQ(lines[0].us, 8122500);
    EXPECT_EQ(lines[0].text, "call    std on 500");
    EXPECT_EQ(lines[1].us, 8123912);
    EXPECT_EQ(lines[1].text, "answer  std on 500: ok, 1.4 ms");
}

TEST(Listing, AnAnswerSaysWhatTheClientWasShown) {
    const std::vector<ListingLine> lines =
            fromCalls(R"({"us":1,"call":["std","on","5"],"answer":{"exception":-5,"us":900,)"
                      R"("text":"EX_ILLEGAL_STATE; the driver refused"}})");
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_EQ(lines[1].text, "answer  std on 5: EX_ILLEGAL_STATE; the driver refused, 0.9 ms");
}

TEST(Listing, WhatIsNoLineOfARunIsLeftOut) {
    EXPECT_TRUE(fromJournal("{").empty());
    EXPECT_TRUE(fromLog("no time").empty());
    EXPECT_TRUE(fromLog("12345").empty());
    EXPECT_TRUE(fromCalls(R"({"us":1})").empty());
}

TEST(Listing, TheThreeFilesAreOneInOrderOfTime) {
    const TemporaryDir directory;
    PhoneState state;
    state.out = directory.path;
    std::ofstream(state.calls()) << R"({"us":8000100,"call":["std","off"],"answer":{"us":900}})"
                                 << "\n";
    std::ofstream(state.serviceLog()) << "8000300 I off\n";
    std::ofstream(state.journal()) << R"({"us":8000500,"op":"close","node":"motor"})"
                                   << "\n"
                                   << R"({"us":8000700,"op":"cl)";
    Listing listing(state);
    EXPECT_EQ(listing.newLines(),
              (std::vector<std::string>{"    8.000100 call    std off",
                                        "    8.000300 log     I off", "    8.000500 close   motor",
                                        "    8.001000 answer  std off: ok, 0.9 ms"}));
    std::ofstream(state.journal(), std::ios::app) << R"(ose","node":"motor"})"
                                                  << "\n";
    EXPECT_EQ(listing.newLines(), std::vector<std::string>{"    8.000700 close   motor"});
    EXPECT_TRUE(listing.newLines().empty());
}

}  // namespace
}  // namespace handset
