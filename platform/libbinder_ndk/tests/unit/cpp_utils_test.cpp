// SPDX-License-Identifier: Apache-2.0
//
// The header-only C++ layer: owners, interfaces, parcelables, lists, strings.
#include <fcntl.h>

#include <array>
#include <cassert>
#include <map>

#include <android/binder_auto_utils.h>
#include <android/binder_enums.h>
#include <android/binder_interface_utils.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_parcelable_utils.h>
#include <android/binder_to_string.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {

enum class Shade : int32_t { kDark = 0, kLight = 7 };

std::string toString(Shade shade) {
    return shade == Shade::kDark ? "kDark" : "kLight";
}

struct Pair {
    static constexpr const char* descriptor = "test.Pair";
    static constexpr ndk::parcelable_stability_t _aidl_stability = ndk::STABILITY_VINTF;

    int32_t first = 0;
    float second = 0;

    bool operator==(const Pair& other) const {
        return first == other.first && second == other.second;
    }
    binder_status_t writeToParcel(AParcel* parcel) const {
        if (const auto status = AParcel_writeInt32(parcel, first); status != STATUS_OK)
            return status;
        return AParcel_writeFloat(parcel, second);
    }
    binder_status_t readFromParcel(const AParcel* parcel) {
        if (const auto status = AParcel_readInt32(parcel, &first); status != STATUS_OK)
            return status;
        return AParcel_readFloat(parcel, &second);
    }
    std::string toString() const { return "Pair{}"; }
};

struct LocalPair : Pair {
    static constexpr ndk::parcelable_stability_t _aidl_stability = ndk::STABILITY_LOCAL;
};

class IThing : public ndk::ICInterface {
  public:
    virtual int number() = 0;
};

int liveThings = 0;

class Thing : public ndk::BnCInterface<IThing> {
  public:
    Thing() { ++liveThings; }
    ~Thing() override { --liveThings; }
    int number() override { return 5; }
    binder_status_t dump(int, const char** args, uint32_t numArgs) override {
        dumped.assign(args, args + numArgs);
        return STATUS_TIMED_OUT;
    }
    std::vector<std::string> dumped;

  protected:
    ndk::SpAIBinder createBinder() override {
        static AIBinder_Class* const clazz = ndk::ICInterface::defineClass(
                "test.IThing",
                [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                    return STATUS_UNKNOWN_TRANSACTION;
                });
        return ndk::SpAIBinder(AIBinder_new(clazz, static_cast<void*>(this)));
    }
};

class ThingProxy : public ndk::BpCInterface<IThing> {
  public:
    explicit ThingProxy(const ndk::SpAIBinder& binder) : BpCInterface(binder) {}
    int number() override { return 0; }
};

}  // namespace binder_test

template <>
inline constexpr std::array<binder_test::Shade, 2> ndk::internal::enum_values<binder_test::Shade> =
        {binder_test::Shade::kDark, binder_test::Shade::kLight};

