// SPDX-License-Identifier: Apache-2.0
//
// Users of four kinds ask for everything at once, well and badly, while one of them after the other
// is killed, the driver fails now and then, and the service and the service manager are killed: every
// answer agrees with what the driver saw, and nothing grows.
//
// SOAK_SECONDS says for how long (for each kind of phone).
#include <signal.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iostream>
#include <map>
#include <memory>
#include <random>
#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/control_client.h"
#include "handset/common/raw_binder.h"
#include "handset/phone/phone_state.h"
#include "tests/soak/footprint.h"
#include "tests/soak/journal_check.h"
#include "tests/soak/user.h"
#include "tests/support/kernel_log.h"
#include "tests/support/phone_control.h"
#include "tests/support/process.h"
#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using nlohmann::json;
using testing::IsEmpty;

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;
using std::chrono::seconds;

constexpr uid_t kUsers[] = {kRoot, kSystem, kShell, kApp};
constexpr const char* kSanitizerReports = "/run/soak";
constexpr size_t kRequestsPerRound = std::size(kUsers) * User::kPerRound;
constexpr int kFaultsPerRound = 20;
constexpr int kUserDeathsPerRound = 2;
constexpr int kServiceDeathsPerRound = 5;  // of which one, in every other round, is the manager's
constexpr int kStretch = 8;  // rounds with deaths of the service, and then so many without
constexpr int kFewestRounds = 3;
constexpr milliseconds kPause{20};
constexpr seconds kLongestRound{300};
constexpr seconds kReportPeriod{30};

// Faults that a profile's driver shows for a few calls. None is on what probing looks at, so that the
// service finds the same driver whenever it starts.
std::span<const char* const> faultsOf(const std::string& profile) {
    static constexpr const char* kForceFeedback[] = {
            R"({"node":"motor","op":"upload","errno":"EIO","times":2})",
            R"({"node":"motor","op":"upload","errno":"ENOSPC","times":1})",
            R"({"node":"motor","op":"upload","delay":20,"times":3})",
            R"({"node":"motor","op":"write","errno":"EIO","times":1})"};
#define NODE R"({"node":"/sys/class/leds/vibrator/)"
    static constexpr const char* kLeds[] = {
            NODE R"(duration","op":"write","errno":"EIO","times":2})",
            NODE R"(duration","op":"write","delay":20,"times":3})",
            NODE R"(activate","op":"write","short":1,"times":1})",
            NODE R"(state","op":"open","errno":"EACCES","times":1})",
            NODE R"(cp_trigger_queue","op":"write","errno":"EINTR","times":3})",
            NODE R"(cp_trigger_index","op":"write","errno":"ENODEV","times":2})",
            NODE R"(intensity","op":"write","errno":"EIO","times":2})"};
    if (profile == "ff") return kForceFeedback;
    return kLeds;
}

// Of the driver or of the phone's supervisor, past the phone tool: to start a program costs the guest
// more than what it does.
void demand(const char* socket, const std::string& request) {
    const auto answer = handset::askDriver(socket, request);
    EXPECT_TRUE(answer.ok()) << request << ": " << answer.error();
}

json phoneState() {
    std::ifstream file(handset::kStateFile);
    return json::parse(file, nullptr, false);
}

class Soak : public testing::TestWithParam<const char*> {
  protected:
    void SetUp() override {
        std::filesystem::create_directory(kSanitizerReports);
        std::filesystem::permissions(kSanitizerReports, std::filesystem::perms::all);
    }

    // Whom a sanitizer has something to say of, that one ends with it.
    void TearDown() override {
        for (const auto& report : std::filesystem::directory_iterator(kSanitizerReports)) {
            ADD_FAILURE() << std::ifstream(report.path()).rdbuf();
        }
        // Whose nodes and references these are.
        if (HasFailure()) std::cout << std::ifstream(kBinderState).rdbuf();
    }

    // The manager's death, and another one in its place; that is init's work, and there is none here.
    void replaceManager() {
        const auto manager =
                std::filesystem::read_symlink("/proc/" + std::to_string(mManagerPid) + "/exe");
        kill(mManagerPid, SIGKILL);
        mManager.reset();
        const Program program{{manager, "--rules", QVX_SERVICE_RULES}, "/dev/null", true};
        mManager = std::make_unique<Process>(kRoot, program);
        mManagerPid = mManager->pid();
        ++mManagerDeaths;
    }

    // The service, and with it the service manager if asked for; both are there again.
    void killService(bool withManager) {
        demand(handset::kControlSocket, "clear");
        if (withManager) replaceManager();
        demand(handset::kSupervisorSocket, "service kill");
        // Refused where the supervisor has been quicker, or the service's end was the manager's.
        (void)handset::askDriver(handset::kSupervisorSocket, "service start");
        ++mServiceDeaths;
        // What it looks at when it starts does not fail. One that does not come answers nobody.
        const auto end = Clock::now() + kLongestRound;
        while (!RawBinder().checkService(kService) && Clock::now() < end) {
            std::this_thread::sleep_for(kPause);
        }
        if (!withManager) return;
        // A client's way to a manager that has died is lost for good, as on a phone.
        for (const auto& user : mUsers) user->replace();
    }

