// SPDX-License-Identifier: Apache-2.0
//
// The input core's rules for effects.
#include "handset/driver/effect_slots.h"

#include <cerrno>

#include <gtest/gtest.h>

namespace handset {
namespace {

constexpr EffectSlots::Owner kOne = 1;
constexpr EffectSlots::Owner kOther = 2;

ff_effect custom(int id) {
    ff_effect effect{};
    effect.type = FF_PERIODIC;
    effect.id = static_cast<int16_t>(id);
    effect.u.periodic.waveform = FF_CUSTOM;
    return effect;
}

ff_effect rumble(int id) {
    ff_effect effect{};
    effect.type = FF_RUMBLE;
    effect.id = static_cast<int16_t>(id);
    effect.u.rumble.strong_magnitude = 0xffff;
    effect.u.rumble.weak_magnitude = 0x6000;
    return effect;
}

TEST(EffectSlots, NewEffectsGetTheLowestFreeId) {
    EffectSlots slots(16);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.upload(kOther, custom(-1)), 1);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 2);
    EXPECT_EQ(slots.erase(kOther, 1), 0);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 1);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 3);
}

TEST(EffectSlots, AFullMotorRefusesOneMore) {
    EffectSlots slots(16);
    for (int id = 0; id < 16; ++id) EXPECT_EQ(slots.upload(kOne, custom(-1)), id);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), -ENOSPC);
    EXPECT_EQ(slots.upload(kOne, custom(7)), 7);
    EXPECT_EQ(slots.erase(kOne, 7), 0);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 7);
}

TEST(EffectSlots, AnUpdateNeedsAnEffectOfOnesOwn) {
    EffectSlots slots(4);
    EXPECT_EQ(slots.upload(kOne, custom(0)), -EINVAL);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.upload(kOne, custom(0)), 0);
    EXPECT_EQ(slots.upload(kOther, custom(0)), -EACCES);
    EXPECT_EQ(slots.upload(kOne, custom(1)), -EINVAL);
    EXPECT_EQ(slots.upload(kOne, custom(4)), -EINVAL);
    EXPECT_EQ(slots.upload(kOne, custom(-2)), -EINVAL);
}

TEST(EffectSlots, AnUpdateKeepsTheKind) {
    EffectSlots slots(4);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.upload(kOne, rumble(0)), -EINVAL);
    EXPECT_EQ(slots.upload(kOne, rumble(-1)), 1);
    EXPECT_EQ(slots.upload(kOne, rumble(1)), 1);
    EXPECT_EQ(slots.upload(kOne, custom(1)), -EINVAL);
}

TEST(EffectSlots, OnlyTheMotorsKindsAreTaken) {
    EffectSlots slots(4);
    ff_effect effect = custom(-1);
    effect.u.periodic.waveform = FF_SINE;
    EXPECT_EQ(slots.upload(kOne, effect), -EINVAL);
    effect.u.periodic.waveform = 0;
    EXPECT_EQ(slots.upload(kOne, effect), -EINVAL);
    for (const int type : {0, FF_CONSTANT, FF_SPRING, FF_RAMP, FF_GAIN, 0xffff}) {
        effect = custom(-1);
        effect.type = static_cast<uint16_t>(type);
        EXPECT_EQ(slots.upload(kOne, effect), -EINVAL) << type;
    }
}

TEST(EffectSlots, EraseNeedsAnEffectOfOnesOwn) {
    EffectSlots slots(4);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.erase(kOther, 0), -EACCES);
    EXPECT_EQ(slots.erase(kOne, 1), -EINVAL);
    EXPECT_EQ(slots.erase(kOne, -1), -EINVAL);
    EXPECT_EQ(slots.erase(kOne, 99), -EINVAL);
    EXPECT_EQ(slots.erase(kOne, 0), 0);
    EXPECT_EQ(slots.erase(kOne, 0), -EINVAL);
}

TEST(EffectSlots, AskingChangesNothing) {
    EffectSlots slots(4);
    EXPECT_EQ(slots.check(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.check(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.upload(kOne, custom(-1)), 0);
    EXPECT_EQ(slots.checkErase(kOne, 0), 0);
    EXPECT_EQ(slots.checkErase(kOne, 0), 0);
}

TEST(EffectSlots, AClosedFilesEffectsGoInOrder) {
    EffectSlots slots(4);
    slots.upload(kOne, custom(-1));
    slots.upload(kOther, custom(-1));
    slots.upload(kOne, custom(-1));
    EXPECT_EQ(slots.eraseAllOf(kOne), (std::vector<int>{0, 2}));
    EXPECT_EQ(slots.eraseAllOf(kOne), std::vector<int>{});
    EXPECT_EQ(slots.upload(kOther, custom(1)), 1);
    EXPECT_EQ(slots.upload(kOther, custom(-1)), 0);
}

TEST(EffectSlots, RumbleReachesTheDriverAsASine) {
    const ff_effect sine = asDriverSees(rumble(3));
    EXPECT_EQ(sine.type, FF_PERIODIC);
    EXPECT_EQ(sine.id, 3);
    EXPECT_EQ(sine.u.periodic.waveform, FF_SINE);
    EXPECT_EQ(sine.u.periodic.period, 50);
    EXPECT_EQ(sine.u.periodic.magnitude, 0x5555 + 0x1000);
    EXPECT_EQ(sine.u.periodic.custom_len, 0U);
    EXPECT_EQ(sine.u.periodic.custom_data, nullptr);
    EXPECT_EQ(asDriverSees(custom(1)).u.periodic.waveform, FF_CUSTOM);
}

}  // namespace
}  // namespace handset
