// SPDX-License-Identifier: Apache-2.0
//
// Names of services: which are accepted, and how a name maps to a manifest entry.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace servicemanager {

// What isValidServiceName() accepts, in words.
inline constexpr const char* kServiceNameForm = "1 to 127 of a-z A-Z 0-9 _ - . /";

// True for 1 to 127 characters out of `a-z A-Z 0-9 _ - . /`.
bool isValidServiceName(std::string_view name);

// An interface as manifests write it: `a.b.IFoo` is package `a.b`, name `IFoo`.
struct InterfaceName {
    std::string package;
    std::string name;
};

// Splits at the last dot; nothing when there is none.
std::optional<InterfaceName> parseInterfaceName(std::string_view text);

// A service that a manifest can declare: `a.b.IFoo/default`.
struct InstanceName {
    InterfaceName interface;
    std::string instance;
};

// Splits at the first slash; nothing when there is none, or no dot before it.
std::optional<InstanceName> parseInstanceName(std::string_view text);

}  // namespace servicemanager
