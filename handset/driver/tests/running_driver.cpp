// SPDX-License-Identifier: Apache-2.0
//
// A handset-driver that runs for one test.
#include "handset/driver/tests/running_driver.h"

#include <csignal>
#include <fstream>
#include <regex>
#include <sstream>

#include "handset/common/control_client.h"

namespace handset {
namespace {

using android::base::Result;

qvx::test::Program programIn(const TemporaryDir& directory, const std::string& profile,
                             const std::string& module) {
    std::ofstream(fileIn(directory, "profile.json")) << profile;
    qvx::test::Program program{
            .words = {QVX_DRIVER, "--profile", fileIn(directory, "profile.json"), "--journal",
                      fileIn(directory, "journal"), "--control", fileIn(directory, "control")},
            .errors = fileIn(directory, "errors"),
            .tellsReadiness = true};
    if (!module.empty()) program.words.insert(program.words.end(), {"--module", module});
    return program;
}

}  // namespace

RunningDriver::RunningDriver(const std::string& profile, const std::string& module)
    : mProcess(qvx::test::kRoot, programIn(mDirectory, profile, module)) {}

RunningDriver::~RunningDriver() {
    end(SIGTERM);
}

int RunningDriver::end(int signal) {
    mProcess.signal(signal);
    return mProcess.wait();
}

std::string RunningDriver::ask(const std::string& request) const {
    const Result<std::string> answer = askDriver(fileIn(mDirectory, "control"), request);
    return answer ? "ok " + *answer : "error " + answer.error().message();
}

std::string RunningDriver::rawJournal() const {
    ask("settle");
    return contentOf(fileIn(mDirectory, "journal"));
}

std::vector<std::string> RunningDriver::journal() const {
    std::istringstream text(std::regex_replace(
            rawJournal(), std::regex("\"n\":[0-9]+,\"us\":[0-9]+,\"pid\":[0-9]+,|,\"took\":[0-9]+"),
            ""));
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);) lines.push_back(line);
    return lines;
}

}  // namespace handset
