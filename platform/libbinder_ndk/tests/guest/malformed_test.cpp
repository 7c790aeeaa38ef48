// SPDX-License-Identifier: Apache-2.0
//
// Requests the library would never send, put to the driver by hand. Each gets its error status, and
// the service goes on as if nothing had been.
#include <linux/android/binder.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "platform/libbinder_ndk/tests/guest/test_service.h"
#include "tests/support/kernel_log.h"

namespace binder_test {
namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;
using qvx::test::ExpectBinderComplaints;

std::string name() {
    return testing::UnitTest::GetInstance()->current_test_info()->name();
}

// Runs `body` as an app with a raw connection to a fresh service, then checks that the service
// still answers and has leaked no descriptor.
void withRawConnection(const std::function<void(RawBinder&, uint32_t)>& body) {
    const Process service(kSystem, [](const Process::Ready& ready) { serve(name(), ready); });
    int32_t before = 0;
    inProcess(kApp, [&] {
        RawBinder driver;
        ASSERT_TRUE(driver.isOpen());
        const auto handle = driver.checkService(name());
        ASSERT_TRUE(handle.has_value());
        const auto descriptors = [&] {
            return driver
                    .transact(*handle, kDescriptors,
                              RequestBytes().token(kServiceDescriptor).data())
                    .word(0);
        };
        before = descriptors();
        body(driver, *handle);
        EXPECT_EQ(before, descriptors());
    });
    inProcess(kRoot, [] { EXPECT_EQ(7, echo(find(name()), 7)); });
}

void expectStatus(int32_t status, const RawReply& reply) {
    EXPECT_EQ(RawReply::Kind::kStatus, reply.kind);
    EXPECT_EQ(status, reply.status);
}

RequestBytes token() {
    return RequestBytes().token(kServiceDescriptor);
}

// An object in a request, without its stability word.
void appendObject(std::vector<uint8_t>* data, uint32_t type, uint64_t binder, uint64_t cookie) {
    flat_binder_object object = {};
    object.hdr.type = type;
    object.flags = 0x113;
    object.binder = binder;
    object.cookie = cookie;
    const auto* const bytes = reinterpret_cast<const uint8_t*>(&object);
    data->insert(data->end(), bytes, bytes + sizeof object);
}

void appendWord(std::vector<uint8_t>* data, uint32_t word) {
    const auto* const bytes = reinterpret_cast<const uint8_t*>(&word);
    data->insert(data->end(), bytes, bytes + sizeof word);
}

TEST(Malformed, TokenMissingShortOrWrongIsBadType) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEcho, RequestBytes()));
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEcho, {1, 2, 3}));
        expectStatus(STATUS_BAD_TYPE,
                     driver.transact(handle, kEcho, RequestBytes().int32(0).int32(-1).data()));
        expectStatus(STATUS_BAD_TYPE,
                     driver.transact(handle, kEcho, RequestBytes().token("test.IOther").data()));
        auto cut = token().data();
        for (int i = 0; i < 4; ++i) cut.pop_back();
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEcho, cut));
        auto vendor = token().int32(5).data();
        vendor[8] = 'R';
        vendor[9] = 'D';
        vendor[10] = 'N';
        vendor[11] = 'V';
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEcho, vendor));
    });
}

TEST(Malformed, AnythingInStrictModeAndWorkSourceWordsIsAccepted) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        auto request = token().int32(5).data();
        for (size_t i = 0; i < 8; ++i) request[i] = 0x5a;
        const auto reply = driver.transact(handle, kEcho, request);
        EXPECT_EQ(RawReply::Kind::kData, reply.kind);
        EXPECT_EQ(5, reply.word(0));
    });
}

TEST(Malformed, ShortArgumentsAreNotEnoughData) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        expectStatus(STATUS_NOT_ENOUGH_DATA, driver.transact(handle, kEcho, token().data()));
        auto half = token().data();
        half.push_back(1);
        half.push_back(0);
        expectStatus(STATUS_NOT_ENOUGH_DATA, driver.transact(handle, kEcho, half));
        expectStatus(STATUS_NOT_ENOUGH_DATA, driver.transact(handle, kEchoBytes, token().data()));
    });
}

TEST(Malformed, HostileListLengthsAreRefused) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        for (const int32_t length : {1, 1000, 0x10000000, 0x7fffffff})
            expectStatus(STATUS_NO_MEMORY,
                         driver.transact(handle, kEchoBytes, token().int32(length).data()));
        expectStatus(STATUS_NO_MEMORY,
                     driver.transact(handle, kEchoBytes, token().int32(-1).data()));
        for (const int32_t length : {-2, static_cast<int32_t>(0x80000000)})
            expectStatus(STATUS_BAD_VALUE,
                         driver.transact(handle, kEchoBytes, token().int32(length).data()));
    });
}

