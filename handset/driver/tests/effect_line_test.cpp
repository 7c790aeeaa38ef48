// SPDX-License-Identifier: Apache-2.0
//
// An uploaded effect in the journal.
#include "handset/driver/effect_line.h"

#include <cerrno>

#include <gtest/gtest.h>

namespace handset {
namespace {

TEST(EffectLine, ACustomEffectShowsEveryField) {
    ff_effect effect{};
    effect.type = FF_PERIODIC;
    effect.id = -1;
    effect.direction = 1;
    effect.trigger = {2, 3};
    effect.replay = {500, 4};
    effect.u.periodic.waveform = FF_CUSTOM;
    effect.u.periodic.period = 5;
    effect.u.periodic.magnitude = -6;
    effect.u.periodic.offset = -7;
    effect.u.periodic.phase = 8;
    effect.u.periodic.envelope = {9, 10, 11, 12};
    effect.u.periodic.custom_len = 2;
    EXPECT_EQ(uploadLine(effect, std::string_view("\0\0\x05\0", 4), 3).dump(),
              R"({"op":"upload","node":"motor","id":-1,"result":3,"type":81,"waveform":93,)"
              R"("length":500,"delay":4,"direction":1,"button":2,"interval":3,"period":5,)"
              R"("magnitude":-6,"offset":-7,"phase":8,"attack_length":9,"attack_level":10,)"
              R"("fade_length":11,"fade_level":12,"custom_len":2,"custom_hex":"00000500"})");
}

TEST(EffectLine, ARefusedEffectOfAnotherKindShowsWhatAllKindsHave) {
    ff_effect effect{};
    effect.type = FF_CONSTANT;
    effect.id = 4;
    EXPECT_EQ(uploadLine(effect, "", -EINVAL).dump(),
              R"({"op":"upload","node":"motor","id":4,"result":"EINVAL","type":82,"length":0,)"
              R"("delay":0,"direction":0,"button":0,"interval":0})");
}

}  // namespace
}  // namespace handset
