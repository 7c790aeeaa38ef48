// SPDX-License-Identifier: Apache-2.0
//
// The composite waveform compiler: turns a short string into the binary type-10 composite layout
// that the force-feedback driver takes as the custom data of an effect.
//
// The string is a list of tokens between commas, spaces and newlines:
//
//   I.A      play wavetable entry I at amplitude A (1 to 100 percent)
//   I.A.D    the same for D milliseconds (below 16384; 65535 is the entry's own length)
//   D        pause for D milliseconds (1 to 10000)
//   !! N!!   play what stands between the two N times; not nested
//   N!       play the whole N times
//   ~        play the whole until it is stopped
//
// A pause shares the section of the waveform before it; everything else starts a section of its
// own. "5.100, 10, ~" compiles to
//
//   00 00 01 ff   0, 0, one section, outer loop for ever
//   00 64 05 00   0, amplitude 100, entry 5, repeat 0
//   00 00 00 0a   0, flags 0, pause 10 ms
//
// Numbers are most significant byte first. A section that carries a duration has flag 0x08 and a
// third word: 0, 0 and the duration in quarter milliseconds.
//
// HwApi has the compiler's operations. A grammar error prints one line on standard output, where the
// driver's own tools print theirs, and is -EINVAL. Nothing allocates, nothing is kept between calls;
// thread-safe.
#pragma once

#include <cstdint>

namespace aidl::android::hardware::vibrator {

// The driver's buffer for a compiled composite: a header and at most 287 section words.
inline constexpr int WT_TYPE10_COMP_BUFFER_SIZE = 1152;
inline constexpr int WT_TYPE10_COMP_SECTIONS_MAX = 256;

inline constexpr uint8_t WT_TYPE10_COMP_LOOP_FOREVER = 255;    // outer loop
inline constexpr uint8_t WT_TYPE10_COMP_REPEAT_BEGIN = 255;    // a section's repeat
inline constexpr uint8_t WT_TYPE10_COMP_DURATION_FLAG = 0x08;  // a section's flags

// What a token says.
enum wt_type10_comp_specifier {
    WT_TYPE10_COMP_OUTER_LOOP_FOREVER = 0,  // ~
    WT_TYPE10_COMP_INNER_LOOP_BEGIN = 1,    // !!
    WT_TYPE10_COMP_INNER_LOOP_END = 2,      // N!!
    WT_TYPE10_COMP_OUTER_LOOP_COUNT = 3,    // N!
    WT_TYPE10_COMP_WAVEFORM = 4,            // I.A or I.A.D
    WT_TYPE10_COMP_DELAY = 5,               // D
};

struct wt_type10_comp_wvfrm {
    uint8_t index;      // wavetable entry
    uint8_t amplitude;  // percent, 1 to 100; 0: the section has no waveform
    uint16_t duration;  // quarter milliseconds; 65535: the entry's own length; 0: none given
};

struct wt_type10_comp_section {
    wt_type10_comp_wvfrm wvfrm;
    uint8_t repeat;  // 255: first of an inner loop; a count: last of one; else 0
    uint8_t flags;
    uint16_t delay;  // milliseconds after the waveform
};

// A composite while it is compiled. All zero is the empty composite. Only the sections up to the
// one being filled hold anything; the others are cleared when they are reached.
struct wt_type10_comp {
    uint16_t nsections;  // while compiling, the index of the section being filled
    uint8_t repeat;      // outer loop: 0 none, 255 for ever, else a count
    bool inner_loop_open;
    wt_type10_comp_section sections[WT_TYPE10_COMP_SECTIONS_MAX];
};

}  // namespace aidl::android::hardware::vibrator
