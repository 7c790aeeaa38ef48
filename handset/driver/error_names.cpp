// SPDX-License-Identifier: Apache-2.0
//
// Error numbers and their names, from the C library's own table.
#include "handset/driver/error_names.h"

#include <cerrno>
#include <cstring>

namespace handset {
namespace {

constexpr int kLargestNumber = 133;  // EHWPOISON

struct Alias {
    std::string_view name;
    int number;
};

// Second names, of which the C library's table knows only one each.
constexpr Alias kAliases[] = {
        {"EWOULDBLOCK", EWOULDBLOCK},
        {"EDEADLOCK", EDEADLOCK},
        {"EOPNOTSUPP", EOPNOTSUPP},
        {"ENOTSUP", ENOTSUP},
};

}  // namespace

std::optional<int> errorNumber(std::string_view name) {
    for (int number = 1; number <= kLargestNumber; ++number) {
        const char* known = strerrorname_np(number);
        if (known != nullptr && name == known) return number;
    }
    for (const Alias& alias : kAliases) {
        if (name == alias.name) return alias.number;
    }
    return std::nullopt;
}

std::string errorName(int number) {
    const char* known = strerrorname_np(number);
    return known != nullptr ? std::string(known) : std::to_string(number);
}

}  // namespace handset
