// SPDX-License-Identifier: Apache-2.0
//
// android::internal::ToString: how generated toString() functions print a field.
#pragma once

#include <memory>
#include <optional>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>

#include <android/binder_auto_utils.h>
#include <android/binder_interface_utils.h>
#include <android/binder_parcelable_utils.h>

namespace android {
namespace internal {

template <typename T>
std::string ToString(const T& value);

namespace to_string {

template <typename T, template <typename...> class Template>
struct IsInstanceOf : std::false_type {};
template <template <typename...> class Template, typename... Args>
struct IsInstanceOf<Template<Args...>, Template> : std::true_type {};

template <typename T, typename = void>
struct HasMember : std::false_type {};
template <typename T>
struct HasMember<T, std::void_t<decltype(std::declval<const T&>().toString())>> : std::true_type {};

template <typename T, typename = void>
struct HasFunction : std::false_type {};
template <typename T>
struct HasFunction<T, std::void_t<decltype(toString(std::declval<const T&>()))>> : std::true_type {
};

template <typename T, typename = void>
struct IsIterable : std::false_type {};
template <typename T>
struct IsIterable<T, std::void_t<decltype(std::declval<const T&>().begin()),
                                 decltype(std::declval<const T&>().end())>> : std::true_type {};

template <typename T, typename = void>
struct IsInterface : std::false_type {};
template <typename T>
struct IsInterface<std::shared_ptr<T>, std::enable_if_t<std::is_base_of_v<::ndk::ICInterface, T>>>
    : std::true_type {};

template <typename T>
inline constexpr bool kIsPointerLike =
        std::is_pointer_v<T> || IsInstanceOf<T, std::optional>::value ||
        IsInstanceOf<T, std::shared_ptr>::value;

// One UTF-16 unit as UTF-8; a lone surrogate has none.
inline std::string Utf8(char16_t unit) {
    const auto byte = [](unsigned value) { return static_cast<char>(value); };
    const unsigned code = unit;
    if (code < 0x80) return {byte(code)};
    if (code < 0x800) return {byte(0xc0 | (code >> 6)), byte(0x80 | (code & 0x3f))};
    if (code >= 0xd800 && code <= 0xdfff) return {};
    return {byte(0xe0 | (code >> 12)), byte(0x80 | ((code >> 6) & 0x3f)),
            byte(0x80 | (code & 0x3f))};
}

template <typename T>
std::string List(const T& values) {
    std::string text = "[";
    bool first = true;
    for (const auto& value : values) {
        if (!first) text += ", ";
        first = false;
        text += ToString<std::decay_t<decltype(value)>>(value);
    }
    return text + "]";
}

}  // namespace to_string

// `value` as a string; the first rule that fits counts.
template <typename T>
std::string ToString(const T& value) {
    using namespace to_string;  // NOLINT(google-build-using-namespace)
    if constexpr (IsInterface<T>::value || std::is_base_of_v<::ndk::ICInterface, T> ||
                  std::is_same_v<T, ::ndk::AParcelableHolder>) {
        return "";
    } else if constexpr (std::is_same_v<T, bool>) {
        return value ? "true" : "false";
    } else if constexpr (std::is_same_v<T, char16_t>) {
        return Utf8(value);
    } else if constexpr (std::is_arithmetic_v<T>) {
        return std::to_string(value);
    } else if constexpr (std::is_same_v<T, std::string>) {
        return value;
    } else if constexpr (std::is_same_v<T, ::ndk::SpAIBinder>) {
        return value.get() == nullptr ? "(null)" : "";
    } else if constexpr (std::is_same_v<T, ::ndk::ScopedFileDescriptor>) {
        return value.get() == -1 ? "(null)" : "";
    } else if constexpr (kIsPointerLike<T>) {
        return value ? ToString<std::decay_t<decltype(*value)>>(*value) : "(null)";
    } else if constexpr (HasMember<T>::value) {
        return value.toString();
    } else if constexpr (HasFunction<T>::value) {
        return toString(value);
    } else if constexpr (IsIterable<T>::value) {
        return List(value);
    } else {
        return "{no toString() implemented}";
    }
}

}  // namespace internal
}  // namespace android
