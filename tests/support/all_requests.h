// SPDX-License-Identifier: Apache-2.0
//
// A request for each method of both interfaces, and for each way in which a method plays.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/vendor/quorvan/hardware/vibrator/IZelVibrator.h>

namespace qvx::test {

// What requests go to: the service's own objects, or those of a client.
struct Services {
    std::shared_ptr<aidl::android::hardware::vibrator::IVibrator> standard;
    std::shared_ptr<aidl::vendor::quorvan::hardware::vibrator::IZelVibrator> extension;
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
    std::function<Answer(const Services&)> ask;
};

const std::vector<Request>& allRequests();

}  // namespace qvx::test
