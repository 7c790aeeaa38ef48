// SPDX-License-Identifier: Apache-2.0
//
// The processes of a guest test: see processes.h.
#include "platform/servicemanager/tests/processes.h"

#include <chrono>
#include <csignal>
#include <thread>

#include <android-base/file.h>
#include <android/binder_process.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/support/fake_root.h"
#include "tests/support/kernel_log.h"

namespace processes {

namespace {

using qvx::test::Process;
using qvx::test::Program;

std::string contentOf(const std::string& file) {
    std::string content;
    android::base::ReadFileToString(file, &content);
    return content;
}

Program programBelow(const std::string& root, const std::string& rules) {
    const std::string file = root + "/services.rules";
    EXPECT_TRUE(android::base::WriteStringToFile(rules, file));
    return {.words = {SERVICEMANAGER_PROGRAM, "--root", root, "--rules", file},
            .errors = root + "/servicemanager.log",
            .tellsReadiness = true};
}

}  // namespace

Manager::Manager(const std::string& root, const std::string& rules)
    : mLog(root + "/servicemanager.log"), mProcess(qvx::test::kRoot, programBelow(root, rules)) {
    EXPECT_TRUE(mProcess.isReady()) << log();
}

Manager::~Manager() {
    // It may go while notices of deaths are on their way to it, which the kernel remarks on.
    const qvx::test::ExpectBinderComplaints expected;
    mProcess.signal(SIGTERM);
    mProcess.wait();
    // The driver cleans up behind the process, and remarks on it while it does.
    qvx::test::eventually([this] { return !answers(); });
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
}

bool Manager::answers() const {
    return handset::RawBinder().pingServiceManager();
}

std::string Manager::log() const {
    return contentOf(mLog);
}

int runManager(uid_t uid, std::string& output) {
    const qvx::test::FakeRoot root;
    Process manager(uid, Program{.words = {SERVICEMANAGER_PROGRAM}, .errors = root.at("/log")});
    const int status = manager.wait();
    output = contentOf(root.at("/log"));
    return status;
}

Process serve(uid_t uid, const std::function<void()>& prepare) {
    return Process(uid, [&](const Process::Ready& ready) {
        prepare();
        ready();
        ABinderProcess_joinThreadPool();
    });
}

}  // namespace processes