namespace binder_test {
namespace {

using android::internal::ToString;
using testing::ElementsAre;

TEST(SpAIBinder, CountsReferences) {
    FakeKernel kernel;
    const auto thing = ndk::SharedRefBase::make<Thing>();
    ndk::SpAIBinder one = thing->asBinder();
    EXPECT_EQ(1, AIBinder_debugGetRefCount(one.get()));
    {
        const ndk::SpAIBinder two = one;
        EXPECT_EQ(2, AIBinder_debugGetRefCount(one.get()));
        EXPECT_TRUE(one == two);
        EXPECT_FALSE(one != two);
        EXPECT_TRUE(one <= two);
        EXPECT_TRUE(one >= two);
        EXPECT_FALSE(one < two);
        EXPECT_FALSE(one > two);
    }
    EXPECT_EQ(1, AIBinder_debugGetRefCount(one.get()));
    ndk::SpAIBinder& same = one;
    one = same;
    EXPECT_EQ(1, AIBinder_debugGetRefCount(one.get()));
    one = nullptr;
    EXPECT_EQ(nullptr, one.get());
}

TEST(ScopedOwners, MoveAndLeaveTheDefaultBehind) {
    ndk::ScopedFileDescriptor one(fcntl(0, F_DUPFD_CLOEXEC, 0));
    const int number = one.get();
    ndk::ScopedFileDescriptor two(std::move(one));
    EXPECT_EQ(-1, one.get());  // NOLINT(bugprone-use-after-move)
    EXPECT_EQ(number, two.get());
    one = std::move(two);
    EXPECT_EQ(number, one.get());
    one.set(-1);
    EXPECT_EQ(-1, fcntl(number, F_GETFD));
    EXPECT_TRUE(one == two);

    ndk::ScopedAParcel parcel(AParcel_create());
    const ndk::ScopedAParcel moved = std::move(parcel);
    EXPECT_EQ(nullptr, parcel.get());  // NOLINT(bugprone-use-after-move)
    EXPECT_NE(nullptr, moved.get());
}

TEST(Interfaces, BinderKeepsTheObjectButTheObjectNotItsBinder) {
    FakeKernel kernel;
    ASSERT_EQ(0, liveThings);
    auto thing = ndk::SharedRefBase::make<Thing>();
    ndk::SpAIBinder binder = thing->asBinder();
    EXPECT_EQ(binder.get(), thing->asBinder().get());
    ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(binder.get()));
    thing.reset();
    EXPECT_EQ(1, liveThings);
    thing = std::static_pointer_cast<Thing>(ndk::ICInterface::asInterface(binder.get()));
    EXPECT_EQ(5, thing->number());
    EXPECT_FALSE(thing->isRemote());
    binder.set(nullptr);
    EXPECT_EQ(nullptr, weak.promote().get());
    EXPECT_EQ(1, liveThings);
    EXPECT_NE(nullptr, thing->asBinder().get()) << "a new binder";
    thing.reset();
    EXPECT_EQ(0, liveThings);
}

TEST(Interfaces, NullHasNoInterface) {
    EXPECT_EQ(nullptr, ndk::ICInterface::asInterface(nullptr));
}

TEST(Interfaces, DumpIsForwarded) {
    FakeKernel kernel;
    const auto thing = ndk::SharedRefBase::make<Thing>();
    const char* args[] = {"x"};
    const ndk::SpAIBinder binder = thing->asBinder();
    EXPECT_EQ(STATUS_TIMED_OUT, AIBinder_dump(binder.get(), 1, args, 1));
    EXPECT_THAT(thing->dumped, ElementsAre("x"));
    const auto proxy = ndk::SharedRefBase::make<ThingProxy>(binder);
    EXPECT_EQ(binder.get(), proxy->asBinder().get());
    EXPECT_FALSE(proxy->isRemote());
    const char* more[] = {"y"};
    EXPECT_EQ(STATUS_TIMED_OUT, proxy->dump(1, more, 1));
    EXPECT_THAT(thing->dumped, ElementsAre("y"));
    EXPECT_EQ(STATUS_OK, proxy->handleShellCommand(0, 1, 2, nullptr, 0));
}

TEST(InterfacesDeathTest, ObjectWithoutAnOwnerAborts) {
    EXPECT_DEATH({ const Thing onTheStack; }, "never owned");
}

TEST(LibcCompatibility, AssertFunctionsTakeTheFileFirst) {
    EXPECT_DEATH(__assert2("file.cpp", 7, "function", "text"), "file.cpp:7: function: .*text");
    EXPECT_DEATH(__assert("file.cpp", 7, "text"), "file.cpp:7: .*text");
}

class ParcelUtils : public testing::Test {
  protected:
    AParcel* parcel() { return mOwn.get(); }
    void rewind() { AParcel_setDataPosition(mOwn.get(), 0); }

    // Writes a list and reads it back.
    template <typename T>
    void expectRoundTrip(const T& value) {
        AParcel_reset(parcel());
        EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), value));
        rewind();
        T read;
        EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(parcel(), &read));
        EXPECT_EQ(value, read);
        EXPECT_EQ((*parcel())->size(), (*parcel())->position());
    }

    FakeKernel mKernel;
    ndk::ScopedAParcel mOwn{AParcel_create()};
};

