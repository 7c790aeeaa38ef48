// SPDX-License-Identifier: Apache-2.0
//
// What the service answers about primitives: the limits of a composition, which primitives there
// are, their lengths and their entries in the driver's wavetable.
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "tests/composition_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Primitive = CompositePrimitive;

constexpr int kNoPrimitives[] = {9, -1, kIntMin, kIntMax};

using CompositionLimits = VibratorTest;

TEST_F(CompositionLimits, AreOneSecondAndTenEffects) {
    const auto vibrator = makeVibrator();
    int32_t delayMax = 0;
    EXPECT_TRUE(vibrator->getCompositionDelayMax(&delayMax).isOk());
    EXPECT_EQ(delayMax, 1000);
    int32_t sizeMax = 0;
    EXPECT_TRUE(vibrator->getCompositionSizeMax(&sizeMax).isOk());
    EXPECT_EQ(sizeMax, 10);
    EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: Vibrator getCompositionDelayMax ",
                                         "E V_2_0: Vibrator getCompositionSizeMax "));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

using SupportedPrimitives = VibratorTest;

TEST_F(SupportedPrimitives, AreAllNineWithTheFeature) {
    kernel.addNode(kFunctions, "INTENSITY\nPRIMITIVE_EFFECT_COMPOSE\n");
    const auto vibrator = makeVibrator();
    std::vector<Primitive> primitives = {Primitive::SPIN};
    EXPECT_TRUE(vibrator->getSupportedPrimitives(&primitives).isOk());
    EXPECT_THAT(primitives, ElementsAre(static_cast<Primitive>(0), static_cast<Primitive>(1),
                                        static_cast<Primitive>(2), static_cast<Primitive>(3),
                                        static_cast<Primitive>(4), static_cast<Primitive>(5),
                                        static_cast<Primitive>(6), static_cast<Primitive>(7),
                                        static_cast<Primitive>(8)));
    EXPECT_EQ(log.lines().front(), "E V_2_0: Vibrator getSupportedPrimitives ");
}

TEST_F(SupportedPrimitives, AreNoneWithoutTheFeature) {
    kernel.addNode(kFunctions, "INTENSITY\nCAPABILITY_EXTERNAL_CONTROL\n");
    const auto vibrator = makeVibrator();
    std::vector<Primitive> primitives = {Primitive::SPIN};
    EXPECT_TRUE(vibrator->getSupportedPrimitives(&primitives).isOk());
    EXPECT_THAT(primitives, IsEmpty());
}

TEST_F(SupportedPrimitives, AreNoneWhereTheFeatureListCannotBeRead) {
    const auto vibrator = makeVibrator();
    std::vector<Primitive> primitives = {Primitive::SPIN};
    EXPECT_TRUE(vibrator->getSupportedPrimitives(&primitives).isOk());
    EXPECT_THAT(primitives, IsEmpty());
}

// A primitive as clients and drivers know it.
struct PrimitiveRow {
    int number;
    int32_t durationMs;
    uint32_t index;
    uint32_t kypIndex;  // in the platform's numbering
};

constexpr PrimitiveRow kPrimitives[] = {
        {1, 20, 1, 10},      // CLICK
        {2, 300, 124, 140},  // THUD
        {3, 130, 123, 139},  // SPIN
        {4, 150, 121, 137},  // QUICK_RISE
        {5, 500, 122, 138},  // SLOW_RISE
        {6, 100, 120, 136},  // QUICK_FALL
        {7, 20, 41, 50},     // LIGHT_TICK
        {8, 20, 119, 135},   // LOW_TICK
};

using PrimitiveDuration = VibratorTest;

