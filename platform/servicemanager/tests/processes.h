// SPDX-License-Identifier: Apache-2.0
//
// The processes of a guest test: the service manager itself, and clients that run as some user.
// Each client is a fork of a test that has not touched binder yet, so it has a binder of its own.
#pragma once

#include <sys/types.h>

#include <filesystem>
#include <functional>
#include <string>

namespace processes {

// A running service manager; ended with the object.
class Manager {
  public:
    // Starts it as root with the option `--root root`, and `--rules` with these lines, and waits until
    // it answers.
    explicit Manager(const std::filesystem::path& root, const std::string& rules = "");
    ~Manager();
    Manager(const Manager&) = delete;
    Manager& operator=(const Manager&) = delete;

    bool answers() const;

    // What it has written to its standard error so far.
    std::string log() const;

  private:
    std::filesystem::path mLog;
    pid_t mPid;
};

// Runs the service manager's program as a user until it exits; its exit status.
int runManager(uid_t uid, std::string& output);

// Runs `body` in a client process as this user. Its expectations count as the test's.
void as(uid_t uid, const std::function<void()>& body);

// A client process that serves binder calls after `prepare`; killed with the object.
class Server {
  public:
    // Returns when `prepare` has.
    Server(uid_t uid, const std::function<void()>& prepare);
    ~Server();
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    pid_t pid() const { return mPid; }

    // Ends it as a crash would.
    void kill();

    // True when it has ended by itself.
    bool hasEnded();

  private:
    pid_t mPid;
};

// Asks again and again, for a few seconds at most, until the answer is yes.
bool eventually(const std::function<bool()>& question);

}  // namespace processes
