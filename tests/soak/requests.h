// SPDX-License-Identifier: Apache-2.0
//
// What the users of a soak ask, what they are to be answered, and what the driver is to see of it.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/vendor/quorvan/hardware/vibrator/IZelVibrator.h>

#include "handset/common/raw_binder.h"

namespace qvx::test {

// What came back: the transport's status, and where that is 0 the exception, and where that is 0 the
// value (0 for none, 1 for true).
struct Answer {
    int32_t status = 0;
    int32_t exception = 0;
    int64_t value = 0;

    bool operator==(const Answer&) const = default;
};

constexpr const char* kService = "android.hardware.vibrator.IVibrator/default";
constexpr int32_t kDead = -32;  // the transport's status when the service has died

// A user's way to the service: a client's, and one past the binder library.
class Client {
  public:
    // Finds the service; false while it cannot be found or does not answer. What earlier requests
    // left behind in the binder driver goes with the connection that they were made by.
    bool connect();

    aidl::android::hardware::vibrator::IVibrator& standard() { return *mStandard; }
    aidl::vendor::quorvan::hardware::vibrator::IZelVibrator& extension() { return *mExtension; }

    // Sends bytes of a request's own making to the standard service.
    Answer sendRaw(uint32_t code, const handset::RequestBytes& request);

    // A callback that counts. It is told of each composition that is answered with ok.
    std::shared_ptr<aidl::android::hardware::vibrator::IVibratorCallback> callback();
    int told() const;

  private:
    std::shared_ptr<aidl::android::hardware::vibrator::IVibrator> mStandard;
    std::shared_ptr<aidl::vendor::quorvan::hardware::vibrator::IZelVibrator> mExtension;
    std::shared_ptr<aidl::android::hardware::vibrator::IVibratorCallback> mCallback;
    std::unique_ptr<handset::RawBinder> mRaw;
    std::optional<uint32_t> mRawService;
};

// A kind of request. Each takes a number from 1 to 999, which tells one from another.
struct Request {
    const char* name;
    Answer (*ask)(Client& client, int number);
    Answer answer;             // while the driver is well
    std::string_view journal;  // as inWords() has it, separated by '|'; "{}" stands for the number
    bool isExtension = false;  // from users other than root and system: nothing is done, and ok
    size_t decisive = 99;      // how many of the journal's lines have to succeed for an ok
    bool isTold = false;       // a client that is answered with ok is told of the end
};

// The lines of the journal that the request makes.
std::vector<std::string> journalOf(const Request& request, int number);

// So many of a table's requests, its first, leave the driver alone.
constexpr size_t kQuiet = 12;

// Of a phone with the built-in profile "leds", and of one with "ff".
std::span<const Request> requestsOf(const std::string& profile);

}  // namespace qvx::test
