// SPDX-License-Identifier: Apache-2.0
#include "tests/support/phone_control.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <android-base/file.h>
#include <android-base/strings.h>

namespace qvx::test {
namespace {

constexpr const char* kOutDirectory = "/run/system-test";

std::string readFile(const std::string& path) {
    std::string text;
    android::base::ReadFileToString(path, &text);
    return text;
}

}  // namespace

Phone::Phone(const nlohmann::json& profile, const std::vector<std::string>& options)
    : mOut(kOutDirectory) {
    std::filesystem::remove_all(mOut);
    std::string name;
    if (profile.is_string()) {
        name = profile.get<std::string>();
    } else {
        name = mOut + "-profile.json";
        std::ofstream(name) << profile.dump();
    }
    std::vector<std::string> command = {"phone", "up", "--profile", name, "--out", mOut};
    command.insert(command.end(), options.begin(), options.end());
    mUp = runCommand(command);
}

Phone::~Phone() {
    runCommand({"phone", "down"});
}

nlohmann::json Phone::call(const std::vector<std::string>& words) const {
    std::vector<std::string> command = {"vibctl", "--json"};
    command.insert(command.end(), words.begin(), words.end());
    return nlohmann::json::parse(runCommand(command).out, nullptr, false);
}

std::vector<nlohmann::json> Phone::journal() const {
    std::vector<nlohmann::json> lines;
    for (const std::string& line :
         android::base::Split(runCommand({"phone", "journal"}).out, "\n")) {
        if (!line.empty()) lines.push_back(nlohmann::json::parse(line, nullptr, false));
    }
    return lines;
}

std::vector<std::string> Phone::writes() const {
    std::vector<std::string> result;
    for (const nlohmann::json& entry : journal()) {
        if (entry.value("op", "") != "write") continue;
        const std::string node = entry.value("node", "");
        result.push_back(node.substr(node.rfind('/') + 1) + " " +
                         entry.value("data", entry.value("hex", "")));
    }
    return result;
}

void Phone::reset() const {
    runCommand({"phone", "reset"});
}

void Phone::fault(const nlohmann::json& fault) const {
    runCommand({"phone", "fault", fault.dump()});
}

std::string Phone::log() const {
    return runCommand({"phone", "log"}).out;
}

int Phone::servicePid() const {
    for (const auto& entry : std::filesystem::directory_iterator("/proc")) {
        std::error_code ignored;
        const auto executable = std::filesystem::read_symlink(entry.path() / "exe", ignored);
        if (executable.filename() == "android.hardware.vibrator-service.quorvan") {
            return std::stoi(entry.path().filename());
        }
    }
    return 0;
}

CommandResult Phone::startService(const std::string& user) const {
    const char* service = getenv("PHONE_SERVICE");
    if (service == nullptr) return {};
    return runCommand({"phone", "exec", "--user", user, "--", service});
}

nlohmann::json builtInProfile(const std::string& name) {
    return nlohmann::json::parse(readFile(QVX_PROFILE_DIRECTORY "/" + name + ".json"));
}

}  // namespace qvx::test
