// SPDX-License-Identifier: Apache-2.0
//
// Phones, one for each way in which the service plays, and which calls may go wrong there with the
// request ok all the same.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "Vibrator.h"
#include "Vibrator_vendor.h"
#include "tests/calling_uid.h"
#include "tests/service_test.h"
#include "tests/support/all_requests.h"

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

    qvx::test::Services services;

  private:
    void TestBody() override {}

    const CallingUid mSystem{1000};
    const ptrdiff_t mThreads;  // of the process, without those that requests start
};

// How a call goes wrong: with an errno, with fewer bytes than there are, or with a count that is not
// true.
enum Way : unsigned { kFails = 1, kIsShort = 2, kLies = 4 };

// Why the request may be ok although the call at `position` of its clean run went wrong; null: it may
// not.
const char* allowedBecause(const char* request, const std::vector<std::string>& calls,
                           size_t position, Way way);

}  // namespace faults
