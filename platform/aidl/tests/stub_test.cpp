// SPDX-License-Identifier: Apache-2.0
//
// What generated stubs make of requests, well-formed and not, and what they answer. The requests
// are written word by word into a local binder, which needs no binder driver.
#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <aidl/sample/BnListener.h>
#include <aidl/sample/BnPainter.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/aidl/tests/words.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

using aidl::sample::BnListener;
using aidl::sample::BnPainter;
using aidl::sample::Color;
using aidl::sample::IListener;
using aidl::sample::IPainter;
using aidl::sample::Point;
using aidl::sample::Shape;
using ndk::ScopedAStatus;

class Painter : public BnPainter {
  public:
    ScopedAStatus add(int32_t a, int32_t b, int32_t* sum) override {
        ++calls;
        *sum = a + b;
        return answer();
    }
    ScopedAStatus poke(int32_t /*value*/) override {
        ++calls;
        return answer();
    }
    ScopedAStatus fill(std::vector<int32_t>* values) override {
        for (int32_t& value : *values) value = 7;
        return answer();
    }
    ScopedAStatus move(Point* point, const Point& by) override {
        point->x += by.x;
        point->y += by.y;
        return answer();
    }
    ScopedAStatus echo(const std::optional<std::string>& text,
                       std::optional<std::string>* echoed) override {
        ++calls;
        *echoed = text;
        return answer();
    }
    ScopedAStatus reshape(const Shape& shape, std::vector<Point>* corners,
                          Shape* reshaped) override {
        ++calls;
        corners->emplace_back();
        *reshaped = shape;
        return answer();
    }
    ScopedAStatus mix(Color first, const std::vector<Color>& others, Color* mixed) override {
        ++calls;
        *mixed = others.empty() ? first : others.back();
        return answer();
    }
    ScopedAStatus listen(const std::shared_ptr<IListener>& listener, bool* listening) override {
        heard = listener;
        *listening = listener != nullptr;
        return answer();
    }
    ScopedAStatus wrap(const ndk::SpAIBinder& binder, ndk::SpAIBinder* wrapped) override {
        *wrapped = binder;
        return answer();
    }
    ScopedAStatus pass(const ndk::ScopedFileDescriptor& /*file*/,
                       ndk::ScopedFileDescriptor* /*passed*/) override {
        return answer();
    }
    ScopedAStatus split(const std::string& text, char16_t /*at*/,
                        std::vector<std::string>* parts) override {
        ++calls;
        parts->push_back(text);
        return answer();
    }

    binder_exception_t exception = EX_NONE;
    binder_status_t failure = STATUS_OK;
    int calls = 0;
    std::shared_ptr<IListener> heard;

  private:
    ScopedAStatus answer() const {
        return failure != STATUS_OK ? ScopedAStatus::fromStatus(failure)
                                    : ScopedAStatus::fromExceptionCode(exception);
    }
};

class QuietListener : public BnListener {
    ScopedAStatus onDone(int32_t /*result*/) override { return ScopedAStatus::ok(); }
};

class Stub : public ::testing::Test {
  protected:
    // Sends a request of these words; the reply's words are left in `reply`.
    binder_status_t send(transaction_code_t code, const Words& words, binder_flags_t flags = 0) {
        ndk::ScopedAParcel in;
        ndk::ScopedAParcel out;
        EXPECT_EQ(AIBinder_prepareTransaction(binder.get(), in.getR()), STATUS_OK);
        writeWords(in.get(), words);
        const binder_status_t status =
                AIBinder_transact(binder.get(), code, in.getR(), out.getR(), flags);
        reply = out.get() != nullptr ? wordsOf(out.get()) : Words();
        return status;
    }

    std::shared_ptr<Painter> painter = ndk::SharedRefBase::make<Painter>();
    ndk::SpAIBinder binder = painter->asBinder();
    Words reply;
};