TEST_F(ParcelUtils, ListsComeBack) {
    expectRoundTrip(std::vector<int32_t>{1, -2});
    expectRoundTrip(std::vector<uint32_t>{1, 0xffffffff});
    expectRoundTrip(std::vector<int64_t>{1, -2});
    expectRoundTrip(std::vector<uint64_t>{1, 2});
    expectRoundTrip(std::vector<float>{1.5F});
    expectRoundTrip(std::vector<double>{1.5});
    expectRoundTrip(std::vector<bool>{true, false});
    expectRoundTrip(std::vector<char16_t>{u'x'});
    expectRoundTrip(std::vector<uint8_t>{1, 2, 255});
    expectRoundTrip(std::vector<std::string>{"", "x"});
    expectRoundTrip(std::vector<Pair>{{1, 0.5F}, {2, 1.5F}});
    expectRoundTrip(std::vector<int32_t>{});
    expectRoundTrip(std::optional<std::vector<int32_t>>{});
    expectRoundTrip(std::optional<std::vector<int32_t>>{{1}});
    expectRoundTrip(std::optional<std::vector<bool>>{{true}});
    expectRoundTrip(std::optional<std::vector<uint8_t>>{{1, 2}});
    expectRoundTrip(std::optional<std::vector<char16_t>>{{u'x'}});
    expectRoundTrip(std::optional<std::vector<std::optional<std::string>>>{
            {std::nullopt, std::string("x")}});
    expectRoundTrip(std::optional<std::vector<std::optional<Pair>>>{{std::nullopt, Pair{1, 2}}});
    expectRoundTrip(std::optional<std::vector<std::optional<Pair>>>{});
}

TEST_F(ParcelUtils, ListBytes) {
    ndk::AParcel_writeVector(parcel(), std::vector<int32_t>{7});
    ndk::AParcel_writeVector(parcel(), std::vector<uint8_t>{255});
    ndk::AParcel_writeVector(parcel(), std::vector<Pair>{{9, 1.0F}});
    EXPECT_THAT(words(parcel()), ElementsAre(1U, 7U, 1U, 0x000000ffU, 1U, 1U, 9U, 0x3f800000U));
}

TEST_F(ParcelUtils, DescriptorLists) {
    std::vector<ndk::ScopedFileDescriptor> sent;
    sent.emplace_back(fcntl(0, F_DUPFD_CLOEXEC, 0));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVector(parcel(), sent));
    rewind();
    std::vector<ndk::ScopedFileDescriptor> read;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readVector(parcel(), &read));
    ASSERT_EQ(1U, read.size());
    EXPECT_NE(-1, fcntl(read[0].get(), F_GETFD));
    sent[0].set(-1);
    AParcel_reset(parcel());
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_writeVector(parcel(), sent));
}

TEST_F(ParcelUtils, ParcelablesHaveAPresenceWord) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeParcelable(parcel(), Pair{1, 1.0F}));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeNullableParcelable(parcel(), std::optional<Pair>()));
    EXPECT_THAT(words(parcel()), ElementsAre(1U, 1U, 0x3f800000U, 0U));
    rewind();
    Pair read;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readParcelable(parcel(), &read));
    EXPECT_EQ(1, read.first);
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_readParcelable(parcel(), &read));
    std::optional<Pair> maybe = Pair{};
    AParcel_setDataPosition(parcel(), 12);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readNullableParcelable(parcel(), &maybe));
    EXPECT_FALSE(maybe.has_value());
    EXPECT_EQ(STATUS_NOT_ENOUGH_DATA, ndk::AParcel_readParcelable(parcel(), &read));
}

TEST_F(ParcelUtils, RequiredBindersRefuseNull) {
    ndk::SpAIBinder binder;
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_writeRequiredStrongBinder(parcel(), nullptr));
    EXPECT_EQ(0, AParcel_getDataSize(parcel()));
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeNullableStrongBinder(parcel(), nullptr));
    rewind();
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_readRequiredStrongBinder(parcel(), &binder));
    rewind();
    EXPECT_EQ(STATUS_OK, ndk::AParcel_readNullableStrongBinder(parcel(), &binder));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_writeRequiredParcelFileDescriptor(
                                              parcel(), ndk::ScopedFileDescriptor()));
}

