// SPDX-License-Identifier: Apache-2.0
//
// Users of four kinds ask for everything at once, well and badly, while one of them after the other
// is killed, the driver fails now and then, and the service and the service manager are killed: every
// answer agrees with what the driver saw, and nothing grows.
//
// SOAK_SECONDS says for how long (for each kind of phone), SOAK_SEED repeats the order of events.
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <random>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/soak/footprint.h"
#include "tests/soak/journal_check.h"
#include "tests/soak/user.h"
#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"
#include "tests/support/process.h"
#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::IsEmpty;

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr uid_t kUsers[] = {kRoot, kSystem, kShell, kApp};
constexpr seconds kLongestRound{120};
constexpr int kRoundsPerManager = 3;
constexpr int kFewestRounds = 3;

long environmentOr(const char* name, long otherwise) {
    const char* const text = getenv(name);
    return text == nullptr ? otherwise : atol(text);
}

// Faults that a profile's driver shows for a few calls. None is on what probing looks at, so that the
// service finds the same driver whenever it starts.
std::vector<json> faultsOf(const std::string& profile) {
    if (profile == "ff") {
        return {{{"node", "motor"}, {"op", "upload"}, {"errno", "EIO"}, {"times", 2}},
                {{"node", "motor"}, {"op", "upload"}, {"errno", "ENOSPC"}, {"times", 1}},
                {{"node", "motor"}, {"op", "upload"}, {"delay", 20}, {"times", 3}},
                {{"node", "motor"}, {"op", "write"}, {"errno", "EIO"}, {"times", 1}}};
    }
    const auto node = [](const char* name) {
        return std::string("/sys/class/leds/vibrator/") + name;
    };
    return {{{"node", node("duration")}, {"op", "write"}, {"errno", "EIO"}, {"times", 2}},
            {{"node", node("duration")}, {"op", "write"}, {"delay", 20}, {"times", 3}},
            {{"node", node("activate")}, {"op", "write"}, {"short", 1}, {"times", 1}},
            {{"node", node("state")}, {"op", "open"}, {"errno", "EACCES"}, {"times", 1}},
            {{"node", node("cp_trigger_queue")}, {"op", "write"}, {"errno", "EINTR"}, {"times", 3}},
            {{"node", node("cp_trigger_index")},
             {"op", "write"},
             {"errno", "ENODEV"},
             {"times", 2}},
            {{"node", node("intensity")}, {"op", "write"}, {"errno", "EIO"}, {"times", 2}}};
}

class Soak : public testing::TestWithParam<const char*> {
  protected:
    // A service manager in the place of the one that was killed; init's work, and there is none here.
    void replaceManager() {
        kill(mManagerPid, SIGKILL);
        mManager.reset();
        const auto manager =
                std::filesystem::read_symlink("/proc/self/exe").parent_path() / "servicemanager";
        const Program program{{manager, "--rules", QVX_SERVICE_RULES}, "/dev/null", true};
        mManager = std::make_unique<Process>(kRoot, program);
        mManagerPid = mManager->pid();
        ++mManagerDeaths;
    }

    // The service, and with it the service manager if asked for; both are there again.
    void killService(bool withManager) {
        runCommand({"phone", "fault", "--clear"});
        if (withManager) replaceManager();
        runCommand({"phone", "service", "kill"});
        const CommandResult start = runCommand({"phone", "service", "restart"});
        EXPECT_EQ(start.status, 0) << start.out << start.err;
        ++mServiceDeaths;
        if (!withManager) return;
        // A client's way to a manager that has died is lost for good, as on a phone.
        for (const auto& user : mUsers) user->replace();
    }

