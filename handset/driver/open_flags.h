// SPDX-License-Identifier: Apache-2.0
//
// The flags of an open(2), as text.
#pragma once

#include <string>

namespace handset {

// "O_RDONLY", "O_WRONLY" or "O_RDWR", then "|O_TRUNC" and the like in a fixed order. Bits the
// caller did not ask for by name are left out: the large-file bit, which the kernel adds by
// itself and which differs between architectures, and the kernel's internal ones.
std::string openFlagsText(int flags);

}  // namespace handset
