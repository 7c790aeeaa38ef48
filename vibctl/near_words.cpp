// SPDX-License-Identifier: Apache-2.0
//
// Which word was meant: see near_words.h.
#include "vibctl/near_words.h"

#include <algorithm>
#include <numeric>
#include <utility>

#include <android-base/strings.h>

namespace vibctl {

namespace {

// How many letters have to be inserted, left out or replaced to make one word the other.
size_t editDistance(std::string_view from, std::string_view to) {
    std::vector<size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), size_t{0});
    for (size_t i = 0; i < from.size(); ++i) {
        size_t diagonal = std::exchange(row[0], i + 1);
        for (size_t j = 0; j < to.size(); ++j) {
            const bool same = android::base::EqualsIgnoreCase(from.substr(i, 1), to.substr(j, 1));
            const size_t replaced = diagonal + (same ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({replaced, row[j] + 1, diagonal + 1});
        }
    }
    return row.back();
}

}  // namespace

std::vector<std::string> wordsNear(std::string_view word, std::span<const std::string_view> known) {
    constexpr size_t kSlips = 2;
    std::vector<std::string> near;
    if (word.empty()) return near;
    for (const std::string_view one : known) {
        const bool begun = word.size() > kSlips && android::base::StartsWithIgnoreCase(one, word);
        if (begun || editDistance(word, one) <= kSlips) near.emplace_back(one);
    }
    return near;
}

}  // namespace vibctl
