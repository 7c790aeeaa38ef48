// SPDX-License-Identifier: Apache-2.0
// Messages that quote what somebody else wrote.
#include "driver/one_line.h"

#include <algorithm>

#include "driver/json_text.h"

namespace handset {

std::string oneLine(std::string text) {
    const unsigned char last = isUtf8(text) ? 0xff : 0x7e;
    std::replace_if(
            text.begin(), text.end(),
            [last](unsigned char c) { return c < 0x20 || c == 0x7f || c > last; }, '?');
    return text;
}

}  // namespace handset
