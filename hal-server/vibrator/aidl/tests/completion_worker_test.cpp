// SPDX-License-Identifier: Apache-2.0
//
// The thread that tells a client that its composition is over: when it calls, what it keeps, and
// what happens where there is no thread to be had.
#include <chrono>
#include <limits>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "standard/CompletionWorker.h"
#include "tests/composition_test.h"
#include "tests/refused_threads.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::RefusedThreads;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;
using Clock = std::chrono::steady_clock;
using Primitive = CompositePrimitive;

constexpr CompletionTexts kCompletionTexts = {"begins", "calls"};

using CompletionWorker = VibratorTest;

TEST_F(CompletionWorker, SleepsAndThenCalls) {
    std::vector<std::string> before;
    const auto completion =
            ndk::SharedRefBase::make<CountingCallback>([&] { before = kernel.calls(); });
    EXPECT_TRUE(startCompletionWorker(kCompletionTexts, 1234, completion));
    ASSERT_TRUE(completion->waitForCall());
    EXPECT_THAT(before, ElementsAre("sleep 1234 ms"));
    EXPECT_EQ(completion->calls(), 1);
    EXPECT_THAT(log.lines(), ElementsAre("I begins", "I calls"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(CompletionWorker, WithoutACallbackSleepsAllTheSame) {
    EXPECT_TRUE(startCompletionWorker(kCompletionTexts, 50, nullptr));
    ASSERT_TRUE(kernel.waitForCalls(1));
    EXPECT_THAT(kernel.calls(), ElementsAre("sleep 50 ms"));
    EXPECT_THAT(log.lines(), ElementsAre("I begins"));
}

TEST_F(CompletionWorker, CallsAtOnceWhenThereIsNothingToSleep) {
    for (const int64_t totalMs : {int64_t{0}, int64_t{-1}, std::numeric_limits<int64_t>::min()}) {
        const auto completion = ndk::SharedRefBase::make<CountingCallback>();
        EXPECT_TRUE(startCompletionWorker(kCompletionTexts, totalMs, completion));
        EXPECT_TRUE(completion->waitForCall());
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(CompletionWorker, SleepsLongerThan32BitsHold) {
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    EXPECT_TRUE(startCompletionWorker(kCompletionTexts, 3276600000, completion));
    EXPECT_TRUE(completion->waitForCall());
    EXPECT_THAT(kernel.calls(), ElementsAre("sleep 3276600000 ms"));
}

TEST_F(CompletionWorker, DoesNotMindACallbackThatFails) {
    for (const binder_exception_t answer : {EX_ILLEGAL_STATE, EX_TRANSACTION_FAILED}) {
        log.clear();
        const auto failing = ndk::SharedRefBase::make<CountingCallback>([] {}, answer);
        EXPECT_TRUE(startCompletionWorker(kCompletionTexts, 1, failing));
        EXPECT_TRUE(failing->waitForCall());
        EXPECT_THAT(log.lines(), ElementsAre("I begins", "I calls"));
    }
}

TEST_F(CompletionWorker, LetsGoOfTheCallbackWhenItEnds) {
    auto completion = ndk::SharedRefBase::make<CountingCallback>();
    const std::weak_ptr<CountingCallback> watch = completion;
    EXPECT_TRUE(startCompletionWorker(kCompletionTexts, 1, completion));
    completion.reset();
    while (!watch.expired()) std::this_thread::yield();
}

TEST_F(CompletionWorker, WithoutAThreadIsRefusedAndThrowsNothing) {
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    {
        const RefusedThreads threads;
        EXPECT_NO_THROW(EXPECT_FALSE(startCompletionWorker(kCompletionTexts, 1, completion)));
    }
    EXPECT_EQ(completion.use_count(), 1);
    EXPECT_EQ(completion->calls(), 0);
    EXPECT_THAT(log.lines(), IsEmpty());
}

// A hardware layer that plays every waveform.
class PlaysAnything : public HwApi {
  public:
    bool setAndTriggerOwt_primitve(std::string /*text*/) override { return true; }
};

TEST_F(CompletionWorker, CompositionThatFindsNoThreadIsAnIllegalState) {
    const auto vibrator = ndk::SharedRefBase::make<Vibrator>(std::make_shared<PlaysAnything>());
    useForceFeedback = true;
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    {
        const RefusedThreads threads;
        EXPECT_EQ(exceptionOf(vibrator->compose({after(0, Primitive::CLICK)}, completion)),
                  EX_ILLEGAL_STATE);
    }
    EXPECT_THAT(log.lines(), Contains("E V_2_0: compose setAndTriggerOwt_Primitive pass"));
    EXPECT_EQ(completion.use_count(), 1);
}

using CompositionAtTheThreadLimit = ForceFeedbackTest;

TEST_F(CompositionAtTheThreadLimit, LeavesTheMotorStillAndTheNextOnePlays) {
    const auto vibrator = makeVibrator();
    const auto completion = ndk::SharedRefBase::make<CountingCallback>();
    kernel.clear();
    {
        const RefusedThreads threads;
        EXPECT_EQ(exceptionOf(vibrator->compose({after(0, Primitive::CLICK)}, completion)),
                  EX_ILLEGAL_STATE);
    }
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", StartsWith("upload id=-1 "),
                            "event type=21 code=0 value=1", "event type=21 code=0 value=0"));
    EXPECT_TRUE(vibrator->compose({after(0, Primitive::CLICK)}, completion).isOk());
    EXPECT_TRUE(completion->waitForCall());
}

// A service that offers a size for piecewise-linear compositions.
class OfferingPwle : public Vibrator {
  public:
    using Vibrator::Vibrator;
    ndk::ScopedAStatus getPwleCompositionSizeMax(int32_t* _aidl_return) override {
        *_aidl_return = 1;
        return ndk::ScopedAStatus::ok();
    }
};

TEST_F(CompletionWorker, PwleCompositionThatFindsNoThreadIsAnIllegalState) {
    const auto vibrator = ndk::SharedRefBase::make<OfferingPwle>(makeHwApi());
    log.clear();
    const RefusedThreads threads;
    EXPECT_EQ(exceptionOf(vibrator->composePwle({BrakingPwle()}, callback)), EX_ILLEGAL_STATE);
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_EQ(callback.use_count(), 1);
}

// Lets real time pass, for a fake kernel skips every sleep: there is one only while the
// hardware layer looks for its nodes.
class PendingNotification : public ::testing::Test {
  protected:
    PendingNotification() {
        useKypIndex = false;
        inputFD = -1;
        {
            const fake::FakeKernel kernel;
            hwApi = std::make_shared<PlaysAnything>();
        }
        useForceFeedback = true;
        vibrator = ndk::SharedRefBase::make<Vibrator>(hwApi);
    }

    const LogCapture log;
    std::shared_ptr<PlaysAnything> hwApi;
    std::shared_ptr<Vibrator> vibrator;
};

TEST_F(PendingNotification, OutlivesTheServiceAndTheHardwareLayer) {
    const std::weak_ptr<Vibrator> service = vibrator;
    const std::weak_ptr<HwApi> hardware = hwApi;
    const auto completion = ndk::SharedRefBase::make<CountingCallback>([&] {
        EXPECT_TRUE(service.expired());
        EXPECT_TRUE(hardware.expired());
    });
    const auto start = Clock::now();
    // 200 ms for the pause, 20 ms for the click.
    ASSERT_TRUE(vibrator->compose({after(200, Primitive::CLICK)}, completion).isOk());
    vibrator.reset();
    hwApi.reset();
    ASSERT_TRUE(completion->waitForCall());
    EXPECT_GE(Clock::now() - start, std::chrono::milliseconds(220));
    EXPECT_TRUE(log.waitFor("I Notifying compose complete"));
}

TEST_F(PendingNotification, OfEachOfTenOverlappingCompositionsComesOnce) {
    std::vector<std::shared_ptr<CountingCallback>> completions;
    for (int i = 0; i < 10; ++i) {
        completions.push_back(ndk::SharedRefBase::make<CountingCallback>());
        // The later ones are over sooner.
        ASSERT_TRUE(vibrator->compose({after(100 - 10 * i, Primitive::CLICK)}, completions.back())
                            .isOk());
    }
    for (const auto& completion : completions) {
        EXPECT_TRUE(completion->waitForCall());
        while (completion.use_count() != 1) std::this_thread::yield();  // its worker has ended
        EXPECT_EQ(completion->calls(), 1);
    }
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
