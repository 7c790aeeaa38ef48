// SPDX-License-Identifier: Apache-2.0
//
// The service manager's bytes: what it makes of each request word by word, malformed ones included,
// and what it answers.
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "platform/servicemanager/tests/processes.h"
#include "tests/support/fake_root.h"

namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;
using ::testing::ElementsAre;

constexpr const char* kInterface = "android.os.IServiceManager";
constexpr uint32_t kSystemLevel = 0x0c000001;
constexpr uint32_t kVintfLevel = 0x3f000001;
constexpr int32_t kBadType = -2147483647;
constexpr int32_t kNotEnoughData = -61;
constexpr int32_t kUnknownTransaction = -74;

class ServiceManagerWire : public ::testing::Test {
  protected:
    // A call of the interface's own, with token.
    RawReply call(uint32_t code, const RequestBytes& body) {
        return mBinder.transact(0, code, body);
    }

    static RequestBytes request() { return RequestBytes().token(kInterface); }

    static void expectStatus(const RawReply& reply, int32_t status) {
        EXPECT_EQ(reply.kind, RawReply::Kind::kStatus);
        EXPECT_EQ(reply.status, status);
    }

    static void expectNullPointer(const RawReply& reply) {
        EXPECT_EQ(reply.kind, RawReply::Kind::kData);
        EXPECT_THAT(reply.words(), ElementsAre(0xfffffffc, 0, 0, 0))
                << "EX_NULL_POINTER, no message";
    }

    qvx::test::FakeRoot mRoot;
    processes::Manager mManager{mRoot.path()};
    RawBinder mBinder;
};

TEST_F(ServiceManagerWire, AnswersAPing) {
    EXPECT_TRUE(mBinder.pingServiceManager());
}

TEST_F(ServiceManagerWire, NamesItsInterface) {
    const RawReply reply = call(0x5f4e5446, RequestBytes());
    ASSERT_EQ(reply.kind, RawReply::Kind::kData);
    // 26 characters: count, 13 words of two each, the terminator.
    ASSERT_EQ(reply.words().size(), 15u);
    EXPECT_EQ(reply.words()[0], 26u);
    EXPECT_EQ(reply.words()[1], 0x006e0061u) << "an";
    EXPECT_EQ(reply.words()[13], 0x00720065u) << "er";
    EXPECT_EQ(reply.words()[14], 0u);
}

TEST_F(ServiceManagerWire, AddServiceHasItsFieldsWhereTheyBelong) {
    RequestBytes body = request().string16("android.hardware.vibrator.IVibrator/default");
    EXPECT_EQ(body.data().size(), 164u);
    body.binder(0x1000, kSystemLevel).word(0).word(8);
    EXPECT_EQ(body.data().size(), 200u);
    EXPECT_THAT(body.offsets(), ElementsAre(164));
    const RawReply reply = call(3, body);
    EXPECT_EQ(reply.kind, RawReply::Kind::kData);
    EXPECT_THAT(reply.words(), ElementsAre(0));
}

TEST_F(ServiceManagerWire, ARefusalIsAnExceptionWithoutMessage) {
    const RawReply reply =
            call(3, request().string16("a b").binder(0x1000, kSystemLevel).word(0).word(8));
    EXPECT_THAT(reply.words(), ElementsAre(0xfffffffd, 0, 0, 0)) << "EX_ILLEGAL_ARGUMENT";
}

TEST_F(ServiceManagerWire, AVintfObjectIsRecognisedByItsStabilityWord) {
    const RawReply reply =
            call(3, request().string16("a.IFoo/x").binder(0x1000, kVintfLevel).word(0).word(8));
    EXPECT_THAT(reply.words(), ElementsAre(0xfffffffd, 0, 0, 0)) << "EX_ILLEGAL_ARGUMENT";
}

