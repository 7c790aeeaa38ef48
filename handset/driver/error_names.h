// SPDX-License-Identifier: Apache-2.0
//
// Error numbers and their names ("EIO"), both ways.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace handset {

// The error number of a name from <errno.h> such as "EINTR", in capitals; nothing for any other.
std::optional<int> errorNumber(std::string_view name);

// The name of an error number (positive), or the number as text where it has none.
std::string errorName(int number);

}  // namespace handset
