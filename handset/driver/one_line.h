// SPDX-License-Identifier: Apache-2.0
// Messages that quote what somebody else wrote.
#pragma once

#include <string>

namespace handset {

/// The text kept to one line that any terminal can show: control characters become "?", and so do
/// all bytes outside ASCII where the text is not UTF-8.
std::string oneLine(std::string text);

}  // namespace handset
