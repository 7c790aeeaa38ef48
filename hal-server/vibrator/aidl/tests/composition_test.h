// SPDX-License-Identifier: Apache-2.0
//
// What the tests of compositions share: short ways to write one down and to look at the log, a
// client's callback that can be waited for, and a phone whose motor is a force-feedback device.
#pragma once

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "tests/fake_motor.h"
#include "tests/vibrator_test.h"

namespace aidl::android::hardware::vibrator {

using Composite = std::vector<CompositeEffect>;

inline CompositeEffect after(int32_t delayMs, CompositePrimitive primitive, float scale = 1.0F) {
    CompositeEffect effect;
    effect.delayMs = delayMs;
    effect.primitive = primitive;
    effect.scale = scale;
    return effect;
}

using Lines = std::vector<std::string>;

// The records that follow a record.
inline Lines linesAfter(const Lines& lines, const std::string& line) {
    const auto found = std::find(lines.begin(), lines.end(), line);
    return found == lines.end() ? Lines{line + " is missing"} : Lines(found + 1, lines.end());
}

// Counts its calls. `action` runs in each of them, on the thread that calls; `answer` is the
// exception it answers with.
class CountingCallback : public BnVibratorCallback {
  public:
    explicit CountingCallback(
            std::function<void()> action = [] {}, binder_exception_t answer = EX_NONE)
        : mAction(std::move(action)), mAnswer(answer) {}

    ndk::ScopedAStatus onComplete() override {
        mAction();
        const std::lock_guard lock(mMutex);
        ++mCalls;
        mCalled.notify_all();
        return ndk::ScopedAStatus::fromExceptionCode(mAnswer);
    }

    int calls() const {
        const std::lock_guard lock(mMutex);
        return mCalls;
    }

    // Waits, in real time, for the first call; false after ten seconds.
    bool waitForCall() const {
        std::unique_lock lock(mMutex);
        return mCalled.wait_for(lock, std::chrono::seconds(10), [this] { return mCalls != 0; });
    }

  private:
    const std::function<void()> mAction;
    const binder_exception_t mAnswer;
    mutable std::mutex mMutex;
    mutable std::condition_variable mCalled;
    int mCalls = 0;
};

// A phone without a sysfs motor, whose driver keeps the plain numbering of its wavetable.
class ForceFeedbackTest : public ServiceTest {
  protected:
    ForceFeedbackTest() {
        kernel.addNode("/proc/bus/input/devices",
                       "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n\n");
        kernel.addDevice(kMotor, std::make_shared<fake::FakeMotor>());
    }

    // To be called before makeVibrator(): the driver lets itself be switched to the platform's
    // numbering.
    void addKypIndexSwitch() { kernel.addNode("/sys/class/qvx_vib_inputff/control/use_kyp_index"); }

    std::shared_ptr<Vibrator> makeVibrator() {
        auto vibrator = ndk::SharedRefBase::make<Vibrator>(makeHwApi());
        log.clear();
        return vibrator;
    }

    static inline const std::string kMotor = "/dev/input/event7";
};

}  // namespace aidl::android::hardware::vibrator