TEST_F(ParcelUtils, OutListSizes) {
    EXPECT_EQ(STATUS_OK, ndk::AParcel_writeVectorSize(parcel(), std::vector<int32_t>(3)));
    EXPECT_EQ(STATUS_OK,
              ndk::AParcel_writeVectorSize(parcel(), std::optional<std::vector<int32_t>>()));
    AParcel_writeInt32(parcel(), -2);
    AParcel_writeInt32(parcel(), 0x7fffffff);
    rewind();
    std::vector<int32_t> required;
    std::optional<std::vector<int32_t>> maybe;
    EXPECT_EQ(STATUS_OK, ndk::AParcel_resizeVector(parcel(), &required));
    EXPECT_EQ(3U, required.size());
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_resizeVector(parcel(), &required));
    AParcel_setDataPosition(parcel(), 4);
    EXPECT_EQ(STATUS_OK, ndk::AParcel_resizeVector(parcel(), &maybe));
    EXPECT_FALSE(maybe.has_value());
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, ndk::AParcel_resizeVector(parcel(), &maybe));
    EXPECT_EQ(STATUS_NO_MEMORY, ndk::AParcel_resizeVector(parcel(), &required));
}

TEST_F(ParcelUtils, HolderCarriesAParcelable) {
    ndk::AParcelableHolder holder(ndk::STABILITY_VINTF);
    EXPECT_EQ(STATUS_OK, holder.setParcelable(Pair{4, 2.0F}));
    EXPECT_EQ(STATUS_BAD_VALUE, holder.setParcelable(LocalPair{}));
    EXPECT_EQ(STATUS_OK, holder.writeToParcel(parcel()));
    rewind();
    ndk::AParcelableHolder read(ndk::STABILITY_VINTF);
    EXPECT_EQ(STATUS_OK, read.readFromParcel(parcel()));
    std::optional<Pair> pair;
    EXPECT_EQ(STATUS_OK, read.getParcelable(&pair));
    ASSERT_TRUE(pair.has_value());
    EXPECT_EQ(4, pair->first);
    rewind();
    ndk::AParcelableHolder local(ndk::STABILITY_LOCAL);
    EXPECT_EQ(STATUS_BAD_VALUE, local.readFromParcel(parcel()));
}

TEST(Enums, RangeVisitsTheValuesInOrder) {
    std::vector<Shade> seen;
    for (const Shade shade : ndk::enum_range<Shade>()) seen.push_back(shade);
    EXPECT_THAT(seen, ElementsAre(Shade::kDark, Shade::kLight));
}

TEST(ToStringTest, FirstMatchingRuleCounts) {
    EXPECT_EQ("true", ToString(true));
    EXPECT_EQ("x", ToString(u'x'));
    EXPECT_EQ("\xc3\xa4", ToString(u'\u00e4'));
    EXPECT_EQ("\xe2\x82\xac", ToString(u'\u20ac'));
    EXPECT_EQ("-3", ToString(int8_t{-3}));
    EXPECT_EQ("1.500000", ToString(1.5F));
    EXPECT_EQ("text", ToString(std::string("text")));
    EXPECT_EQ("(null)", ToString(ndk::SpAIBinder()));
    EXPECT_EQ("(null)", ToString(ndk::ScopedFileDescriptor()));
    EXPECT_EQ("(null)", ToString(std::optional<int>()));
    EXPECT_EQ("7", ToString(std::optional<int>(7)));
    EXPECT_EQ("7", ToString(std::make_shared<int>(7)));
    EXPECT_EQ("(null)", ToString(static_cast<const int*>(nullptr)));
    EXPECT_EQ("Pair{}", ToString(Pair{}));
    EXPECT_EQ("kLight", ToString(Shade::kLight));
    EXPECT_EQ("[1, 2]", ToString(std::vector<int>{1, 2}));
    EXPECT_EQ("[]", ToString(std::vector<int>{}));
    EXPECT_EQ("[true, false]", ToString(std::vector<bool>{true, false}));
    EXPECT_EQ("[kDark]", ToString(std::vector<Shade>{Shade::kDark}));
    EXPECT_EQ("", ToString(std::shared_ptr<IThing>()));
    EXPECT_EQ("", ToString(ndk::AParcelableHolder(ndk::STABILITY_LOCAL)));
    struct Plain {};
    EXPECT_EQ("{no toString() implemented}", ToString(Plain{}));
}

}  // namespace
}  // namespace binder_test
