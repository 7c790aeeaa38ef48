// SPDX-License-Identifier: Apache-2.0
//
// What a call came to, and how it is printed: as one JSON object on a line, or for people.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <type_traits>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_status.h>

namespace vibctl {

// Exit statuses of the program.
enum class Exit : int {
    kOk = 0,
    kException = 1,   // the call returned an exception, or the doctor found something
    kUsage = 2,       // the command line was wrong; nothing was called
    kNoService = 3,   // no service, a transport failure, or no answer in time
    kNoCallback = 4,  // the call succeeded, and the awaited callback did not come
};

// What a call's times are taken by.
using Clock = std::chrono::steady_clock;

// What became of the callback of a composition.
struct Completion {
    enum class Kind { kNotAwaited, kCompleted, kTimedOut };
    Kind kind = Kind::kNotAwaited;
    int64_t milliseconds = 0;  // from the call to onComplete(), or how long was waited in vain
};

// How a result reads to people. JSON has the bare value in any case.
enum class Show { kPlain, kMilliseconds, kHertz, kCapabilities };

struct Outcome {
    // How far the command came. Short of kCalled, `message` says why and there is no result.
    enum class Reached { kWrongUsage, kNoService, kCalled };
    Reached reached = Reached::kCalled;
    binder_exception_t exception = EX_NONE;
    binder_status_t status = STATUS_OK;  // other than STATUS_OK only for EX_TRANSACTION_FAILED
    int32_t serviceError = 0;            // of EX_SERVICE_SPECIFIC
    std::string message;
    std::string result = "null";  // in JSON; null when there is none or the call failed
    std::string text;             // the result for people; empty when there is none
    Completion completion;
    int64_t microseconds = 0;      // round trip of the call
    int64_t sentMicroseconds = 0;  // when it was sent, on CLOCK_MONOTONIC; 0 when nothing was
};

// Exception, status and message of a finished call.
Outcome outcomeOf(const ndk::ScopedAStatus& status);

// What a command line that is wrong comes to.
Outcome wrongUsage(const std::string& message);

// What a command comes to that finds no service to call.
Outcome noService(const std::string& message);

// What a call comes to that did not get through.
Outcome transportFailure(binder_status_t status, const std::string& message);

// "no answer within 5 s": what a call that takes longer than `limit` comes to.
Outcome noAnswer(std::chrono::milliseconds limit);

// {"iface":...,"method":...,"exception":...,"status":...,"message":...,"result":...,
// "callback":...,"us":...,"name":...,"text":...} without a newline. `name` is the exception's, and
// `text` what people are shown. An interface or method that is empty is null; so are exception,
// status and name where nothing was called. Only ASCII is written.
std::string jsonLine(const std::string& iface, const std::string& method, const Outcome& outcome);

// "perform: ok, 60 ms", "on: EX_ILLEGAL_STATE; the driver refused: see phone log"; without a
// newline. A method that is empty is left out.
std::string humanLine(const std::string& method, const Outcome& outcome);

Exit exitStatusOf(const Outcome& outcome);

// The name of an exception or a status as the NDK headers have it, else the number.
std::string exceptionName(binder_exception_t exception);
std::string statusName(binder_status_t status);

// Results in JSON. A float is written with as many digits as tell it from its neighbours; what
// JSON has no number for becomes "nan", "inf" or "-inf". An enumerator is its number.
std::string jsonOf(bool value);
std::string jsonOf(int32_t value);
std::string jsonOf(float value);
std::string jsonOf(const std::string& value);

template <typename T>
requires std::is_enum_v<T> std::string jsonOf(T value) {
    return jsonOf(static_cast<int32_t>(value));
}

template <typename T>
std::string jsonOf(const std::vector<T>& values) {
    std::string list;
    for (const auto& value : values) list += (list.empty() ? "" : ",") + jsonOf(value);
    return "[" + list + "]";
}

// Results for people. An enumerator is its name; an empty list "none", an empty string "empty".
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
    for (const auto& value : values) text += (text.empty() ? "" : " ") + textOf(value, show);
    return text.empty() ? "none" : text;
}

}  // namespace vibctl
