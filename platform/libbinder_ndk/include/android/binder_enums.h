// SPDX-License-Identifier: Apache-2.0
//
// Walking over the values of a generated enumeration.
#pragma once

#include <iterator>
#include <type_traits>

namespace ndk {

namespace internal {

// The values of E in declaration order, a std::array; generated code specialises it. Not meant for
// direct use.
template <typename E>
constexpr void* enum_values = nullptr;  // no range: enum_range over another type does not compile

}  // namespace internal

// `for (auto value : ndk::enum_range<E>())` visits the values in declaration order.
template <typename E, typename = std::enable_if_t<std::is_enum_v<E>>>
struct enum_range {
    constexpr auto begin() const { return std::begin(internal::enum_values<E>); }
    constexpr auto end() const { return std::end(internal::enum_values<E>); }
};

}  // namespace ndk
