// SPDX-License-Identifier: Apache-2.0
//
// Which word was meant where another was written.
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace vibctl {

// Those of `known`, in their order, that a slip of the finger or two, or stopping early, may have
// made `word` of. Case counts for nothing.
std::vector<std::string> wordsNear(std::string_view word, std::span<const std::string_view> known);

}  // namespace vibctl
