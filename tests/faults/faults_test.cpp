// SPDX-License-Identifier: Apache-2.0
//
// Every call that a request makes to the kernel fails or takes long in turn, in every way that a driver
// knows, on every kind of phone; then the same request is made once more. Under the address sanitizer, which
// also tells of lost memory, it is the same program.
#include <linux/input.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <iterator>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "driver/ForceFeedbackEffect.h"
#include "tests/faults/phones.h"
#include "tests/refused_threads.h"

namespace faults {
namespace {

using aidl::android::hardware::vibrator::forceFeedbackEffect;
using aidl::android::hardware::vibrator::useForceFeedback;
using fake::Fault;
using fake::Operation;
using qvx::test::Answer;
using qvx::test::Request;
using Calls = std::vector<std::string>;

// What a driver may answer instead of doing as it is asked.
const std::map<Operation, std::vector<int>> kErrors = {
        {Operation::kOpen, {ENOENT, EACCES, EPERM, EMFILE, ENODEV, ENXIO, EBUSY, ENOMEM, EIO}},
        {Operation::kRead, {EIO, ENODEV, EINVAL, EAGAIN, ENOMEM, EBUSY}},
        {Operation::kWrite, {EIO, ENODEV, EINVAL, EAGAIN, ENOMEM, EBUSY, EPERM, ENOSPC}},
        {Operation::kIoctl, {EIO, ENODEV, EINVAL, ENOMEM, EBUSY, EACCES, ENOSPC}},
};
constexpr char kMotor[] = "/dev/input/event7";

bool startsWith(std::string_view text, std::string_view beginning) {
    return text.substr(0, beginning.size()) == beginning;
}

// A call of a record, as a fault names it.
struct Call {
    std::string path;
    Operation operation;
    size_t size;  // bytes that were transferred
};

// The bytes between the quotes at the end of a record.
size_t quotedSize(const std::string& record) {
    const size_t begin = record.find('"');
    if (begin == std::string::npos) return 0;
    size_t size = 0;
    for (size_t i = begin + 1; i + 1 < record.size(); ++i, ++size) {
        if (record[i] == '\\') i += record[i + 1] == 'x' ? 3 : 1;
    }
    return size;
}

// Empty for what cannot fail, or does not matter: close and sleep.
std::optional<Call> callOf(const std::string& record) {
    const std::string word = record.substr(0, record.find(' '));
    const size_t path = word.size() + 1;
    const auto named = [&](Operation operation) {
        return Call{record.substr(path, record.find(' ', path) - path), operation,
                    quotedSize(record)};
    };
    if (word == "open" || word == "fopen") return named(Operation::kOpen);
    if (word == "read") return named(Operation::kRead);
    if (word == "write") return named(Operation::kWrite);
    if (word == "event") return Call{kMotor, Operation::kWrite, sizeof(input_event)};
    if (word == "upload" || word == "erase") return Call{kMotor, Operation::kIoctl, 0};
    return std::nullopt;
}

// The ways in which the call at `position` of a clean run can fail.
std::vector<Fault> faultsOf(const Calls& clean, size_t position) {
    const std::optional<Call> call = callOf(clean[position]);
    if (!call) return {};
    Fault fault = {.path = call->path, .operation = call->operation};
    for (size_t i = 0; i < position; ++i) {
        const std::optional<Call> earlier = callOf(clean[i]);
        if (earlier && earlier->path == call->path && earlier->operation == call->operation) {
            ++fault.after;
        }
    }
    std::vector<Fault> faults;
    const auto add = [&](auto member, auto value, int times = 1) {
        Fault added = fault;
        added.*member = value;
        added.times = times;
        faults.push_back(added);
    };
    for (const int error : kErrors.at(call->operation)) add(&Fault::error, error);
    add(&Fault::error, EINTR, 1);
    add(&Fault::error, EINTR, 100);
    add(&Fault::delay, std::chrono::milliseconds(1));
    const bool transfers =
            call->operation == Operation::kRead || call->operation == Operation::kWrite;
    if (transfers && call->path != kMotor && call->size > 0) {
        add(&Fault::limit, size_t{0});
        if (call->size > 1) add(&Fault::limit, call->size - 1);
    }
    if (startsWith(clean[position], "event ")) {
        add(&Fault::result, ssize_t{0});
        add(&Fault::result, static_cast<ssize_t>(sizeof(input_event) - 1));
    }
    return faults;
}

// Whether the request is to go on as if nothing had happened: a call that is interrupted is made again,
// and one that takes long is waited for.
bool changesNothing(const Fault& fault) {
    return fault.error == EINTR || fault.delay.count() != 0;
}

Way wayOf(const Fault& fault) {
    return fault.error != 0 ? kFails : fault.limit ? kIsShort : kLies;
}

std::string describe(const Fault& fault) {
    if (fault.delay.count() != 0) return "delayed";
    if (fault.error == 0) return wayOf(fault) == kIsShort ? "short" : "with a false count";
    return "errno " + std::to_string(fault.error) + " x " + std::to_string(fault.times);
}

// The calls without those that were only interrupted.
Calls withoutInterrupted(Calls calls) {
    calls.erase(std::remove_if(calls.begin(), calls.end(),
                               [](const std::string& call) {
                                   return call.find(" = EINTR") != std::string::npos;
                               }),
                calls.end());
    return calls;
}

// The calls without those that depend on what the motor's descriptor already holds.
Calls withoutMotorState(Calls calls) {
    calls.erase(std::remove_if(calls.begin(), calls.end(),
                               [](const std::string& call) {
                                   return startsWith(call, "erase ") ||
                                          startsWith(call, "open /dev/input/");
                               }),
                calls.end());
    return calls;
}

bool isRecordWhole() {
    const ff_effect& record = forceFeedbackEffect.record;
    return !useForceFeedback ||
           (record.type == FF_PERIODIC && record.direction == 0 && record.replay.delay == 0 &&
            record.u.periodic.waveform == FF_CUSTOM && record.u.periodic.custom_len == 2 &&
            record.u.periodic.custom_data == forceFeedbackEffect.indexPair);
}

// One request on one kind of phone, from its clean run to the one after a fault.
class Case {
  public:
    Case(PhoneClass phoneClass, const Request& request, bool warm)
        : mClass(phoneClass), mRequest(request), mWarm(warm) {
        Phone phone(mClass);
        prepare(phone);
        mAnswer = ask(phone);
        mCalls = phone.kernel.calls();
    }

