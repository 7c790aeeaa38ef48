// SPDX-License-Identifier: Apache-2.0
//
// What a fuzzer is given, taken bit by bit, and what it does when a promise is broken.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>

namespace fuzz {

// Says which promise, by the line of the harness that holds it.
inline void require(bool condition, int line = __builtin_LINE()) {
    if (condition) return;
    std::fprintf(stderr, "a promise is broken: line %d of the harness\n", line);
    std::abort();
}

// Ends in zeros: an input that is too short means something as well.
struct Input {
    const uint8_t* at = nullptr;
    size_t left = 0;

    uint8_t byte() {
        if (left == 0) return 0;
        --left;
        return *at++;
    }

    uint32_t word() {
        uint32_t value = 0;
        for (int shift = 0; shift < 32; shift += 8) value |= uint32_t{byte()} << shift;
        return value;
    }

    // At most `size` bytes, as many as there are.
    std::string_view bytes(size_t size) {
        const std::string_view taken(reinterpret_cast<const char*>(at), std::min(size, left));
        at += taken.size();
        left -= taken.size();
        return taken;
    }
};

}  // namespace fuzz