TEST_F(ServiceManagerWire, AnUnknownServiceIsANullBinder) {
    const RawReply reply = call(2, request().string16("none"));
    EXPECT_THAT(reply.words(), ElementsAre(0, 0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(ServiceManagerWire, AKnownServiceIsAHandleWithItsStability) {
    call(3, request().string16("svc").binder(0x1000, kSystemLevel).word(0).word(8));
    const RawReply reply = call(2, request().string16("svc"));
    // The driver turns the owner's own object back into what it registered.
    EXPECT_THAT(reply.words(),
                ElementsAre(0, 0x73622a85, ::testing::_, 0x1000, 0, 0x1000, 0, kSystemLevel));
}

TEST_F(ServiceManagerWire, AListIsACountAndTexts) {
    const RawReply reply = call(4, request().word(15));
    EXPECT_THAT(reply.words(), ElementsAre(0, 1, 7, 0x0061006d, 0x0061006e, 0x00650067, 0x00000072))
            << "the one name \"manager\"";
}

TEST_F(ServiceManagerWire, DeclarationsAreWordsListsAndNullTexts) {
    EXPECT_THAT(call(7, request().string16("a.IFoo/x")).words(), ElementsAre(0, 0));
    EXPECT_THAT(call(8, request().string16("a.IFoo")).words(), ElementsAre(0, 0));
    EXPECT_THAT(call(9, request().string16("a.IFoo/x")).words(), ElementsAre(0, 0xffffffff));
}

TEST_F(ServiceManagerWire, DebugInfoIsAParcelableArray) {
    const RawReply reply = call(12, request());
    // Header, count, presence, size with itself (4 + 20 + 4), name, pid.
    ASSERT_EQ(reply.words().size(), 10u);
    EXPECT_EQ(reply.words()[0], 0u);
    EXPECT_EQ(reply.words()[1], 1u);
    EXPECT_EQ(reply.words()[2], 1u);
    EXPECT_EQ(reply.words()[3], 28u);
    EXPECT_EQ(reply.words()[4], 7u);
    EXPECT_NE(reply.words()[9], 0u) << "the manager's own pid";
}

TEST_F(ServiceManagerWire, RefusesAnotherToken) {
    expectStatus(call(2, RequestBytes().token("android.os.IServiceManage").string16("x")),
                 kBadType);
    expectStatus(call(2, RequestBytes().token("android.os.IServiceManagers").string16("x")),
                 kBadType);
    expectStatus(call(2, RequestBytes()), kBadType);
    RequestBytes vendorHeader;
    vendorHeader.word(0x80000000)
            .word(0xffffffff)
            .word(0x564e4452)
            .string16(kInterface)
            .string16("x");
    expectStatus(call(2, vendorHeader), kBadType);
}

TEST_F(ServiceManagerWire, DoesNotLookAtPolicyAndWorkSource) {
    RequestBytes body;
    body.word(0).word(1000).word(0x53595354).string16(kInterface).string16("none");
    EXPECT_EQ(call(2, body).kind, RawReply::Kind::kData);
}

TEST_F(ServiceManagerWire, KnowsNoOtherCodes) {
    expectStatus(call(13, request()), kUnknownTransaction);
    expectStatus(call(0, request()), kUnknownTransaction);
    expectStatus(call(0x00fffffe, request()), kUnknownTransaction);
    expectStatus(call(0x00ffffff, request()), kUnknownTransaction);
    expectStatus(call(0x01000000, request()), kUnknownTransaction);
}

TEST_F(ServiceManagerWire, ANullOrMissingNameIsANullPointer) {
    for (const uint32_t code : {1u, 2u, 3u, 5u, 6u, 7u, 8u, 9u, 10u, 11u}) {
        SCOPED_TRACE(code);
        expectNullPointer(call(code, request().nullString16()));
        expectNullPointer(call(code, request()));
        expectNullPointer(call(code, request().word(0x7fffffff)));
    }
}

TEST_F(ServiceManagerWire, ANullBinderIsANullPointer) {
    for (const uint32_t code : {3u, 5u, 6u, 10u, 11u}) {
        SCOPED_TRACE(code);
        expectNullPointer(call(code, request().string16("svc").nullBinder().word(0).word(8)));
    }
    expectNullPointer(
            call(10, request().string16("svc").binder(0x1000, kSystemLevel).nullBinder()));
}

TEST_F(ServiceManagerWire, MissingScalarsAreNotEnoughData) {
    expectStatus(call(4, request()), kNotEnoughData);
    expectStatus(call(3, request().string16("svc").binder(0x1000, kSystemLevel)), kNotEnoughData);
    expectStatus(call(3, request().string16("svc").binder(0x1000, kSystemLevel).word(0)),
                 kNotEnoughData);
}

TEST_F(ServiceManagerWire, BytesThatAreNoObjectAreABadType) {
    expectStatus(call(3, request().string16("svc")), kBadType);
    RequestBytes body = request().string16("svc");
    for (int i = 0; i < 6; ++i) body.word(0x73622a85);
    expectStatus(call(3, body.word(kSystemLevel).word(0).word(8)), kBadType);
}

TEST_F(ServiceManagerWire, AnObjectOfNoKnownStabilityIsABadType) {
    expectStatus(call(3, request().string16("svc").binder(0x1000, 0).word(0).word(8)), kBadType);
    expectStatus(call(3, request().string16("svc").binder(0x2000, 0x07000001).word(0).word(8)),
                 kBadType);
}

TEST_F(ServiceManagerWire, SurvivesWordsOfEveryKind) {
    // The same words on each run: a failure can be looked at again.
    std::mt19937 engine(20210807);
    const auto random = [&engine] { return static_cast<uint32_t>(engine()); };
    for (int round = 0; round < 3000; ++round) {
        RequestBytes body = request();
        const uint32_t count = random() % 12;
        for (uint32_t i = 0; i < count; ++i) {
            const uint32_t word = random();
            body.word(word % 4 == 0 ? word % 64 : word);
        }
        call(1 + random() % 13, body);
    }
    EXPECT_TRUE(mBinder.pingServiceManager());
}

TEST_F(ServiceManagerWire, AClientThatNeverServesItsCallbackHoldsNobodyUp) {
    const RawReply registered = call(5, request().string16("svc").binder(0x1000, kSystemLevel));
    EXPECT_THAT(registered.words(), ElementsAre(0));
    EXPECT_TRUE(mManager.answers());
}

TEST_F(ServiceManagerWire, AServiceGoesWithItsProcess) {
    {
        RawBinder owner;
        const RawReply reply = owner.transact(
                0, 3, request().string16("svc").binder(0x1000, kSystemLevel).word(0).word(8));
        EXPECT_THAT(reply.words(), ElementsAre(0));
    }
    EXPECT_TRUE(qvx::test::eventually([this] {
        return call(2, request().string16("svc")).words() ==
               std::vector<uint32_t>{0, 0x73622a85, 0x113, 0, 0, 0, 0, 1};
    }));
}

}  // namespace