    // Tries every fault; adds to the points tried and, by the reason, to those answered ok.
    void run(int& points, std::map<std::string, int>& answeredOk) const {
        for (size_t i = 0; i < mCalls.size(); ++i) {
            for (const Fault& fault : faultsOf(mCalls, i)) {
                ++points;
                SCOPED_TRACE(nameOf(mClass) + ", " + mRequest.name + ", call " + mCalls[i] + ", " +
                             describe(fault));
                Phone phone(mClass);
                prepare(phone);
                phone.kernel.addFault(fault);
                if (!endure(phone, changesNothing(fault))) continue;
                const char* const reason = allowedBecause(mRequest.name, mCalls, i, wayOf(fault));
                EXPECT_NE(reason, nullptr) << "ok in spite of the fault";
                if (reason != nullptr) ++answeredOk[reason];
            }
        }
        runWithoutThreads(points);
    }

  private:
    void prepare(Phone& phone) const {
        phone.build();
        if (mWarm) ask(phone);
        phone.kernel.clear();
    }

    Answer ask(Phone& phone) const {
        Answer answer = mRequest.ask(phone.services);
        phone.settle();
        return answer;
    }

    // Whether a request that met a fault was answered ok. A fault that changes nothing leaves the
    // answer and the calls as they are in a clean run.
    bool endure(Phone& phone, bool changesNothing) const {
        const size_t open = phone.kernel.openDescriptors();
        const bool motorWasOpen = aidl::android::hardware::vibrator::inputFD >= 0;
        const Answer answer = ask(phone);
        const bool motorIsOpen = aidl::android::hardware::vibrator::inputFD >= 0;
        EXPECT_EQ(phone.kernel.openDescriptors(), open + (motorIsOpen && !motorWasOpen ? 1 : 0));
        EXPECT_TRUE(isRecordWhole());
        if (changesNothing) {
            EXPECT_TRUE(answer == mAnswer);
            EXPECT_EQ(withoutInterrupted(phone.kernel.calls()), mCalls);
            return false;
        }
        const bool ok = mAnswer.exception == EX_NONE && answer.exception == EX_NONE;
        expectCleanRequest(phone);
        return ok;
    }

