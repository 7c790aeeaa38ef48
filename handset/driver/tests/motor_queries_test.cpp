// SPDX-License-Identifier: Apache-2.0
//
// What the motor answers to an evdev client's questions.
#include "handset/driver/motor_queries.h"

#include <linux/input.h>
#include <sys/ioctl.h>

#include <cerrno>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

namespace handset {
namespace {

using std::string_view_literals::operator""sv;

const MotorProfile kMotor;

TEST(MotorQueries, NumbersComeWhole) {
    EXPECT_EQ(answerQuery(kMotor, EVIOCGVERSION)->data, "\x01\x00\x01\x00"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGVERSION)->result, 0);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGID)->data, "\x06\0\0\0\0\0\0\0"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGEFFECTS)->data, "\x10\0\0\0"sv);
}

TEST(MotorQueries, TextsComeWithTheirZeroAndTheirLength) {
    EXPECT_EQ(answerQuery(kMotor, EVIOCGNAME(64))->data, "qvx_vibrator_inputff\0"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGNAME(64))->result, 21);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGPHYS(64))->data, "qvx/input0\0"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGUNIQ(64))->result, -ENOENT);
}

TEST(MotorQueries, ASmallBufferGetsWhatFits) {
    EXPECT_EQ(answerQuery(kMotor, EVIOCGNAME(3))->data, "qvx");
    EXPECT_EQ(answerQuery(kMotor, EVIOCGNAME(3))->result, 3);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGNAME(0))->result, 0);
}

TEST(MotorQueries, BitMapsHaveTheKernelsSizes) {
    EXPECT_EQ(answerQuery(kMotor, EVIOCGBIT(0, 64))->data, "\x01\x00\x20\0\0\0\0\0"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGBIT(EV_FF, 64))->data,
              "\0\0\0\0\0\0\0\0\0\0\x03\x20\x01\0\0\0"sv);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGBIT(EV_FF, 4))->result, 4);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGBIT(EV_KEY, 256))->result, 96);
    EXPECT_EQ(answerQuery(kMotor, EVIOCGPROP(64))->result, 8);
}

TEST(MotorQueries, NothingIsPressedLitHeardOrSwitched) {
    EXPECT_EQ(answerQuery(kMotor, EVIOCGKEY(128))->data, std::string(96, '\0'));
    EXPECT_EQ(answerQuery(kMotor, EVIOCGLED(128))->data, std::string(8, '\0'));
    EXPECT_EQ(answerQuery(kMotor, EVIOCGSND(128))->data, std::string(8, '\0'));
    EXPECT_EQ(answerQuery(kMotor, EVIOCGSW(4))->data, std::string(4, '\0'));
}

TEST(MotorQueries, AnythingElseIsNoQuestion) {
    EXPECT_FALSE(answerQuery(kMotor, EVIOCGBIT(EV_REP, 8)));
    EXPECT_FALSE(answerQuery(kMotor, EVIOCGRAB));
    EXPECT_FALSE(answerQuery(kMotor, EVIOCSFF));
    EXPECT_FALSE(answerQuery(kMotor, EVIOCGABS(0)));
    EXPECT_FALSE(answerQuery(kMotor, _IOR('X', 1, int)));
}

}  // namespace
}  // namespace handset