TEST(Malformed, BytesLeftOverAreIgnored) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        const auto reply =
                driver.transact(handle, kEcho, token().int32(9).bytes(100000, 0xee).data());
        EXPECT_EQ(RawReply::Kind::kData, reply.kind);
        EXPECT_EQ(9, reply.word(0));
    });
}

TEST(Malformed, UnknownCodesAreUnknownTransactions) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        for (const uint32_t code : {0x00ffffffU, 0x00fffffeU, 0U, 0x01000000U, 0x5f545754U,
                                    0x5f4c494bU, 0x7fffffffU, 0xffffffffU})
            expectStatus(STATUS_UNKNOWN_TRANSACTION, driver.transact(handle, code, token().data()));
    });
}

TEST(Malformed, ReservedCodesNeedNoToken) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        const auto ping = driver.transact(handle, 0x5f504e47, RequestBytes());
        EXPECT_EQ(RawReply::Kind::kData, ping.kind);
        EXPECT_EQ(0U, ping.data.size());

        const auto properties = driver.transact(handle, 0x5f535052, RequestBytes());
        EXPECT_EQ(RawReply::Kind::kData, properties.kind);
        EXPECT_EQ(0U, properties.data.size());

        const auto descriptor = driver.transact(handle, 0x5f4e5446, RequestBytes());
        EXPECT_EQ(RequestBytes().string16("test.IService").data(), descriptor.data);

        const auto pid = driver.transact(handle, 0x5f504944, RequestBytes());
        EXPECT_EQ(4U, pid.data.size());
        EXPECT_GT(pid.word(0), 1);

        const auto extension = driver.transact(handle, 0x5f455854, RequestBytes());
        EXPECT_EQ(28U, extension.data.size());
        EXPECT_EQ(0x73682a85, extension.word(0));
        EXPECT_EQ(0x0c000001, extension.word(24));
        EXPECT_EQ(1U, extension.handles.size());
    });
}

TEST(Malformed, NullObjectIsPlainDataAndKeepsItsBytes) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        const auto reply = driver.transact(handle, kEchoBinder, token().nullBinder().data());
        const std::vector<uint8_t> expected = {0x85, 0x2a, 0x62, 0x73, 0x13, 0x01, 0, 0, 0, 0,
                                               0,    0,    0,    0,    0,    0,    0, 0, 0, 0,
                                               0,    0,    0,    0,    0x01, 0,    0, 0};
        EXPECT_EQ(expected, reply.data);
        EXPECT_TRUE(reply.handles.empty());
    });
}

TEST(Malformed, PosedObjectsAreBadType) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        // Nothing there at all.
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEchoBinder, token().data()));
        // An address no driver has vouched for.
        auto posed = token().data();
        appendObject(&posed, BINDER_TYPE_BINDER, 0x1000, 0x2000);
        appendWord(&posed, 0x0c000001);
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEchoBinder, posed));
        // A handle nobody gave.
        auto handles = token().data();
        appendObject(&handles, BINDER_TYPE_HANDLE, 0, 0);
        appendWord(&handles, 0x0c000001);
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEchoBinder, handles));
    });
}

TEST(Malformed, StabilityWordsThatCannotBeAreRefused) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        const auto send = [&](std::optional<uint32_t> word) {
            auto request = token().data();
            const uint64_t offset = request.size();
            appendObject(&request, BINDER_TYPE_BINDER, 0x1230, 0x4560);
            if (word.has_value()) appendWord(&request, *word);
            return driver.transact(handle, kEchoBinder, request, {offset});
        };
        expectStatus(STATUS_NOT_ENOUGH_DATA, send(std::nullopt));
        expectStatus(STATUS_BAD_TYPE, send(0x0c000000));
        expectStatus(STATUS_BAD_TYPE, send(0x00000001));
        expectStatus(STATUS_BAD_TYPE, send(0x07000001));
        EXPECT_EQ(RawReply::Kind::kData, send(0x0c000001).kind);
        EXPECT_EQ(RawReply::Kind::kData, send(0x3f000001).kind) << "the last proxy was dropped";
        // A null with a level.
        auto null = token().data();
        appendObject(&null, BINDER_TYPE_BINDER, 0, 0);
        appendWord(&null, 0x0c000001);
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEchoBinder, null));
    });
}

TEST(Malformed, PlainReadAcrossAnObjectIsDenied) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        auto request = token().data();
        const uint64_t offset = request.size();
        appendObject(&request, BINDER_TYPE_BINDER, 0x1230, 0x4560);
        expectStatus(STATUS_PERMISSION_DENIED, driver.transact(handle, kEcho, request, {offset}));
    });
}

