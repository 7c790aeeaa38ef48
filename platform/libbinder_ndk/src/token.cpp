// SPDX-License-Identifier: Apache-2.0
//
// The interface token.
#include "platform/libbinder_ndk/src/token.h"

#include <linux/android/binder.h>

#include <cstring>

#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/utf.h"

namespace binder_ndk {
namespace {

// Asks the callee to gather strict-mode violations in its reply header.
constexpr uint32_t kStrictModeGather = 0x80000000;
// Work is accounted to the caller itself.
constexpr int32_t kNoWorkSource = -1;
// "SYST": the caller's binder library is the system's, which it is in vendor processes as well.
constexpr uint32_t kSystemHeader = 0x53595354;

}  // namespace

binder_status_t writeInterfaceToken(Parcel& parcel, std::u16string_view descriptor) {
    const uint32_t policy = CallContext::current().strictModePolicy | kStrictModeGather;
    if (const auto status = parcel.write(policy); status != STATUS_OK) return status;
    if (const auto status = parcel.write(kNoWorkSource); status != STATUS_OK) return status;
    if (const auto status = parcel.write(kSystemHeader); status != STATUS_OK) return status;
    return parcel.writeString16(descriptor);
}

bool checkInterfaceToken(const Parcel& parcel, std::u16string_view descriptor) {
    uint32_t policy = 0;
    int32_t workSource = 0;
    uint32_t header = 0;
    std::u16string_view sent;
    if (parcel.read(&policy) != STATUS_OK || parcel.read(&workSource) != STATUS_OK ||
        parcel.read(&header) != STATUS_OK) {
        logWarning("a request of %zu bytes is too short for an interface token", parcel.size());
        return false;
    }
    // A oneway call runs apart from its caller.
    CallContext& context = CallContext::current();
    context.strictModePolicy = (context.flags & TF_ONE_WAY) != 0 ? 0 : policy;

    if (header != kSystemHeader) {
        logWarning("a request's interface token has header 0x%x, not 0x%x", header, kSystemHeader);
        return false;
    }
    // Byte by byte: the view's own comparison goes unit by unit, which costs ten times as much.
    if (!parcel.readString16(&sent) || sent.size() != descriptor.size() ||
        std::memcmp(sent.data(), descriptor.data(), sent.size() * sizeof(char16_t)) != 0) {
        logWarning("a request for interface '%s' came to '%s'", utf16ToUtf8(sent).c_str(),
                   utf16ToUtf8(descriptor).c_str());
        return false;
    }
    return true;
}

}  // namespace binder_ndk
