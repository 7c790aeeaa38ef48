// SPDX-License-Identifier: Apache-2.0
//
// Names of services: see service_name.h.
#include "platform/servicemanager/service_name.h"

#include <algorithm>

namespace servicemanager {

namespace {

constexpr size_t kLongestName = 127;

// The locale must not widen the set, hence no isalnum().
constexpr bool isNameCharacter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_' ||
           c == '-' || c == '.' || c == '/';
}

}  // namespace

bool isValidServiceName(std::string_view name) {
    return !name.empty() && name.size() <= kLongestName &&
           std::all_of(name.begin(), name.end(), isNameCharacter);
}

std::optional<InterfaceName> parseInterfaceName(std::string_view text) {
    const size_t dot = text.rfind('.');
    if (dot == std::string_view::npos) return std::nullopt;
    return InterfaceName{std::string(text.substr(0, dot)), std::string(text.substr(dot + 1))};
}

std::optional<InstanceName> parseInstanceName(std::string_view text) {
    const size_t slash = text.find('/');
    if (slash == std::string_view::npos) return std::nullopt;
    std::optional<InterfaceName> interface = parseInterfaceName(text.substr(0, slash));
    if (!interface) return std::nullopt;
    return InstanceName{*std::move(interface), std::string(text.substr(slash + 1))};
}

}  // namespace servicemanager
