// SPDX-License-Identifier: Apache-2.0
//
// The phones and their effects' calls.
#include "effect_phones.h"

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
DriverCalls start(const std::string& folder, const std::string& milliseconds) {
    if (folder == kTimedOutput) return {node(folder + "enable", milliseconds + "\n")};
    return {node(folder + "state", "1\n"), node(folder + "duration", milliseconds + "\n"),
            node(folder + "activate", "1\n")};
}

DriverCalls intensity(const std::string& folder) {
    return {node(folder + "intensity", "10000\n")};
}

DriverCalls pattern(const std::string& folder, const std::string& index) {
    return intensity(folder) + DriverCalls{node(folder + "cp_trigger_index", index + "\n")} +
           start(folder, "1000");
}

DriverCalls packet(const std::string& folder, const std::string& text) {
    return DriverCalls{node(folder + "haptic_engine", text)} + start(folder, "1");
}

DriverCalls pulse(const std::string& folder) {
    return intensity(folder) + start(folder, "7");
}

DriverCalls doubleClick(const std::string& folder) {
    const std::string stop = folder == kTimedOutput ? "enable" : "activate";
    return intensity(folder) + DriverCalls{node(folder + stop, "0\n")} + start(folder, "10") +
           start(folder, "15");
}

DriverCalls storedEffect() {
    return {{DriverCall::Kind::kEvent, "", ""},
            {DriverCall::Kind::kErase, "", ""},
            {DriverCall::Kind::kUpload, "", ""},
            {DriverCall::Kind::kEvent, "", ""}};
}

PhoneFiles sysfsFiles(const char* name, const std::string& folder,
                      const std::vector<std::string>& leaves) {
    PhoneFiles files = {name, {}};
    const std::vector<std::string> start =
            folder == kTimedOutput ? std::vector<std::string>{"enable"}
                                   : std::vector<std::string>{"state", "duration", "activate"};
    for (const std::string& leaf : start) files.files.emplace_back(folder + leaf, "");
    for (const std::string& leaf : leaves) files.files.emplace_back(folder + leaf, "");
    return files;
}

}  // namespace

std::vector<Phone> effectPhones() {
    std::vector<Phone> all;
    for (const std::string& folder : {kTimedOutput, kLeds}) {
        const bool isLegacy = folder == kTimedOutput;
        all.push_back({sysfsFiles(isLegacy ? "legacy-prebaked-index" : "leds-prebaked-index",
                                  folder, {"intensity", "cp_trigger_index"}),
                       {pattern(folder, "10"), pattern(folder, "14"), pattern(folder, "50"),
                        pattern(folder, "23")}});
        all.push_back({sysfsFiles(isLegacy ? "legacy-haptic-engine" : "leds-haptic-engine", folder,
                                  {"intensity", "haptic_engine"}),
                       {pulse(folder), doubleClick(folder), packet(folder, "4 7 10000 2050 0\n"),
                        packet(folder, "4 7 10000 2000 1\n")}});
        all.push_back({sysfsFiles(isLegacy ? "legacy-amplitude" : "leds-amplitude", folder,
                                  {"intensity"}),
                       {pulse(folder), doubleClick(folder), pulse(folder), pulse(folder)}});
    }
    all.push_back({{"ff",
                    {{"/proc/bus/input/devices",
                      "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n\n"},
                     {kMotor, ""}}},
                   {storedEffect(), storedEffect(), storedEffect(), storedEffect()}});
    return all;
}

}  // namespace bench
