// SPDX-License-Identifier: Apache-2.0
//
// The list of input devices, as /proc/bus/input/devices shows it on this phone.
#pragma once

#include <mutex>
#include <string>

#include <android-base/result.h>
#include <android-base/thread_annotations.h>

#include "handset/driver/private_mounts.h"
#include "handset/driver/profile.h"

namespace handset {

inline constexpr const char* kInputDevices = "/proc/bus/input/devices";

// The list's text: a keyboard, then the motor where the profile has one and it is `plugged` in, each
// in the kernel's own layout; or the profile's own text with "{event}" filled in. `event` is the
// number of the motor's /dev/input/eventN.
std::string inputDevicesText(const Profile& profile, unsigned event, bool plugged = true);

// The list where clients look for it. All operations may be called from any thread.
class InputDeviceList {
  public:
    // The references outlive the list.
    InputDeviceList(const Profile& profile, unsigned event, StagingDirectory& staging)
        : mProfile(profile), mEvent(event), mStaging(staging) {}

    // Shows the list with the motor.
    android::base::Result<void> show();

    // Takes the motor's block out, or brings it back, in one step for whoever reads.
    android::base::Result<void> setPlugged(bool plugged);

  private:
    android::base::Result<void> bind(bool plugged) REQUIRES(mMutex);

    const Profile& mProfile;
    const unsigned mEvent;
    std::mutex mMutex;
    StagingDirectory& mStaging GUARDED_BY(mMutex);
    bool mPlugged GUARDED_BY(mMutex) = true;
};

}  // namespace handset
