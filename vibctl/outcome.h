// SPDX-License-Identifier: Apache-2.0
//
// What a call came to, and how it is printed: as one JSON object on a line, or for people.
#pragma once

#include <cmath>
#include <cstdint>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_status.h>
#include <nlohmann/json.hpp>

namespace vibctl {

/// Exit statuses of the program.
enum class Exit : int {
    kOk = 0,
    kException = 1,  ///< the call returned an exception, or the doctor found something
    kUsage = 2,      ///< the command line was wrong; nothing was called
    kNoService = 3,  ///< no service, or the call did not get through
};

/// What became of the callback of a composition.
struct Completion {
    enum class Kind { kNotAwaited, kCompleted, kTimedOut };
    Kind kind = Kind::kNotAwaited;
    int64_t milliseconds = 0;  ///< from the call to onComplete(), or how long was waited in vain
};

/// How an integer result reads to people. JSON has the bare number in any case.
enum class Show { kPlain, kMilliseconds, kHertz, kCapabilities };

// NOLINTNEXTLINE(bugprone-exception-escape): moving a JSON value throws nothing, it only asserts
struct Outcome {
    binder_exception_t exception = EX_NONE;
    binder_status_t status = STATUS_OK;  ///< other than STATUS_OK only for EX_TRANSACTION_FAILED
    int32_t serviceError = 0;            ///< of EX_SERVICE_SPECIFIC
    std::string message;
    nlohmann::ordered_json result;  ///< null when there is none or the call failed
    std::string text;               ///< the result for people; empty when there is none
    Completion completion;
    int64_t microseconds = 0;  ///< round trip of the call
};

/// Exception, status and message of a finished call.
Outcome outcomeOf(const ndk::ScopedAStatus& status);

/// {"iface":...,"method":...,"exception":...,"status":...,"message":...,"result":...,
/// "callback":...,"us":...} without a line feed. Bytes that are not UTF-8 become U+FFFD.
std::string jsonLine(const std::string& iface, const std::string& method, const Outcome& outcome);

/// "perform: ok, 60 ms", "on: EX_ILLEGAL_STATE"; without a line feed.
std::string humanLine(const std::string& method, const Outcome& outcome);

Exit exitStatusOf(const Outcome& outcome);

/// The name of an exception or a status as the NDK headers have it, else the number.
std::string exceptionName(binder_exception_t exception);
std::string statusName(binder_status_t status);

// Results in JSON. A float is written with as many digits as tell it from its neighbours; what
// JSON has no number for becomes "nan", "inf" or "-inf". An enumerator is its number.
inline nlohmann::ordered_json jsonOf(bool value) {
    return value;
}
inline nlohmann::ordered_json jsonOf(int32_t value) {
    return value;
}
inline nlohmann::ordered_json jsonOf(const std::string& value) {
    return value;
}
nlohmann::ordered_json jsonOf(float value);

template <typename T>
requires std::is_enum_v<T> nlohmann::ordered_json jsonOf(T value) {
    return static_cast<int32_t>(value);
}

template <typename T>
nlohmann::ordered_json jsonOf(const std::vector<T>& values) {
    auto list = nlohmann::ordered_json::array();
    for (const auto& value : values) list.push_back(jsonOf(value));
    return list;
}

// Results for people. An enumerator is its name; an empty list "none", an empty text "empty".
std::string textOf(bool value, Show show);
std::string textOf(int32_t value, Show show);
std::string textOf(float value, Show show);
std::string textOf(const std::string& value, Show show);

template <typename T>
requires std::is_enum_v<T> std::string textOf(T value, Show) {
    return toString(value);
}

template <typename T>
std::string textOf(const std::vector<T>& values, Show show) {
    std::string text;
    for (const auto& value : values) {
        if (!text.empty()) text += ' ';
        text += textOf(value, show);
    }
    return text.empty() ? "none" : text;
}

}  // namespace vibctl
