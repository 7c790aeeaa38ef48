// SPDX-License-Identifier: Apache-2.0
//
// The phone tool, run as an engineer runs it.
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "handset/driver/tests/test_files.h"

namespace handset {

struct Ran {
    int status = -1;
    std::string output;  // standard output
    std::string errors;  // standard error
};

// Runs a command line; "phone" in it is the tool under test.
inline Ran run(const std::string& line) {
    const TemporaryDir directory;
    const std::string whole = "PATH=" QVX_PROGRAMS ":$PATH; { " + line + "; } >" +
                              fileIn(directory, "out") + " 2>" + fileIn(directory, "err") +
                              " </dev/null";
    const int status = system(whole.c_str());
    return {WEXITSTATUS(status), contentOf(fileIn(directory, "out")),
            contentOf(fileIn(directory, "err"))};
}

inline nlohmann::json state() {
    return nlohmann::json::parse(contentOf("/run/phone.state"), nullptr, false);
}

inline bool exists(const std::string& path) {
    return access(path.c_str(), F_OK) == 0;
}

inline bool runs(pid_t pid) {
    return pid > 0 && kill(pid, 0) == 0;
}

// Waits up to ten seconds.
inline bool comesTrue(const std::function<bool()>& question) {
    for (int i = 0; i < 1000; ++i) {
        if (question()) return true;
        usleep(10000);
    }
    return false;
}

// Every process and file a phone may leave, apart from what is in its output directory.
inline std::string leftOvers() {
    std::string found;
    for (const char* path : {"/run/phone.state", "/run/phone.lock", "/run/phone.control",
                             "/run/phone.supervisor", "/efs", "/vendor/etc/vintf/manifest"}) {
        if (exists(path)) found += std::string(path) + " ";
    }
    for (const auto& entry : std::filesystem::directory_iterator("/proc")) {
        const std::string name = contentOf(entry.path().string() + "/comm");
        for (const char* own : {"handset-driver\n", "servicemanager\n", "android.hardwar\n"}) {
            if (name == own) found += name;
        }
    }
    return found;
}

class Phone : public testing::Test {
  protected:
    void SetUp() override { ASSERT_EQ(leftOvers(), ""); }
    void TearDown() override {
        EXPECT_EQ(run("phone down").status, 0);
        EXPECT_EQ(leftOvers(), "");
    }
};

}  // namespace handset