    // One round: everybody asks, and in the meantime one thing after another goes wrong, each after
    // so many requests.
    void playRound(const Phone& phone, int round) {
        constexpr size_t kAll = std::size(kUsers) * User::kPerRound;
        constexpr size_t kBetweenFaults = kAll / 8;
        const size_t deathOfAUser = mChance() % kAll;
        const size_t deathOfTheService = mChance() % kAll;
        const std::vector<json> faults = faultsOf(GetParam());
        size_t nextFault = 0;
        bool userIsDue = true;
        bool serviceIsDue = true;
        const auto end = Clock::now() + kLongestRound;
        for (const auto& user : mUsers) user->begin();
        while (!areDone() || userIsDue || serviceIsDue) {
            ASSERT_LT(Clock::now(), end) << "a user is not answered";
            const size_t asked = countAsked();
            if (asked >= nextFault) {
                phone.fault(faults[mChance() % faults.size()]);
                nextFault += kBetweenFaults;
                ++mFaults;
            }
            if (userIsDue && asked >= deathOfAUser) {
                mUsers[mChance() % mUsers.size()]->replace();
                userIsDue = false;
                ++mUserDeaths;
            }
            if (serviceIsDue && asked >= deathOfTheService) {
                killService(round % kRoundsPerManager == 0);
                serviceIsDue = false;
            }
            std::this_thread::sleep_for(milliseconds(5));
        }
        runCommand({"phone", "fault", "--clear"});
    }

    size_t countAsked() const {
        size_t count = 0;
        for (const auto& user : mUsers) count += user->countAsked();
        return count;
    }

    bool areDone() const {
        return std::all_of(mUsers.begin(), mUsers.end(),
                           [](const auto& user) { return user->isDone(); });
    }

    void checkRound(const Phone& phone, std::span<const Request> table) {
        std::vector<const User*> users;
        for (const auto& user : mUsers) {
            users.push_back(user.get());
            EXPECT_EQ(user->untold(), 0) << "compositions of user " << user->uid();
            mRequests += User::kPerRound;
        }
        EXPECT_THAT(disagreements(users, table, runCommand({"phone", "journal"}).out), IsEmpty());
        EXPECT_THAT(mKernel.next(), IsEmpty());
        phone.reset();
        eventually([&] { return entriesOf(phone.servicePid(), "task").size() == 1; });
        mSamples.push_back(footprintOf({{"service", phone.servicePid()},
                                        {"manager", mManagerPid},
                                        {"driver", mDriverPid}}));
    }

    std::vector<std::unique_ptr<User>> mUsers;
    std::vector<Footprint> mSamples;
    const KernelComplaints mKernel;
    std::minstd_rand mChance{static_cast<unsigned>(environmentOr("SOAK_SEED", 1))};
    std::unique_ptr<Process> mManager;
    pid_t mManagerPid = 0;
    pid_t mDriverPid = 0;
    size_t mRequests = 0;
    int mUserDeaths = 0;
    int mServiceDeaths = 0;
    int mManagerDeaths = 0;
    int mFaults = 0;
};

TEST_P(Soak, EveryAnswerAgreesWithTheJournalAndNothingGrows) {
    const ExpectBinderComplaints provoked;  // mKernel looks at each of them
    const Phone phone(GetParam());
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    const json status = json::parse(runCommand({"phone", "status", "--json"}).out);
    mManagerPid = status["manager"];
    mDriverPid = status["driver"];
    phone.reset();

    const std::span<const Request> table = requestsOf(GetParam());
    for (const uid_t uid : kUsers) mUsers.push_back(std::make_unique<User>(uid, table));
    const auto end = Clock::now() + seconds(environmentOr("SOAK_SECONDS", 20));
    for (int round = 1; (round <= kFewestRounds || Clock::now() < end) && !HasFailure(); ++round) {
        playRound(phone, round);
        if (!HasFatalFailure()) checkRound(phone, table);
    }
    mUsers.clear();
    EXPECT_THAT(growthOver(mSamples), IsEmpty());
    std::printf(
            "%s: %zu requests by %zu users; killed: service %d, manager %d, users %d; faults %d\n",
            GetParam(), mRequests, std::size(kUsers), mServiceDeaths, mManagerDeaths, mUserDeaths,
            mFaults);
}

INSTANTIATE_TEST_SUITE_P(Phones, Soak, testing::Values("leds", "ff"),
                         [](const auto& phone) { return std::string(phone.param); });

}  // namespace
}  // namespace qvx::test
