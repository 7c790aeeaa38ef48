// SPDX-License-Identifier: Apache-2.0
#include "hwapi/CompositeWaveform.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstddef>
#include <cstdio>
#include <cstring>

#include "HwApi.h"
#include "driver/SystemCalls.h"

namespace aidl::android::hardware::vibrator {
namespace {

constexpr int HEADER_SIZE = 4;
constexpr ptrdiff_t SPECIFIER_SEARCH_LENGTH = 20;  // a "!" or "." further on is not looked for
constexpr unsigned long AMPLITUDE_MAX = 100;
constexpr unsigned long DELAY_MAX = 10000;
constexpr unsigned long DURATION_OWN_LENGTH = 65535;
constexpr unsigned long DURATION_LIMIT = 16384;
constexpr unsigned long QUARTERS_PER_MILLISECOND = 4;

// Prints the reason and a newline on standard output; the result is the compiler's.
__attribute__((format(printf, 1, 2))) int refuse(const char* format, ...) {
    char line[80];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(line, sizeof(line), format, arguments);
    va_end(arguments);
    kernel::write(STDOUT_FILENO, line, strlen(line));
    return -EINVAL;
}

bool isSeparator(char character) {
    return character == ',' || character == ' ' || character == '\n';
}

char* skipSeparators(char* text) {
    while (isSeparator(*text)) ++text;
    return text;
}

bool isDigit(char character) {
    return character >= '0' && character <= '9';
}

struct Number {
    unsigned long value;
    const char* end;  // behind the last digit; null when there was none
};

// The number at `text`, as strtoul(3) reads it in base 10: white space, a sign, digits; a negative
// number wraps and one too large is ULONG_MAX.
inline Number readNumber(const char* text) {
    bool negative = false;
    if (!isDigit(*text)) {
        while (*text == ' ' || (*text >= '\t' && *text <= '\r')) ++text;
        negative = *text == '-';
        if (negative || *text == '+') ++text;
        if (!isDigit(*text)) return {0, nullptr};
    }
    unsigned long value = 0;
    bool overflow = false;
    for (; isDigit(*text); ++text) {
        const auto digit = static_cast<unsigned long>(*text - '0');
        if (value >= ULONG_MAX / 10) overflow |= value > (ULONG_MAX - digit) / 10;
        value = value * 10 + digit;
    }
    if (overflow) {
        value = ULONG_MAX;
    } else if (negative) {
        value = 0 - value;
    }
    return {value, text};
}

// The number a token begins with; 0 when it begins with none.
unsigned long leadingNumber(const char* token) {
    return readNumber(token).value;
}

bool hasContent(const wt_type10_comp_section& section) {
    return section.wvfrm.amplitude != 0 || section.delay != 0;
}

// The section being filled; null when all places are taken.
wt_type10_comp_section* currentSection(wt_type10_comp* comp) {
    return comp->nsections < WT_TYPE10_COMP_SECTIONS_MAX ? &comp->sections[comp->nsections]
                                                         : nullptr;
}

// Moves from a section to the next, cleared, and returns it as currentSection() does.
wt_type10_comp_section* nextSection(wt_type10_comp* comp) {
    ++comp->nsections;
    wt_type10_comp_section* section = currentSection(comp);
    if (section != nullptr) *section = {};
    return section;
}

int startInnerLoop(wt_type10_comp* comp) {
    if (comp->inner_loop_open) return refuse("Nested inner loop specifier not allowed\n");
    wt_type10_comp_section* section = currentSection(comp);
    if (section != nullptr && hasContent(*section)) section = nextSection(comp);
    if (section == nullptr) return -EINVAL;
    section->repeat = WT_TYPE10_COMP_REPEAT_BEGIN;
    comp->inner_loop_open = true;
    return 0;
}

int stopInnerLoop(wt_type10_comp* comp, const char* token) {
    if (!comp->inner_loop_open) return refuse("Error: Inner loop stop with no start\n");
    comp->inner_loop_open = false;
    const unsigned long count = leadingNumber(token);
    if (count == 0) return refuse("Failed to get inner loop repeat value\n");
    wt_type10_comp_section* section = currentSection(comp);
    if (section == nullptr) return -EINVAL;
    section->repeat = static_cast<uint8_t>(count);
    nextSection(comp);
    return 0;
}

int setOuterLoop(wt_type10_comp* comp, unsigned long count) {
    if (comp->repeat != 0) return refuse("Duplicate outer loop specifier\n");
    if (count == 0) return refuse("Failed to get outer loop specifier\n");
    comp->repeat = static_cast<uint8_t>(count);
    return 0;
}

int addWaveform(wt_type10_comp* comp, char* token) {
    wt_type10_comp_section* section = currentSection(comp);
    if (section != nullptr && hasContent(*section)) section = nextSection(comp);
    if (section == nullptr) return -EINVAL;
    const int result = HwApi::wt_type10_comp_waveform_get(token, &section->wvfrm);
    if (result != 0) return result;
    if (section->wvfrm.duration != 0) section->flags |= WT_TYPE10_COMP_DURATION_FLAG;
    return 0;
}

int addDelay(wt_type10_comp* comp, const char* token) {
    wt_type10_comp_section* section = currentSection(comp);
    if (section != nullptr && section->delay != 0) section = nextSection(comp);
    if (section == nullptr) return -EINVAL;
    const unsigned long delay = leadingNumber(token);
    // The driver's tools answer a bad pause with the loop's words; log readers know them so.
    if (delay == 0) return refuse("Failed to get inner loop repeat value\n");
    if (delay > DELAY_MAX) return refuse("Delay %lu too long\n", delay);
    section->delay = static_cast<uint16_t>(delay);
    return 0;
}

struct Token {
    char* text;
    wt_type10_comp_specifier kind;
};

// Cuts the next token out of `*text`, moves behind it and says what it is, all in one pass. Of the
// rules the first that fits wins. False at the end of the string.
bool nextToken(char** text, Token* token) {
    char* const begin = skipSeparators(*text);
    char* at = begin;
    bool hasDoubleMark = false;
    bool hasMark = false;
    bool hasPoint = false;
    for (;; ++at) {
        if (*at >= '0') continue;  // digits and "~", most of every string
        if (*at == '.') {
            hasPoint |= at - begin < SPECIFIER_SEARCH_LENGTH;
        } else if (*at == '!') {
            hasDoubleMark |= at[1] == '!';
            hasMark |= at - begin < SPECIFIER_SEARCH_LENGTH;
        } else if (*at == '\0' || isSeparator(*at)) {
            break;
        }
    }
    const ptrdiff_t length = at - begin;
    *text = at;
    if (length == 0) return false;
    if (*at != '\0') *(*text)++ = '\0';

    token->text = begin;
    if (length == 1 && *begin == '~') {
        token->kind = WT_TYPE10_COMP_OUTER_LOOP_FOREVER;
    } else if (hasDoubleMark) {
        token->kind = length == 2 ? WT_TYPE10_COMP_INNER_LOOP_BEGIN : WT_TYPE10_COMP_INNER_LOOP_END;
    } else if (hasMark) {
        token->kind = WT_TYPE10_COMP_OUTER_LOOP_COUNT;
    } else {
        token->kind = hasPoint ? WT_TYPE10_COMP_WAVEFORM : WT_TYPE10_COMP_DELAY;
    }
    return true;
}

// Appends 32-bit words whose first byte is 0, until the space runs out.
class WordWriter {
  public:
    WordWriter(uint8_t* out, int size) : mBegin(out), mAt(out), mEnd(out + size) {}