    // One round: everybody asks, and in the meantime one thing after another goes wrong, each after
    // so many requests.
    void playRound(int round) {
        std::multimap<size_t, std::function<void()>> due;
        const auto plan = [&](int times, const std::function<void()>& event) {
            for (int i = 0; i < times; ++i) due.emplace(mChance() % kRequestsPerRound, event);
        };
        plan(kFaultsPerRound, [this] {
            const auto faults = faultsOf(GetParam());
            demand(handset::kControlSocket,
                   std::string("fault ") + faults[mChance() % faults.size()]);
            ++mFaults;
        });
        plan(kUserDeathsPerRound, [this] {
            mUsers[mChance() % mUsers.size()]->replace();
            ++mUserDeaths;
        });
        if (!isCalm(round)) {
            const int managers = round % 2;
            plan(managers, [this] { killService(true); });
            plan(kServiceDeathsPerRound - managers, [this] { killService(false); });
        }
        const auto end = Clock::now() + kLongestRound;
        for (const auto& user : mUsers) user->begin();
        while (!areDone() || !due.empty()) {
            ASSERT_LT(Clock::now(), end) << "a user is not answered";
            while (!due.empty() && due.begin()->first <= countAsked()) {
                due.extract(due.begin()).mapped()();
            }
            std::this_thread::sleep_for(kPause);
        }
        demand(handset::kControlSocket, "clear");
    }

    static bool isCalm(int round) { return (round / kStretch) % 2 == 1; }

    size_t countAsked() const {
        size_t count = 0;
        for (const auto& user : mUsers) count += user->countAsked();
        return count;
    }

    bool areDone() const {
        return std::all_of(mUsers.begin(), mUsers.end(),
                           [](const auto& user) { return user->isDone(); });
    }

    void checkRound(const Phone& phone, std::span<const Request> table, int round) {
        const json state = phoneState();
        const int service = state["service"];
        const std::string out = state["out"];
        EXPECT_EQ(state["starts"], 1 + mServiceDeaths) << "it died by itself: " << phone.log();
        std::vector<const User*> users;
        for (const auto& user : mUsers) {
            users.push_back(user.get());
            EXPECT_EQ(user->untold(), 0) << "compositions of user " << user->uid();
            mRequests += User::kPerRound;
        }
        EXPECT_THAT(disagreements(users, table, out + "/journal.jsonl"), IsEmpty());
        EXPECT_THAT(mKernel.next(), IsEmpty());
        demand(handset::kControlSocket, "reset");
        EXPECT_EQ(truncate((out + "/service.log").c_str(), 0), 0);
        eventually([&] { return entriesOf(service, "task").size() == 1; });
        std::map<std::string, pid_t> processes{{"manager", mManagerPid},
                                               {"driver", state["driver"]}};
        // A service grows with its life, if it grows, so only a long one counts.
        if (isCalm(round)) processes["service"] = service;
        mSamples.push_back(footprintOf(processes));
        if (!isCalm(round) || isCalm(round + 1)) return;
        EXPECT_THAT(growthOver({mSamples.end() - kStretch, mSamples.end()}, "service"), IsEmpty());
    }

    void report() const {
        std::printf("%s: %zu requests; killed: service %d, manager %d, users %d; faults %d\n",
                    GetParam(), mRequests, mServiceDeaths, mManagerDeaths, mUserDeaths, mFaults);
        std::fflush(stdout);
    }

    std::vector<std::unique_ptr<User>> mUsers;
    std::vector<Footprint> mSamples;
    const KernelComplaints mKernel;
    std::minstd_rand mChance{static_cast<unsigned>(getpid())};
    std::unique_ptr<Process> mManager;
    pid_t mManagerPid = 0;
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
    mManagerPid = phoneState()["manager"];
    phone.reset();

    const std::span<const Request> table = requestsOf(GetParam());
    for (const uid_t uid : kUsers) mUsers.push_back(std::make_unique<User>(uid, table));
    const auto end = Clock::now() + soakTime(20);
    auto nextReport = Clock::now();
    for (int round = 0; (round < kFewestRounds || Clock::now() < end) && !HasFailure(); ++round) {
        playRound(round);
        if (!HasFatalFailure()) checkRound(phone, table, round);
        if (Clock::now() < nextReport) continue;
        report();
        nextReport = Clock::now() + kReportPeriod;
    }
    mUsers.clear();
    EXPECT_THAT(growthOver(mSamples), IsEmpty());
    report();
}

INSTANTIATE_TEST_SUITE_P(Phones, Soak, testing::Values("leds", "ff"),
                         [](const auto& phone) { return std::string(phone.param); });

}  // namespace
}  // namespace qvx::test