TEST_F(PrimitiveDuration, IsFixedWithAndWithoutTheFeature) {
    for (const bool hasFeature : {false, true}) {
        if (hasFeature) kernel.addNode(kFunctions, "PRIMITIVE_EFFECT_COMPOSE\n");
        const auto vibrator = makeVibrator();
        int32_t durationMs = -1;
        EXPECT_TRUE(vibrator->getPrimitiveDuration(Primitive::NOOP, &durationMs).isOk());
        EXPECT_EQ(durationMs, 0);
        for (const PrimitiveRow& row : kPrimitives) {
            EXPECT_TRUE(
                    vibrator->getPrimitiveDuration(static_cast<Primitive>(row.number), &durationMs)
                            .isOk());
            EXPECT_EQ(durationMs, row.durationMs) << row.number;
        }
        EXPECT_EQ(log.lines().size(), 9U);
        EXPECT_THAT(log.lines(), Each("E V_2_0: Vibrator getPrimitiveDuration "));
        EXPECT_THAT(kernel.calls(), IsEmpty());
    }
}

TEST_F(PrimitiveDuration, OfAnotherNumberIsNotOffered) {
    const auto vibrator = makeVibrator();
    for (const int number : kNoPrimitives) {
        int32_t durationMs = 77;
        EXPECT_EQ(exceptionOf(vibrator->getPrimitiveDuration(static_cast<Primitive>(number),
                                                             &durationMs)),
                  EX_UNSUPPORTED_OPERATION)
                << number;
        EXPECT_EQ(durationMs, 77);
    }
    EXPECT_THAT(log.lines(), Each("E V_2_0: Vibrator getPrimitiveDuration "));
}

// The wavetable entry depends on two flags of the process.
class PrimitiveDetails : public VibratorTest {
  protected:
    struct Flags {
        bool kypIndex;
        bool forceFeedback;
    };

    static void set(const Flags& flags) {
        useKypIndex = flags.kypIndex;
        useForceFeedback = flags.forceFeedback;
    }

    static constexpr Flags kPlainNumbering[] = {{false, false}, {false, true}, {true, false}};
    static constexpr Flags kPlatformNumbering = {true, true};

    const std::shared_ptr<Vibrator> vibrator = makeVibrator();
};

TEST_F(PrimitiveDetails, AreThePlainEntriesUnlessBothFlagsAreSet) {
    for (const Flags& flags : kPlainNumbering) {
        set(flags);
        for (const PrimitiveRow& row : kPrimitives) {
            uint32_t index = 0;
            EXPECT_TRUE(vibrator->getPrimitiveDetails(static_cast<Primitive>(row.number), &index)
                                .isOk());
            EXPECT_EQ(index, row.index) << row.number;
        }
    }
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(PrimitiveDetails, AreMappedWithBothFlags) {
    set(kPlatformNumbering);
    for (const PrimitiveRow& row : kPrimitives) {
        uint32_t index = 0;
        EXPECT_TRUE(
                vibrator->getPrimitiveDetails(static_cast<Primitive>(row.number), &index).isOk());
        EXPECT_EQ(index, row.kypIndex) << row.number;
    }
    EXPECT_EQ(log.lines().size(), 8U);
    EXPECT_THAT(log.lines(), Each("E V_2_0: [getPrimitiveDetails]kyp index transform"));
}

TEST_F(PrimitiveDetails, NoopHasNone) {
    for (const Flags& flags : {kPlainNumbering[0], kPlatformNumbering}) {
        set(flags);
        uint32_t index = 77;
        EXPECT_EQ(exceptionOf(vibrator->getPrimitiveDetails(Primitive::NOOP, &index)),
                  EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(index, 77U);
    }
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(PrimitiveDetails, OfAnotherNumberAreNotOfferedNegativeOnesIncluded) {
    for (const Flags& flags : {kPlainNumbering[0], kPlatformNumbering}) {
        set(flags);
        for (const int number : kNoPrimitives) {
            uint32_t index = 77;
            EXPECT_EQ(exceptionOf(vibrator->getPrimitiveDetails(static_cast<Primitive>(number),
                                                                &index)),
                      EX_UNSUPPORTED_OPERATION)
                    << number;
            EXPECT_EQ(index, 77U);
        }
    }
    EXPECT_THAT(log.lines(), IsEmpty());
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
