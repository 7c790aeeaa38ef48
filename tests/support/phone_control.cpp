// SPDX-License-Identifier: Apache-2.0
#include "phone_control.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace qvx::test {
namespace {

constexpr const char* kOutFolder = "/run/system-test";

std::string readFile(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
}

}  // namespace

Phone::Phone(const nlohmann::json& profile, const std::vector<std::string>& options)
    : out_(kOutFolder) {
    std::filesystem::remove_all(out_);
    std::string name;
    if (profile.is_string()) {
        name = profile.get<std::string>();
    } else {
        name = out_ + "-profile.json";
        std::ofstream(name) << profile.dump();
    }
    std::vector<std::string> command = {"phone", "up", "--profile", name, "--out", out_};
    command.insert(command.end(), options.begin(), options.end());
    up_ = runCommand(command);
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
    std::istringstream text(runCommand({"phone", "journal"}).out);
    for (std::string line; std::getline(text, line);) {
        lines.push_back(nlohmann::json::parse(line, nullptr, false));
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
    return readFile(out_ + "/service.log");
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
    return nlohmann::json::parse(readFile(QVX_PROFILE_FOLDER "/" + name + ".json"));
}

}  // namespace qvx::test