    void write(unsigned first, unsigned second, unsigned third) {
        if (mEnd - mAt < 4) return;
        mAt[0] = 0;
        mAt[1] = static_cast<uint8_t>(first);
        mAt[2] = static_cast<uint8_t>(second);
        mAt[3] = static_cast<uint8_t>(third);
        mAt += 4;
    }

    int written() const { return static_cast<int>(mAt - mBegin); }

  private:
    uint8_t* mBegin;
    uint8_t* mAt;
    uint8_t* mEnd;
};

}  // namespace

int HwApi::wt_type10_comp_waveform_get(char* token, wt_type10_comp_wvfrm* out) {
    unsigned long numbers[3] = {};  // index, amplitude, duration
    int count = 0;
    for (const char* at = token; count < 3;) {
        const Number number = readNumber(at);
        if (number.end == nullptr) break;
        numbers[count++] = number.value;
        if (*number.end != '.') break;
        at = number.end + 1;
    }
    const auto [index, amplitude, duration] = numbers;

    if (count < 2) return refuse("Failed to parse waveform\n");
    // With a duration entry 0 is taken: the driver's tools have always let it through.
    if (count == 2 && index == 0) return refuse("Invalid waveform index: %u\n", 0U);
    if (amplitude < 1 || amplitude > AMPLITUDE_MAX) {
        return refuse("Invalid waveform amplitude: %u\n", static_cast<unsigned>(amplitude));
    }
    if (duration != DURATION_OWN_LENGTH && duration >= DURATION_LIMIT) {
        return refuse("Duration too long: %u ms\n", static_cast<unsigned>(duration));
    }
    out->index = static_cast<uint8_t>(index);
    out->amplitude = static_cast<uint8_t>(amplitude);
    out->duration = static_cast<uint16_t>(
            duration == DURATION_OWN_LENGTH ? duration : duration * QUARTERS_PER_MILLISECOND);
    return 0;
}

int HwApi::wt_type10_comp_decode(wt_type10_comp* comp, wt_type10_comp_specifier kind, char* token) {
    switch (kind) {
        case WT_TYPE10_COMP_OUTER_LOOP_FOREVER:
            return setOuterLoop(comp, WT_TYPE10_COMP_LOOP_FOREVER);
        case WT_TYPE10_COMP_INNER_LOOP_BEGIN:
            return startInnerLoop(comp);
        case WT_TYPE10_COMP_INNER_LOOP_END:
            return stopInnerLoop(comp, token);
        case WT_TYPE10_COMP_OUTER_LOOP_COUNT:
            return setOuterLoop(comp, leadingNumber(token));
        case WT_TYPE10_COMP_WAVEFORM:
            return addWaveform(comp, token);
        case WT_TYPE10_COMP_DELAY:
            return addDelay(comp, token);
    }
    return -EINVAL;
}

int HwApi::wt_type10_comp_to_buffer(wt_type10_comp* comp, int size, void* out) {
    if (size < HEADER_SIZE) return 0;
    auto* header = static_cast<uint8_t*>(out);
    header[0] = 0;
    header[1] = 0;
    header[2] = static_cast<uint8_t>(comp->nsections);  // 256 sections read as 0
    header[3] = comp->repeat;

    WordWriter words(header + HEADER_SIZE, size - HEADER_SIZE);
    const int count = std::min<int>(comp->nsections, WT_TYPE10_COMP_SECTIONS_MAX);
    for (int i = 0; i < count; ++i) {
        const wt_type10_comp_section& section = comp->sections[i];
        words.write(section.wvfrm.amplitude, section.wvfrm.index, section.repeat);
        words.write(section.flags, section.delay >> 8U, section.delay);
        if ((section.flags & WT_TYPE10_COMP_DURATION_FLAG) != 0) {
            words.write(0, section.wvfrm.duration >> 8U, section.wvfrm.duration);
        }
    }
    return HEADER_SIZE + words.written();
}

int HwApi::wt_type10_comp_str_to_bin(char* text, uint8_t* out) {
    wt_type10_comp comp;
    comp.nsections = 0;
    comp.repeat = 0;
    comp.inner_loop_open = false;
    comp.sections[0] = {};  // the others are cleared when they are reached

    Token token;
    while (nextToken(&text, &token)) {
        const int result = wt_type10_comp_decode(&comp, token.kind, token.text);
        if (result != 0) return result;
    }
    if (comp.inner_loop_open) return refuse("Inner loop never terminated\n");

    const wt_type10_comp_section* last = currentSection(&comp);
    if (last != nullptr && hasContent(*last)) ++comp.nsections;
    return wt_type10_comp_to_buffer(&comp, WT_TYPE10_COMP_BUFFER_SIZE, out);
}

}  // namespace aidl::android::hardware::vibrator
