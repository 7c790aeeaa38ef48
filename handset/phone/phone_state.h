// SPDX-License-Identifier: Apache-2.0
//
// What is known about the phone that is up: who runs it, and what it has to clean up.
#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace handset {

inline constexpr const char* kStateFile = "/run/phone.state";
inline constexpr const char* kLockFile = "/run/phone.lock";
inline constexpr const char* kControlSocket = "/run/phone.control";
inline constexpr const char* kSupervisorSocket = "/run/phone.supervisor";
inline constexpr const char* kDefaultOut = "/run/phone";

// The phone as its supervisor last described it. A pid of 0 stands for a process not started.
struct PhoneState {
    std::string profile;  // as it was named
    std::string out;      // directory of the journal and the logs
    pid_t supervisor = 0;
    pid_t driver = 0;
    pid_t manager = 0;
    pid_t service = 0;
    bool registered = false;  // the service has been in the service manager's list
    bool stopped = false;     // by "phone service stop"
    int starts = 0;           // of the service
    int64_t restartAt = 0;    // when it is started again, microseconds since boot; 0: it is not
    std::optional<int> serviceStatus;  // exit status once the service has ended
    std::vector<std::string> made;     // files and directories to remove, directories first

    std::string calls() const { return out + "/calls.jsonl"; }
    std::string journal() const { return out + "/journal.jsonl"; }
    std::string serviceLog() const { return out + "/service.log"; }
    std::string serviceOutput() const { return out + "/service.out"; }
    std::string managerLog() const { return out + "/servicemanager.log"; }
    std::string driverLog() const { return out + "/driver.log"; }
};

// Writes, reads and removes the description. Reading gives nothing where there is none.
android::base::Result<void> saveState(const PhoneState& state);
std::optional<PhoneState> loadState();
void removeState();

// Held by whoever brings a phone up, and then by its supervisor for as long as it runs: a phone
// is up exactly while the lock is held. The file goes away with its last holder's unlock().
class PhoneLock {
  public:
    // Takes the lock, unless somebody holds it.
    static std::optional<PhoneLock> tryTake();

    // Removes the lock file and gives the lock up.
    void unlock();

  private:
    explicit PhoneLock(android::base::unique_fd file) : mFile(std::move(file)) {}

    android::base::unique_fd mFile;
};

// True while somebody holds the lock.
bool isPhoneLocked();

}  // namespace handset
