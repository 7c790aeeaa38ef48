// SPDX-License-Identifier: Apache-2.0
//
// The phones and their effects' calls.
#include "bench/effect_phones.h"

namespace bench {
namespace {

const std::string kTimedOutput = "/sys/class/timed_output/vibrator/";
const std::string kLeds = "/sys/class/leds/vibrator/";

DriverCall node(const std::string& path, const std::string& text) {
    return {DriverCall::Kind::kNode, path, text};
}

DriverCalls operator+(DriverCalls first, const DriverCalls& second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

// Switching the motor on, on either class.
DriverCalls start(const std::string& directory, const std::string& milliseconds) {
    if (directory == kTimedOutput) return {node(directory + "enable", milliseconds + "\n")};
    return {node(directory + "state", "1\n"), node(directory + "duration", milliseconds + "\n"),
            node(directory + "activate", "1\n")};
}

DriverCalls intensity(const std::string& directory) {
    return {node(directory + "intensity", "10000\n")};
}

DriverCalls pattern(const std::string& directory, const std::string& index) {
    return intensity(directory) + DriverCalls{node(directory + "cp_trigger_index", index + "\n")} +
           start(directory, "1000");
}

DriverCalls packet(const std::string& directory, const std::string& text) {
    return DriverCalls{node(directory + "haptic_engine", text)} + start(directory, "1");
}

DriverCalls pulse(const std::string& directory) {
    return intensity(directory) + start(directory, "7");
}

DriverCalls doubleClick(const std::string& directory) {
    const std::string stop = directory == kTimedOutput ? "enable" : "activate";
    return intensity(directory) + DriverCalls{node(directory + stop, "0\n")} +
           start(directory, "10") + start(directory, "15");
}

DriverCalls storedEffect() {
    return {{DriverCall::Kind::kEvent, "", ""},
            {DriverCall::Kind::kErase, "", ""},
            {DriverCall::Kind::kUpload, "", ""},
            {DriverCall::Kind::kEvent, "", ""}};
}

PhoneFiles sysfsFiles(const char* name, const std::string& directory,
                      const std::vector<std::string>& leaves) {
    PhoneFiles files = {name, {}};
    const std::vector<std::string> start =
            directory == kTimedOutput ? std::vector<std::string>{"enable"}
                                      : std::vector<std::string>{"state", "duration", "activate"};
    for (const std::string& leaf : start) files.files.emplace_back(directory + leaf, "");
    for (const std::string& leaf : leaves) files.files.emplace_back(directory + leaf, "");
    return files;
}

}  // namespace

std::vector<Phone> effectPhones() {
    std::vector<Phone> all;
    for (const std::string& directory : {kTimedOutput, kLeds}) {
        const bool isLegacy = directory == kTimedOutput;
        all.push_back({sysfsFiles(isLegacy ? "legacy-prebaked-index" : "leds-prebaked-index",
                                  directory, {"intensity", "cp_trigger_index"}),
                       {pattern(directory, "10"), pattern(directory, "14"),
                        pattern(directory, "50"), pattern(directory, "23")}});
        all.push_back(
                {sysfsFiles(isLegacy ? "legacy-haptic-engine" : "leds-haptic-engine", directory,
                            {"intensity", "haptic_engine"}),
                 {pulse(directory), doubleClick(directory), packet(directory, "4 7 10000 2050 0\n"),
                  packet(directory, "4 7 10000 2000 1\n")}});
        all.push_back(
                {sysfsFiles(isLegacy ? "legacy-amplitude" : "leds-amplitude", directory,
                            {"intensity"}),
                 {pulse(directory), doubleClick(directory), pulse(directory), pulse(directory)}});
    }
    all.push_back({{"ff",
                    {{"/proc/bus/input/devices",
                      "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n\n"},
                     {kMotor, ""}}},
                   {storedEffect(), storedEffect(), storedEffect(), storedEffect()}});
    return all;
}

}  // namespace bench
