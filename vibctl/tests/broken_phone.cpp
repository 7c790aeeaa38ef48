// SPDX-License-Identifier: Apache-2.0
//
// The doctor on a broken phone: see broken_phone.h.
#include "vibctl/tests/broken_phone.h"

#include <unistd.h>

#include <algorithm>

namespace vibctl {
namespace {

void makeHealthy(Phone& phone) {
    phone.facts.device = "/dev/binder";
    phone.facts.declared = true;
    phone.facts.registered = true;
    phone.facts.registrant = 312;
    phone.facts.version = 2;
    phone.facts.extensionVersion = 4;
    const fake::Root& root = phone.root;
    root.put("/dev/binder", "");
    root.putFragment();
    root.putProcess(7, {"/system/bin/servicemanager"}, 0);
    root.putState(7, 'S', 100);
    root.putProcess(312, {kProgram}, kStranger);
    root.putState(312, 'S', 200);
    root.putNodes(kLedsDirectory, {"activate", "duration", "state", "intensity", "haptic_engine"});
    root.put(kLedsDirectory + "motor_type", "LINEAR_1040\n");
    root.put(kLedsDirectory + "intensities", "0,5000,10000\n");
    root.put(kLedsDirectory + "haptic_intensities", "0,5000,10000\n");
    root.put(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITIVE_EFFECT_COMPOSE\n");
}

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    const size_t at = text.find(from);
    return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

}  // namespace

TEST_P(BrokenPhone, GetsItsCauseAndTheNextStep) {
    Phone phone;
    makeHealthy(phone);
    ASSERT_TRUE(allIsWell(diagnose(phone.facts, phone.root.path())));
    GetParam().damage(phone);
    const std::string owner = std::to_string(geteuid()) + ":" + std::to_string(getegid());
    std::string line = replaced(GetParam().line, "OWNER", owner);
    line = replaced(line, "ROOT", phone.root.path().string());
    std::vector<std::string> lines;
    for (const Finding& finding : diagnose(phone.facts, phone.root.path())) {
        lines.push_back(humanLine(finding, false));
        EXPECT_LE(lines.back().size(), 100u) << lines.back();
    }
    if (line.size() > 100) {
        // Only the path of the test's own directory, which is as long as it is, may be too much.
        ASSERT_NE(GetParam().line.find("ROOT"), std::string::npos) << line;
        line = humanLine(bad("declaration", "no manifest names IVibrator/default",
                             line.substr(line.find("install"))),
                         false);
    }
    EXPECT_EQ(std::count(lines.begin(), lines.end(), line), 1) << "among\n"
                                                               << ::testing::PrintToString(lines);
    EXPECT_EQ(allIsWell(diagnose(phone.facts, phone.root.path())), line.starts_with("note"));
}

// What a healthy phone, and one on which only the service does not run, are not told.
TEST(Doctor, DoesNotBlameADriverForAServiceThatDoesNotRun) {
    Phone phone;
    makeHealthy(phone);
    phone.endService();
    for (const Finding& finding : diagnose(phone.facts, phone.root.path())) {
        EXPECT_EQ(finding.answer == Answer::kBad, finding.check == "registration")
                << humanLine(finding, false);
    }
}

}  // namespace vibctl
