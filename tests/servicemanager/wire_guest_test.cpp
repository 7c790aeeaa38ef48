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

#include "processes.h"
#include "raw_client.h"

namespace {

using raw::Body;
using raw::Reply;
using ::testing::ElementsAre;

constexpr const char* kInterface = "android.os.IServiceManager";
constexpr uint32_t kSystemLevel = 0x0c000001;
constexpr uint32_t kVintfLevel = 0x3f000001;
constexpr int32_t kBadType = -2147483647;
constexpr int32_t kNotEnoughData = -61;
constexpr int32_t kUnknownTransaction = -74;

class ServiceManagerWire : public ::testing::Test {
  protected:
    /// A call of the interface's own, with token.
    Reply call(uint32_t code, const Body& body) { return mBinder.callManager(code, body); }

    static Body request() { return Body::withToken(kInterface); }

    static void expectStatus(const Reply& reply, int32_t status) {
        EXPECT_EQ(reply.kind, Reply::Kind::kStatus);
        EXPECT_EQ(reply.status, status);
    }

    static void expectNullPointer(const Reply& reply) {
        EXPECT_EQ(reply.kind, Reply::Kind::kData);
        EXPECT_THAT(reply.words, ElementsAre(0xfffffffc, 0, 0, 0)) << "EX_NULL_POINTER, no message";
    }

