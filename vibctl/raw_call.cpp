// SPDX-License-Identifier: Apache-2.0
//
// What the generated clients cannot send: see raw_call.h.
#include "vibctl/raw_call.h"

#include <unistd.h>

#include <chrono>
#include <cstring>
#include <thread>

#include <android-base/file.h>
#include <android-base/unique_fd.h>
#include <android/binder_ibinder.h>
#include <android/binder_parcel.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

std::string hexOf(const AParcel* parcel) {
    std::string hex;
    int32_t word = 0;
    AParcel_setDataPosition(parcel, 0);
    while (AParcel_readInt32(parcel, &word) == STATUS_OK) {
        unsigned char bytes[sizeof word];
        std::memcpy(bytes, &word, sizeof word);
        hex += fmt::format("{:02x}", fmt::join(bytes, ""));
    }
    return hex;
}

}  // namespace

Problem parseRawCall(Words arguments, RawCall& call) {
    constexpr const char* kUsage = "usage: vibctl raw std|ext CODE [HEX]";
    if (arguments.empty() || arguments.size() > 2) {
        return fmt::format("raw takes CODE and perhaps HEX, got {} words; {}", arguments.size(),
                           kUsage);
    }
    int64_t code = 0;
    if (const Problem problem = parseInteger("CODE", arguments[0], 0, UINT32_MAX, code)) {
        return fmt::format("raw: {}; {}", *problem, kUsage);
    }
    call.code = static_cast<uint32_t>(code);
    const std::string hex = arguments.size() > 1 ? arguments[1] : "";
    constexpr size_t kDigits = 2 * sizeof(int32_t);
    if (hex.size() % kDigits != 0 ||
        hex.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) {
        return fmt::format("raw: HEX {} is not eight hexadecimal digits for each 32-bit word; {}",
                           inQuotes(hex), kUsage);
    }
    for (size_t at = 0; at < hex.size(); at += kDigits) {
        unsigned char bytes[sizeof(int32_t)];
        for (size_t i = 0; i < sizeof bytes; ++i) {
            bytes[i] =
                    static_cast<unsigned char>(std::stoi(hex.substr(at + 2 * i, 2), nullptr, 16));
        }
        std::memcpy(&call.words.emplace_back(), bytes, sizeof bytes);
    }
    return std::nullopt;
}

Outcome sendRaw(const Service& service, const RawCall& call) {
    const ndk::SpAIBinder binder = service->asBinder();
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    binder_status_t status = AIBinder_prepareTransaction(binder.get(), in.getR());
    for (size_t i = 0; status == STATUS_OK && i < call.words.size(); ++i) {
        status = AParcel_writeInt32(in.get(), call.words[i]);
    }
    const Clock::time_point before = Clock::now();
    if (status == STATUS_OK) {
        status = AIBinder_transact(binder.get(), call.code, in.getR(), out.getR(), 0);
    }
    const Clock::duration taken = Clock::now() - before;

    Outcome outcome;
    if (status != STATUS_OK) {
        outcome = transportFailure(status, "");
    } else {
        ndk::ScopedAStatus header;
        if (AParcel_readStatusHeader(out.get(), header.getR()) == STATUS_OK) {
            outcome = outcomeOf(header);
        }
        outcome.text = "reply " + hexOf(out.get());
        outcome.result = jsonOf(hexOf(out.get()));
    }
    outcome.microseconds = std::chrono::duration_cast<std::chrono::microseconds>(taken).count();
    return outcome;
}

Outcome dump(const Service& service) {
    android::base::unique_fd ours;
    android::base::unique_fd theirs;
    if (!android::base::Pipe(&ours, &theirs)) return transportFailure(STATUS_NO_MEMORY, "no pipe");
    // It may write more than a pipe holds before it answers.
    std::string text;
    std::thread reader([&] { android::base::ReadFdToString(ours, &text); });
    const binder_status_t status =
            AIBinder_dump(service->asBinder().get(), theirs.get(), nullptr, 0);
    theirs.reset();
    reader.join();
    if (status != STATUS_OK) return transportFailure(status, "");
    Outcome outcome;
    outcome.text = text;
    outcome.result = jsonOf(text);
    return outcome;
}

}  // namespace vibctl