constexpr transaction_code_t kAdd = 11;
constexpr transaction_code_t kPoke = 1;
constexpr transaction_code_t kFill = 3;
constexpr transaction_code_t kMove = 4;
constexpr transaction_code_t kEcho = 5;
constexpr transaction_code_t kReshape = 6;
constexpr transaction_code_t kMix = 7;
constexpr transaction_code_t kListen = 8;
constexpr transaction_code_t kWrap = 9;
constexpr transaction_code_t kSplit = 16777115;

TEST_F(Stub, AnswersStatusThenResult) {
    EXPECT_EQ(send(kAdd, {2, 3}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 5));
}

TEST_F(Stub, IgnoresWhatTheRequestHasLeft) {
    EXPECT_EQ(send(kAdd, {2, 3, 0xdeadbeef}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 5));
}

TEST_F(Stub, ExceptionIsAnsweredWithoutResults) {
    painter->exception = EX_UNSUPPORTED_OPERATION;
    EXPECT_EQ(send(kAdd, {2, 3}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0xfffffff9, 0, 0, 0));
}

TEST_F(Stub, TransportFailureOfTheServiceIsTheStatusOfTheTransaction) {
    painter->failure = STATUS_DEAD_OBJECT;
    EXPECT_EQ(send(kAdd, {2, 3}), STATUS_DEAD_OBJECT);
    EXPECT_THAT(reply, IsEmpty());
}

TEST_F(Stub, OnewayAnswersNothingWhateverTheServiceSays) {
    painter->exception = EX_ILLEGAL_STATE;
    EXPECT_EQ(send(kPoke, {1}, FLAG_ONEWAY), STATUS_OK);
    EXPECT_THAT(reply, IsEmpty());
    painter->failure = STATUS_DEAD_OBJECT;
    EXPECT_EQ(send(kPoke, {1}), STATUS_OK);
    EXPECT_EQ(painter->calls, 2);
}

TEST_F(Stub, UnknownCodeIsAnUnknownTransaction) {
    EXPECT_EQ(send(2, {}), STATUS_UNKNOWN_TRANSACTION);
    EXPECT_EQ(send(0x00fffffd, {}), STATUS_UNKNOWN_TRANSACTION);
}

TEST_F(Stub, AnswersVersionAndHash) {
    EXPECT_EQ(send(0x00ffffff, {}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 3));
    EXPECT_EQ(send(0x00fffffe, {}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 4, 0x00620061, 0x00640063, 0));
}

