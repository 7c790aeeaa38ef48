// SPDX-License-Identifier: Apache-2.0
//
// Phones, one for each way in which the service plays, and a request for each method of both
// interfaces.
#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "Vibrator.h"
#include "Vibrator_vendor.h"
#include "tests/calling_uid.h"
#include "tests/service_test.h"

namespace faults {

enum class PhoneClass { kLegacy, kLeds, kLedsPackets, kLedsAmplitude, kForceFeedback, kNone };

inline constexpr PhoneClass kPhoneClasses[] = {
        PhoneClass::kLegacy,        PhoneClass::kLeds,          PhoneClass::kLedsPackets,
        PhoneClass::kLedsAmplitude, PhoneClass::kForceFeedback, PhoneClass::kNone,
};

std::string nameOf(PhoneClass phoneClass);

// A phone of a class with its nodes, on which the services are built with build().
class Phone : public ServiceTest {
  public:
    explicit Phone(PhoneClass phoneClass);
    ~Phone() override;

    // Builds the hardware layer and the services.
    void build();

    // Waits until the threads that a request started have done their last call.
    void settle();

    using ServiceTest::kernel;
    using ServiceTest::log;

    std::shared_ptr<aidl::android::hardware::vibrator::Vibrator> standard;
    std::shared_ptr<aidl::vendor::quorvan::hardware::vibrator::Vibrator> extension;

  private:
    void TestBody() override {}

    const CallingUid mSystem{1000};
    const ptrdiff_t mThreads;  // of the process, without those that requests start
};

struct Answer {
    binder_exception_t exception;
    std::string result;  // the out-value; empty where there is none

    bool operator==(const Answer& other) const {
        return exception == other.exception && result == other.result;
    }
};

struct Request {
    const char* name;
    std::function<Answer(Phone&)> ask;
};

// How a call goes wrong: with an errno, with fewer bytes than there are, or with a count that is not
// true.
enum Way : unsigned { kFails = 1, kIsShort = 2, kLies = 4 };

// Why the request may be ok although the call at `position` of its clean run went wrong; null: it may
// not.
const char* allowedBecause(const char* request, const std::vector<std::string>& calls,
                           size_t position, Way way);

const std::vector<Request>& requests();

}  // namespace faults
