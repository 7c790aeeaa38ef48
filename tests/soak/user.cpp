// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/user.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <time.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <new>
#include <random>
#include <thread>

#include <android/binder_process.h>

namespace qvx::test {
namespace {

constexpr std::chrono::milliseconds kPause{3};
constexpr unsigned kQuietOnes = 15;  // for one of any kind
constexpr std::chrono::seconds kLongestComposition{2};

}  // namespace

int64_t monotonicUs() {
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return int64_t{now.tv_sec} * 1000000 + now.tv_nsec / 1000;
}

std::chrono::seconds soakTime(long otherwise) {
    const char* const given = getenv("SOAK_SECONDS");
    return std::chrono::seconds(given == nullptr ? otherwise : atol(given));
}

void User::Unmap::operator()(Log* log) const {
    munmap(log, sizeof(Log));
}

User::User(uid_t uid, std::span<const Request> table)
    : mUid(uid),
      mTable(table),
      mLog(new (mmap(nullptr, sizeof(Log), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1,
                     0)) Log) {
    start();
}

void User::start() {
    mProcess.emplace(mUid, [this] { live(); });
}

void User::begin() {
    for (Asked& asked : mLog->asked) asked.end = 0;
    mLog->untold = 0;
    mLog->count = 0;
}

bool User::isDone() const {
    return mLog->count == kPerRound && mLog->asked.back().end != 0 && mLog->untold >= 0;
}

void User::replace() {
    mProcess->kill();
    const size_t count = mLog->count;
    if (count > 0 && mLog->asked[count - 1].end == 0) mLog->asked[count - 1].end = Asked::kNever;
    if (mLog->untold < 0) mLog->untold = 0;
    start();
}

// In the user's process, for ever.
void User::live() const {
    // The library says on standard error what becomes of its calls, and much becomes of them here.
    const int null = open("/dev/null", O_WRONLY | O_CLOEXEC);
    dup2(null, STDERR_FILENO);
    ABinderProcess_startThreadPool();
    Client client;
    while (!client.connect()) std::this_thread::sleep_for(kPause);
    int expected = client.told();
    for (;;) {
        if (mLog->count == kPerRound) {
            std::this_thread::sleep_for(kPause);
            continue;
        }
        askNext(client, &expected);
        if (mLog->count < kPerRound) continue;
        const auto end = std::chrono::steady_clock::now() + kLongestComposition;
        while (client.told() < expected && std::chrono::steady_clock::now() < end) {
            std::this_thread::sleep_for(kPause);
        }
        mLog->untold = expected - client.told();
        expected = client.told();
    }
}

void User::askNext(Client& client, int* expected) const {
    static std::minstd_rand chance(static_cast<unsigned>(monotonicUs()));
    const size_t slot = mLog->count;
    Asked& asked = mLog->asked[slot];
    // On a phone, too, most of what is asked is answered without the driver.
    const bool isQuiet = chance() % (kQuietOnes + 1) != 0;
    asked.request = chance() % (isQuiet ? kQuiet : mTable.size());
    asked.number = 1 + static_cast<int>(chance() % 999);
    asked.begin = monotonicUs();
    const Request& request = mTable[asked.request];
    if (slot + 1 == kPerRound) mLog->untold = -1;  // known once the last request is answered
    mLog->count = slot + 1;
    asked.answer = request.ask(client, asked.number);
    asked.end = monotonicUs();
    if (asked.answer == Answer{} && request.isTold) ++*expected;
    if (asked.answer.status != kDead) return;
    // What a service that died had begun, nobody tells of any more.
    while (!client.connect()) std::this_thread::sleep_for(kPause);
    *expected = client.told();
}

}  // namespace qvx::test
