// SPDX-License-Identifier: Apache-2.0
//
// Random bytes and random damage, read with every reader: whatever happens, nothing is read or
// allocated that is not there. The seeds are fixed, so a failure repeats.
#include <random>

#include <android/binder_parcel_utils.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {
namespace {

struct Point {
    int32_t x = 0;
    std::string name;

    binder_status_t writeToParcel(AParcel* parcel) const {
        if (const auto status = AParcel_writeInt32(parcel, x); status != STATUS_OK) return status;
        return ndk::AParcel_writeString(parcel, name);
    }
    binder_status_t readFromParcel(const AParcel* parcel) {
        if (const auto status = AParcel_readInt32(parcel, &x); status != STATUS_OK) return status;
        return ndk::AParcel_readString(parcel, &name);
    }
};

template <typename T>
void readVector(const AParcel* parcel, size_t bytes) {
    T vector;
    if (ndk::AParcel_readVector(parcel, &vector) == STATUS_OK) return;
    if constexpr (requires { vector.size(); }) {
        EXPECT_LE(vector.size(), bytes / 4 + 1) << "allocated more than the data could hold";
    }
}

// One value of a kind the generator picks.
void readSomething(const AParcel* parcel, unsigned kind, size_t bytes) {
    switch (kind % 20) {
        case 0: {
            int32_t value = 0;
            AParcel_readInt32(parcel, &value);
            break;
        }
        case 1: {
            int64_t value = 0;
            AParcel_readInt64(parcel, &value);
            break;
        }
        case 2: {
            bool value = false;
            AParcel_readBool(parcel, &value);
            break;
        }
        case 3: {
            std::string value;
            ndk::AParcel_readString(parcel, &value);
            break;
        }
        case 4: {
            std::optional<std::string> value;
            ndk::AParcel_readString(parcel, &value);
            break;
        }
        case 5:
            readVector<std::vector<int32_t>>(parcel, bytes);
            break;
        case 6:
            readVector<std::vector<uint8_t>>(parcel, bytes * 4);
            break;
        case 7:
            readVector<std::vector<double>>(parcel, bytes);
            break;
        case 8:
            readVector<std::vector<bool>>(parcel, bytes);
            break;
        case 9:
            readVector<std::vector<char16_t>>(parcel, bytes);
            break;
        case 10:
            readVector<std::vector<std::string>>(parcel, bytes);
            break;
        case 11:
            readVector<std::optional<std::vector<std::optional<std::string>>>>(parcel, bytes);
            break;
        case 12:
            readVector<std::vector<Point>>(parcel, bytes);
            break;
        case 13:
            readVector<std::vector<float>>(parcel, bytes);
            break;
        case 14: {
            ndk::SpAIBinder value;
            ndk::AParcel_readNullableStrongBinder(parcel, &value);
            break;
        }
        case 15: {
            ndk::ScopedAStatus value;
            AParcel_readStatusHeader(parcel, value.getR());
            break;
        }
        case 16: {
            ndk::ScopedFileDescriptor value;
            ndk::AParcel_readNullableParcelFileDescriptor(parcel, &value);
            break;
        }
        case 17: {
            std::optional<Point> value;
            ndk::AParcel_readNullableParcelable(parcel, &value);
            break;
        }
        case 18: {
            std::vector<int32_t> value;
            ndk::AParcel_resizeVector(parcel, &value);
            break;
        }
        default: {
            const ndk::ScopedAParcel copy(AParcel_create());
            const int32_t position = AParcel_getDataPosition(parcel);
            AParcel_appendFrom(parcel, copy.get(), position, static_cast<int32_t>(kind % 97));
            AParcel_setDataPosition(parcel, position);
            break;
        }
    }
}

class HostileParcel : public testing::TestWithParam<unsigned> {
  protected:
    void readAll(Buffer buffer, std::mt19937* random) {
        const size_t bytes = buffer.data.size();
        mKernel.deliver(std::move(buffer), mParcel.get());
        for (int i = 0; i < 12; ++i) {
            if ((*random)() % 8 == 0)
                AParcel_setDataPosition(mParcel.get(), static_cast<int32_t>((*random)() % 256));
            readSomething(mParcel.get(), static_cast<unsigned>((*random)()), bytes);
        }
        AParcel_reset(mParcel.get());
    }