TEST(Malformed, SilentClientIsNotWaitedFor) {
    // A raw connection answers none of the questions that come to its own objects.
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        for (uint64_t key = 1; key <= 3; ++key) {
            const auto reply = driver.transact(handle, kAssociate, token().binder(key, 0x0c000001));
            EXPECT_EQ(RawReply::Kind::kData, reply.kind);
        }
    });
}

TEST(Malformed, WeakObjectDropsTheObjectList) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        auto request = token().data();
        const uint64_t offset = request.size();
        appendObject(&request, BINDER_TYPE_WEAK_BINDER, 0x1230, 0x4560);
        appendWord(&request, 0x0c000001);
        expectStatus(STATUS_BAD_TYPE, driver.transact(handle, kEchoBinder, request, {offset}));
    });
}

TEST(Malformed, DescriptorBesideAWeakObjectIsNotLeaked) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        for (int i = 0; i < 50; ++i) {
            auto request = token().data();
            const uint64_t first = request.size();
            appendObject(&request, BINDER_TYPE_FD, 0, 0);  // standard input
            const uint64_t second = request.size();
            appendObject(&request, BINDER_TYPE_WEAK_BINDER, 0x1230, 0x4560);
            expectStatus(STATUS_BAD_TYPE,
                         driver.transact(handle, kEchoBinder, request, {first, second}));
        }
    });
}

TEST(Malformed, DescriptorWhereNoneIsWantedIsNotLeaked) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        for (int i = 0; i < 50; ++i) {
            auto request = token().int32(3).data();
            const uint64_t offset = request.size();
            appendObject(&request, BINDER_TYPE_FD, 0, 0);
            EXPECT_EQ(3, driver.transact(handle, kEcho, request, {offset}).word(0));
        }
    });
}

TEST(Malformed, DumpWithoutArgumentsOrWithTooFewEnds) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        constexpr uint32_t kDump = 0x5f444d50;
        // No descriptor to write to: the object's own failure.
        expectStatus(STATUS_BAD_VALUE, driver.transact(handle, kDump, RequestBytes()));
        auto request = std::vector<uint8_t>();
        appendObject(&request, BINDER_TYPE_FD, 1, 0);
        appendWord(&request, 0x7fffffff);
        EXPECT_EQ(RawReply::Kind::kData, driver.transact(handle, kDump, request, {0}).kind);
        request.push_back(1);
        EXPECT_EQ(RawReply::Kind::kData, driver.transact(handle, kDump, request, {0}).kind);
    });
}

TEST(Malformed, ShellCommandWithoutAFunctionIsAccepted) {
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        const auto reply = driver.transact(handle, 0x5f434d44, RequestBytes());
        EXPECT_EQ(RawReply::Kind::kData, reply.kind);
        EXPECT_EQ(0U, reply.data.size());
    });
}

TEST(Malformed, BadOffsetsAreTheDriversToRefuse) {
    const ExpectBinderComplaints complaints;
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        auto request = token().data();
        const uint64_t offset = request.size();
        appendObject(&request, BINDER_TYPE_BINDER, 0x1230, 0x4560);
        appendWord(&request, 0x0c000001);
        for (const std::vector<uint64_t>& offsets : {std::vector<uint64_t>{offset + 2},
                                                     {offset, offset},
                                                     {offset + 8},
                                                     {offset, 0},
                                                     {0xfffffffffffffff0}}) {
            EXPECT_EQ(RawReply::Kind::kFailed,
                      driver.transact(handle, kEchoBinder, request, offsets).kind);
        }
    });
}

TEST(Malformed, OversizedRequestIsTheDriversToRefuse) {
    const ExpectBinderComplaints complaints;
    withRawConnection([](RawBinder& driver, uint32_t handle) {
        EXPECT_EQ(RawReply::Kind::kFailed,
                  driver.transact(handle, kEchoBytes, token().bytes(2 << 20, 0).data()).kind);
    });
}

TEST(Malformed, OversizedCallOfTheLibraryFailsAndTheNextOneWorks) {
    const ExpectBinderComplaints complaints;
    const Process service(kSystem, [](const Process::Ready& ready) { serve(name(), ready); });
    inProcess(kRoot, [] {
        const auto binder = find(name());
        binder_status_t status = STATUS_OK;
        const std::vector<uint8_t> tooMuch(2 << 20);
        call(
                binder, kEchoBytes,
                [&](AParcel* to) {
                    AParcel_writeByteArray(to, reinterpret_cast<const int8_t*>(tooMuch.data()),
                                           static_cast<int32_t>(tooMuch.size()));
                },
                &status);
        EXPECT_EQ(STATUS_FAILED_TRANSACTION, status);
        EXPECT_TRUE(AIBinder_isAlive(binder.get()));
        EXPECT_EQ(1, echo(binder, 1));
    });
}

}  // namespace
}  // namespace binder_test