TEST_F(Stub, MissingScalarIsNotEnoughDataAndReachesNobody) {
    EXPECT_EQ(send(kAdd, {2}), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(send(kAdd, {}), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(send(kMix, {0}), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(painter->calls, 0);
}

TEST_F(Stub, BadListIsRefusedAndReachesNobody) {
    EXPECT_EQ(send(kMix, {0, 0xffffffff}), STATUS_NO_MEMORY);
    EXPECT_EQ(send(kMix, {0, 0xfffffffe}), STATUS_BAD_VALUE);
    EXPECT_EQ(send(kMix, {0, 9, 0x04040404}), STATUS_NO_MEMORY);
    EXPECT_EQ(send(kMix, {0, 0x7fffffff}), STATUS_NO_MEMORY);
    EXPECT_EQ(painter->calls, 0);
}

TEST_F(Stub, NullTextOrUnionIsUnexpectedAndReachesNobody) {
    EXPECT_EQ(send(kSplit, {0xffffffff, 0}), STATUS_UNEXPECTED_NULL);
    EXPECT_EQ(send(kReshape, {0, 0}), STATUS_UNEXPECTED_NULL);
    EXPECT_EQ(painter->calls, 0);
}

TEST_F(Stub, UnknownTagIsABadValueAndReachesNobody) {
    EXPECT_EQ(send(kReshape, {1, 6, 0, 0}), STATUS_BAD_VALUE);
    EXPECT_EQ(send(kReshape, {}), STATUS_NOT_ENOUGH_DATA);
    EXPECT_EQ(painter->calls, 0);
}

TEST_F(Stub, UnknownEnumeratorReachesTheService) {
    EXPECT_EQ(send(kMix, {0x41, 0}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 0x41));
}

TEST_F(Stub, OutListHasTheSizeTheClientAskedFor) {
    EXPECT_EQ(send(kFill, {2}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 2, 7, 7));
    EXPECT_EQ(send(kFill, {0}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 0));
    EXPECT_EQ(send(kFill, {0xffffffff}), STATUS_UNEXPECTED_NULL);
}

TEST_F(Stub, InoutArgumentIsWrittenBack) {
    EXPECT_EQ(send(kMove, {1, 12, 1, 0x3f800000, 1, 12, 2, 0x3f800000}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 1, 12, 3, 0x40000000));
}

TEST_F(Stub, ReturnValueIsWrittenBeforeOutArguments) {
    EXPECT_EQ(send(kReshape, {1, 0, 9, 0}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 1, 0, 9, 1, 1, 12, 3, 0));
}

TEST_F(Stub, NullableTextMayBeNull) {
    EXPECT_EQ(send(kEcho, {0xffffffff}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 0xffffffff));
}

TEST_F(Stub, NullCallbackReachesTheServiceAsNull) {
    EXPECT_EQ(send(kListen, {0x73622a85, 0x113, 0, 0, 0, 0, 1}), STATUS_OK);
    EXPECT_THAT(reply, ElementsAre(0, 0));
}

TEST_F(Stub, NullBinderWhereOneIsRequiredIsUnexpected) {
    EXPECT_EQ(send(kWrap, {0x73622a85, 0x113, 0, 0, 0, 0, 1}), STATUS_UNEXPECTED_NULL);
}

TEST_F(Stub, ForgedObjectIsABadType) {
    EXPECT_EQ(send(kListen, {0x73622a85, 0x113, 1, 0, 1, 0, 0x3f000001}), STATUS_BAD_TYPE);
    EXPECT_EQ(send(kListen, {0x73682a85, 0x113, 0, 0, 0, 0, 0x0c000001}), STATUS_BAD_TYPE);
    EXPECT_EQ(send(kListen, {1, 2, 3}), STATUS_BAD_TYPE);
}

TEST_F(Stub, CallbackOfThisProcessIsTheObjectItself) {
    const auto listener = ndk::SharedRefBase::make<QuietListener>();
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    ASSERT_EQ(AIBinder_prepareTransaction(binder.get(), in.getR()), STATUS_OK);
    ASSERT_EQ(IListener::writeToParcel(in.get(), listener), STATUS_OK);
    ASSERT_EQ(AIBinder_transact(binder.get(), kListen, in.getR(), out.getR(), 0), STATUS_OK);
    EXPECT_EQ(painter->heard, listener);
}

TEST_F(Stub, CallbackOfAnotherInterfaceReachesTheServiceAsNull) {
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    ASSERT_EQ(AIBinder_prepareTransaction(binder.get(), in.getR()), STATUS_OK);
    ASSERT_EQ(AParcel_writeStrongBinder(in.get(), binder.get()), STATUS_OK);
    ASSERT_EQ(AIBinder_transact(binder.get(), kListen, in.getR(), out.getR(), 0), STATUS_OK);
    EXPECT_THAT(wordsOf(out.get()), ElementsAre(0, 0));
}

TEST_F(Stub, TokenOfAnotherInterfaceIsABadType) {
    const auto listener = ndk::SharedRefBase::make<QuietListener>();
    const ndk::SpAIBinder other = listener->asBinder();
    ndk::ScopedAParcel foreign;
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    // A parcel must be prepared for its binder, so the foreign token is written over the own one.
    ASSERT_EQ(AIBinder_prepareTransaction(other.get(), foreign.getR()), STATUS_OK);
    ASSERT_EQ(AIBinder_prepareTransaction(binder.get(), in.getR()), STATUS_OK);
    AParcel_setDataPosition(in.get(), 0);
    writeWords(in.get(), wordsOf(foreign.get()));
    EXPECT_EQ(AIBinder_transact(binder.get(), kAdd, in.getR(), out.getR(), 0), STATUS_BAD_TYPE);
    EXPECT_EQ(painter->calls, 0);
}

}  // namespace