    void expectCleanRequest(Phone& phone) const {
        phone.kernel.clear();
        const Answer answer = ask(phone);
        EXPECT_TRUE(answer == mAnswer) << answer.exception << " " << answer.result;
        EXPECT_EQ(withoutMotorState(phone.kernel.calls()), withoutMotorState(mCalls));
    }

    void runWithoutThreads(int& points) const {
        Phone phone(mClass);
        prepare(phone);
        {
            const fake::RefusedThreads threads;
            const Answer answer = ask(phone);
            if (threads.count() == 0) return;
            SCOPED_TRACE(nameOf(mClass) + ", " + mRequest.name + ", without threads");
            ++points;
            EXPECT_EQ(answer.exception, EX_ILLEGAL_STATE);
            EXPECT_TRUE(isRecordWhole());
        }
        expectCleanRequest(phone);
    }

    const PhoneClass mClass;
    const Request& mRequest;
    const bool mWarm;
    Answer mAnswer;
    Calls mCalls;
};

class Faults : public testing::TestWithParam<PhoneClass> {};

TEST_P(Faults, OfEveryCallOfEveryRequestAreEnduredAndTheNextRequestIsClean) {
    int points = 0;
    for (const Request& request : qvx::test::allRequests()) {
        std::map<std::string, int> answeredOk;
        // The first request of a process opens the motor; the others find it open.
        for (const bool warm : {false, true}) {
            if (warm && GetParam() != PhoneClass::kForceFeedback) continue;
            Case(GetParam(), request, warm).run(points, answeredOk);
        }
        for (const auto& [reason, times] : answeredOk) {
            std::printf("%-15s %-42s ok %5d times: %s\n", nameOf(GetParam()).c_str(), request.name,
                        times, reason.c_str());
        }
    }
    std::printf("%-15s %d points\n", nameOf(GetParam()).c_str(), points);
    EXPECT_GT(points, GetParam() == PhoneClass::kNone ? 100 : 500);
}

TEST_P(Faults, OfEveryCallAtStartUpLeaveAServiceThatRunsAndNoDescriptorLost) {
    Calls clean;
    {
        Phone phone(GetParam());
        phone.build();
        clean = phone.kernel.calls();
    }
    int points = 0;
    for (size_t i = 0; i < clean.size(); ++i) {
        for (const Fault& fault : faultsOf(clean, i)) {
            ++points;
            SCOPED_TRACE(nameOf(GetParam()) + ", start, call " + clean[i] + ", " + describe(fault));
            Phone phone(GetParam());
            phone.kernel.addFault(fault);
            phone.build();
            EXPECT_TRUE(isRecordWhole());
            EXPECT_LE(phone.kernel.openDescriptors(), 6U);  // the streams
            if (changesNothing(fault) && !startsWith(clean[i], "fopen ")) {
                EXPECT_EQ(withoutInterrupted(phone.kernel.calls()), clean);
            }
        }
    }
    std::printf("%-15s %d points at start-up\n", nameOf(GetParam()).c_str(), points);
    EXPECT_GT(points, 50);
}

INSTANTIATE_TEST_SUITE_P(Phones, Faults, testing::ValuesIn(kPhoneClasses), [](const auto& tested) {
    std::string name = nameOf(tested.param);
    name.erase(std::remove(name.begin(), name.end(), '-'), name.end());
    return name;
});

}  // namespace
}  // namespace faults
