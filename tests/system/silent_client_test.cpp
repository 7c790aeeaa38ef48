// SPDX-License-Identifier: Apache-2.0
//
// Clients that hand over a callback and then answer nothing that they are asked: each call of theirs
// is answered, and so is the next client's.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/support/phone_control.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;

constexpr uint32_t kExtension = 0x5f455854;  // '_EXT'
constexpr uint32_t kVintf = 0x3f000001;
constexpr uint32_t kHalf = 0x3f000000;  // 0.5 as a float
constexpr uint32_t kOne = 0x3f800000;

RequestBytes standard() {
    return RequestBytes().token("android.hardware.vibrator.IVibrator");
}

TEST(SilentClient, IsAnsweredAndHoldsNobodyElse) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().err;
    // A raw connection serves none of the calls that come to its own objects.
    RawBinder client;
    const auto service = client.checkService("android.hardware.vibrator.IVibrator/default");
    ASSERT_TRUE(service.has_value());
    const RawReply extension = client.transact(*service, kExtension, RequestBytes());
    ASSERT_EQ(extension.handles.size(), 1U);

    const auto expectAnswer = [&](const char* method, uint32_t handle, uint32_t code,
                                  const RequestBytes& request) {
        EXPECT_EQ(client.transact(handle, code, request).kind, RawReply::Kind::kData) << method;
        EXPECT_EQ(phone.call({"std", "getCapabilities"}).value("exception", -1), 0) << method;
    };
    uint64_t key = 0;  // each callback is one the service has never seen
    expectAnswer("on", *service, 3, standard().int32(100).binder(++key, kVintf));
    expectAnswer("perform", *service, 4, standard().int32(0).int32(2).binder(++key, kVintf));
    expectAnswer("compose", *service, 12,
                 standard().int32(1).int32(1).int32(16).int32(0).int32(1).word(kOne).binder(
                         ++key, kVintf));
    expectAnswer("composePwle", *service, 24,
                 standard()
                         .int32(1)
                         .int32(1)
                         .int32(0)
                         .int32(1)
                         .int32(24)
                         .word(kHalf)
                         .word(0x43160000)
                         .word(kHalf)
                         .word(0x43160000)
                         .int32(100)
                         .binder(++key, kVintf));
    expectAnswer("the extension's perform", extension.handles[0], 16,
                 RequestBytes()
                         .token("vendor.quorvan.hardware.vibrator.IZelVibrator")
                         .int32(0)
                         .int32(100)
                         .binder(++key, kVintf));
}

}  // namespace
}  // namespace qvx::test
