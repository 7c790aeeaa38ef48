// SPDX-License-Identifier: Apache-2.0
//
// Reads anything as a profile or, where its first byte is a zero, as a fault for a phone that has a
// motor and a node. It is one, or one line says why not.
#include <string>
#include <string_view>

#include "fuzz/input.h"
#include "handset/driver/profile_reader.h"

namespace {

using fuzz::require;

constexpr std::string_view kPhone =
        R"({"nodes": {"/sys/class/leds/vibrator/duration": {"mode": "rw"}}, "motor": {"name": "m"}})";

void requireOneLine(const std::string& message) {
    require(!message.empty() && message.find('\n') == std::string::npos);
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    fuzz::Input input{data, size};
    if (size > 0 && data[0] == 0) {
        input.byte();
        static const handset::Profile kProfile = *handset::parseProfile(kPhone);
        const auto fault = handset::parseFault(input.bytes(size), kProfile);
        if (!fault.ok()) {
            requireOneLine(fault.error().message());
        } else {
            require(fault->node == handset::kMotorNode ||
                    kProfile.findNode(fault->node) != nullptr);
            require(fault->action.strikes());
        }
        return 0;
    }
    const auto profile = handset::parseProfile(input.bytes(size));
    if (!profile.ok()) requireOneLine(profile.error().message());
    return 0;
}
