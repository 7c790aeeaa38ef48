// SPDX-License-Identifier: Apache-2.0
//
// Compiles any string as a composite waveform. The sanitizers watch the memory; what the harness
// checks itself is that a result is one of those promised, that nothing is written behind it, and
// that compilation keeps nothing from one call to the next.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "HwApi.h"

namespace hal = aidl::android::hardware::vibrator;

namespace {

constexpr int kInvalid = -22;
constexpr size_t kBufferSize = 1152;

struct Compiled {
    int result;
    std::vector<uint8_t> bytes;
};

Compiled compile(const uint8_t* data, size_t size) {
    // Exactly as long as they are said to be, so that a step too far is seen.
    std::vector<char> text(data, data + size);
    text.push_back('\0');
    std::vector<uint8_t> out(kBufferSize, 0);
    const int result = hal::HwApi::wt_type10_comp_str_to_bin(text.data(), out.data());
    return {result, std::move(out)};
}

void require(bool condition) {
    if (!condition) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    // The compiler's messages would drown the fuzzer's own.
    const int null = open("/dev/null", O_WRONLY | O_CLOEXEC);
    dup2(null, STDOUT_FILENO);
    close(null);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const Compiled first = compile(data, size);
    if (first.result != kInvalid) {
        require(first.result >= 4 && first.result <= static_cast<int>(kBufferSize));
        require(first.result % 4 == 0);
        require(std::all_of(first.bytes.begin() + first.result, first.bytes.end(),
                            [](uint8_t byte) { return byte == 0; }));
        require(first.bytes[0] == 0 && first.bytes[1] == 0);
        for (int word = 4; word < first.result; word += 4) {
            require(first.bytes[static_cast<size_t>(word)] == 0);
        }
    }
    const Compiled second = compile(data, size);
    require(first.result == second.result && first.bytes == second.bytes);
    return 0;
}