    processes::TemporaryFolder mFolder;
    processes::Manager mManager{mFolder.path()};
    raw::Binder mBinder;
};

TEST_F(ServiceManagerWire, AnswersAPing) {
    EXPECT_TRUE(mBinder.pingManager());
}

TEST_F(ServiceManagerWire, NamesItsInterface) {
    const Reply reply = call(0x5f4e5446, {});
    ASSERT_EQ(reply.kind, Reply::Kind::kData);
    // 26 characters: count, 13 words of two each, the terminator.
    ASSERT_EQ(reply.words.size(), 15u);
    EXPECT_EQ(reply.words[0], 26u);
    EXPECT_EQ(reply.words[1], 0x006e0061u) << "an";
    EXPECT_EQ(reply.words[13], 0x00720065u) << "er";
    EXPECT_EQ(reply.words[14], 0u);
}

TEST_F(ServiceManagerWire, AddServiceHasItsFieldsWhereTheyBelong) {
    Body body = request().text("android.hardware.vibrator.IVibrator/default");
    EXPECT_EQ(body.bytes.size(), 164u);
    body.binder(0x1000, kSystemLevel).word(0).word(8);
    EXPECT_EQ(body.bytes.size(), 200u);
    EXPECT_THAT(body.offsets, ElementsAre(164));
    const Reply reply = call(3, body);
    EXPECT_EQ(reply.kind, Reply::Kind::kData);
    EXPECT_THAT(reply.words, ElementsAre(0));
}

TEST_F(ServiceManagerWire, ARefusalIsAnExceptionWithoutMessage) {
    const Reply reply = call(3, request().text("a b").binder(0x1000, kSystemLevel).word(0).word(8));
    EXPECT_THAT(reply.words, ElementsAre(0xfffffffd, 0, 0, 0)) << "EX_ILLEGAL_ARGUMENT";
}

TEST_F(ServiceManagerWire, AVintfObjectIsRecognisedByItsStabilityWord) {
    const Reply reply =
            call(3, request().text("a.IFoo/x").binder(0x1000, kVintfLevel).word(0).word(8));
    EXPECT_THAT(reply.words, ElementsAre(0xfffffffd, 0, 0, 0)) << "EX_ILLEGAL_ARGUMENT";
}

TEST_F(ServiceManagerWire, AnUnknownServiceIsANullBinder) {
    const Reply reply = call(2, request().text("none"));
    EXPECT_THAT(reply.words, ElementsAre(0, 0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(ServiceManagerWire, AKnownServiceIsAHandleWithItsStability) {
    call(3, request().text("svc").binder(0x1000, kSystemLevel).word(0).word(8));
    const Reply reply = call(2, request().text("svc"));
    // The driver turns the owner's own object back into what it registered.
    EXPECT_THAT(reply.words,
                ElementsAre(0, 0x73622a85, ::testing::_, 0x1000, 0, 0x1000, 0, kSystemLevel));
}

TEST_F(ServiceManagerWire, AListIsACountAndTexts) {
    const Reply reply = call(4, request().word(15));
    EXPECT_THAT(reply.words, ElementsAre(0, 1, 7, 0x0061006d, 0x0061006e, 0x00650067, 0x00000072))
            << "the one name \"manager\"";
}

TEST_F(ServiceManagerWire, DeclarationsAreWordsListsAndNullTexts) {
    EXPECT_THAT(call(7, request().text("a.IFoo/x")).words, ElementsAre(0, 0));
    EXPECT_THAT(call(8, request().text("a.IFoo")).words, ElementsAre(0, 0));
    EXPECT_THAT(call(9, request().text("a.IFoo/x")).words, ElementsAre(0, 0xffffffff));
}

TEST_F(ServiceManagerWire, DebugInfoIsAParcelableArray) {
    const Reply reply = call(12, request());
    // Header, count, presence, size with itself (4 + 20 + 4), name, pid.
    ASSERT_EQ(reply.words.size(), 10u);
    EXPECT_EQ(reply.words[0], 0u);
    EXPECT_EQ(reply.words[1], 1u);
    EXPECT_EQ(reply.words[2], 1u);
    EXPECT_EQ(reply.words[3], 28u);
    EXPECT_EQ(reply.words[4], 7u);
    EXPECT_NE(reply.words[9], 0u) << "the manager's own pid";
}

TEST_F(ServiceManagerWire, RefusesAnotherToken) {
    expectStatus(call(2, Body::withToken("android.os.IServiceManage").text("x")), kBadType);
    expectStatus(call(2, Body::withToken("android.os.IServiceManagers").text("x")), kBadType);
    expectStatus(call(2, {}), kBadType);
    Body vendorHeader;
    vendorHeader.word(0x80000000).word(0xffffffff).word(0x564e4452).text(kInterface).text("x");
    expectStatus(call(2, vendorHeader), kBadType);
}

TEST_F(ServiceManagerWire, DoesNotLookAtPolicyAndWorkSource) {
    Body body;
    body.word(0).word(1000).word(0x53595354).text(kInterface).text("none");
    EXPECT_EQ(call(2, body).kind, Reply::Kind::kData);
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
        expectNullPointer(call(code, request().nullText()));
        expectNullPointer(call(code, request()));
        expectNullPointer(call(code, request().word(0x7fffffff)));
    }
}

TEST_F(ServiceManagerWire, ANullBinderIsANullPointer) {
    for (const uint32_t code : {3u, 5u, 6u, 10u, 11u}) {
        SCOPED_TRACE(code);
        expectNullPointer(call(code, request().text("svc").nullBinder().word(0).word(8)));
    }
    expectNullPointer(call(10, request().text("svc").binder(0x1000, kSystemLevel).nullBinder()));
}

TEST_F(ServiceManagerWire, MissingScalarsAreNotEnoughData) {
    expectStatus(call(4, request()), kNotEnoughData);
    expectStatus(call(3, request().text("svc").binder(0x1000, kSystemLevel)), kNotEnoughData);
    expectStatus(call(3, request().text("svc").binder(0x1000, kSystemLevel).word(0)),
                 kNotEnoughData);
}

TEST_F(ServiceManagerWire, BytesThatAreNoObjectAreABadType) {
    expectStatus(call(3, request().text("svc")), kBadType);
    Body body = request().text("svc");
    for (int i = 0; i < 6; ++i) body.word(0x73622a85);
    expectStatus(call(3, body.word(kSystemLevel).word(0).word(8)), kBadType);
}

TEST_F(ServiceManagerWire, AnObjectOfNoKnownStabilityIsABadType) {
    expectStatus(call(3, request().text("svc").binder(0x1000, 0).word(0).word(8)), kBadType);
    expectStatus(call(3, request().text("svc").binder(0x2000, 0x07000001).word(0).word(8)),
                 kBadType);
}

TEST_F(ServiceManagerWire, SurvivesWordsOfEveryKind) {
    // The same words on each run: a failure can be looked at again.
    std::mt19937 engine(20210807);
    const auto random = [&engine] { return static_cast<uint32_t>(engine()); };
    for (int round = 0; round < 3000; ++round) {
        Body body = request();
        const uint32_t count = random() % 12;
        for (uint32_t i = 0; i < count; ++i) {
            const uint32_t word = random();
            body.word(word % 4 == 0 ? word % 64 : word);
        }
        call(1 + random() % 13, body);
    }
    EXPECT_TRUE(mBinder.pingManager());
}

TEST_F(ServiceManagerWire, AServiceGoesWithItsProcess) {
    {
        raw::Binder owner;
        const Reply reply = owner.callManager(
                3, request().text("svc").binder(0x1000, kSystemLevel).word(0).word(8));
        EXPECT_THAT(reply.words, ElementsAre(0));
    }
    EXPECT_TRUE(processes::eventually([this] {
        return call(2, request().text("svc")).words ==
               std::vector<uint32_t>{0, 0x73622a85, 0x113, 0, 0, 0, 0, 1};
    }));
}

}  // namespace