    FakeKernel mKernel;
    ndk::ScopedAParcel mParcel{AParcel_create()};
};

// A number likely to be near a limit.
uint32_t awkward(std::mt19937* random) {
    constexpr uint32_t kAwkward[] = {0,          1,          2,          3,          4,
                                     0xffffffff, 0xfffffffe, 0x7fffffff, 0x80000000, 0x7ffffffe,
                                     0x3fffffff, 0x40000000, 0x20000000, 0x10000,    0xffffff80,
                                     0xfffffff8, 0xfffffff7, 0x73682a85, 0x0c000001, 24};
    const uint32_t pick = static_cast<uint32_t>((*random)());
    return pick % 3 == 0 ? static_cast<uint32_t>((*random)() % 64)
                         : kAwkward[pick % std::size(kAwkward)];
}

TEST_P(HostileParcel, AwkwardWordsAreSurvived) {
    std::mt19937 random(GetParam());
    for (int round = 0; round < 4000; ++round) {
        std::vector<uint32_t> dataWords(random() % 40);
        for (uint32_t& word : dataWords) word = awkward(&random);
        Buffer buffer(dataWords);
        buffer.data.resize(buffer.data.size() - std::min<size_t>(random() % 4, buffer.data.size()));
        readAll(std::move(buffer), &random);
    }
}

// Handles and descriptors only, at offsets that are right, nearly right or nonsense.
TEST_P(HostileParcel, AwkwardObjectListsAreSurvived) {
    std::mt19937 random(GetParam() + 1000);
    for (int round = 0; round < 4000; ++round) {
        std::vector<uint32_t> dataWords(random() % 40);
        for (uint32_t& word : dataWords) word = awkward(&random);
        std::vector<binder_size_t> offsets;
        binder_size_t next = 0;
        while (random() % 4 != 0) {
            next += 4 * (random() % 4);
            const size_t word = static_cast<size_t>(next) / 4;
            if (word + 6 <= dataWords.size()) {
                const uint32_t type = random() % 3 == 0 ? 0x66642a85 : 0x73682a85;
                const uint32_t object[] = {type, 0x113, 0x7ffffff0, 0, 0, 0};
                std::copy(std::begin(object), std::end(object),
                          dataWords.begin() + static_cast<ptrdiff_t>(word));
            }
            offsets.push_back(random() % 16 == 0 ? awkward(&random) : next);
            next += 24;
        }
        // An address may only come from the driver, which none of these types carries.
        for (uint32_t& word : dataWords)
            if (word == 0x73622a85) word = 0;
        readAll(Buffer(dataWords, offsets), &random);
    }
}

// A well-formed parcel with a few bytes damaged.
TEST_P(HostileParcel, DamagedParcelsAreSurvived) {
    std::mt19937 random(GetParam() + 2000);
    const ndk::ScopedAParcel good(AParcel_create());
    AParcel_writeStatusHeader(good.get(), ndk::ScopedAStatus::ok().get());
    ndk::AParcel_writeVector(good.get(), std::vector<int32_t>{1, 2, 3});
    ndk::AParcel_writeVector(good.get(), std::vector<std::string>{"one", "two"});
    ndk::AParcel_writeVector(good.get(), std::vector<Point>{{1, "a"}, {2, "b"}});
    AParcel_writeStrongBinder(good.get(), nullptr);
    const auto goodWords = words(good.get());
    for (int round = 0; round < 4000; ++round) {
        Buffer buffer(goodWords);
        for (unsigned i = 0; i < 1 + random() % 4; ++i)
            buffer.data[random() % buffer.data.size()] = static_cast<uint8_t>(random());
        buffer.data.resize(buffer.data.size() - 4 * (random() % 8));
        readAll(std::move(buffer), &random);
    }
}

INSTANTIATE_TEST_SUITE_P(Seeds, HostileParcel, testing::Values(1U, 2U, 3U, 4U));

}  // namespace
}  // namespace binder_test
