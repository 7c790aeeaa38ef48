// SPDX-License-Identifier: Apache-2.0
//
// What a call came to, and how it is printed: see outcome.h.
#include "vibctl/outcome.h"

#include <algorithm>
#include <cmath>
#include <iterator>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <fmt/format.h>

#include "vibctl/arguments.h"

namespace vibctl {

namespace {

using aidl::android::hardware::vibrator::IVibrator;

struct NamedNumber {
    int32_t number;
    const char* name;
};

constexpr NamedNumber kExceptions[] = {
        {EX_NONE, "EX_NONE"},
        {EX_SECURITY, "EX_SECURITY"},
        {EX_BAD_PARCELABLE, "EX_BAD_PARCELABLE"},
        {EX_ILLEGAL_ARGUMENT, "EX_ILLEGAL_ARGUMENT"},
        {EX_NULL_POINTER, "EX_NULL_POINTER"},
        {EX_ILLEGAL_STATE, "EX_ILLEGAL_STATE"},
        {EX_NETWORK_MAIN_THREAD, "EX_NETWORK_MAIN_THREAD"},
        {EX_UNSUPPORTED_OPERATION, "EX_UNSUPPORTED_OPERATION"},
        {EX_SERVICE_SPECIFIC, "EX_SERVICE_SPECIFIC"},
        {EX_PARCELABLE, "EX_PARCELABLE"},
        {EX_TRANSACTION_FAILED, "EX_TRANSACTION_FAILED"},
};

constexpr NamedNumber kStatuses[] = {
        {STATUS_OK, "STATUS_OK"},
        {STATUS_UNKNOWN_ERROR, "STATUS_UNKNOWN_ERROR"},
        {STATUS_NO_MEMORY, "STATUS_NO_MEMORY"},
        {STATUS_INVALID_OPERATION, "STATUS_INVALID_OPERATION"},
        {STATUS_BAD_VALUE, "STATUS_BAD_VALUE"},
        {STATUS_BAD_TYPE, "STATUS_BAD_TYPE"},
        {STATUS_NAME_NOT_FOUND, "STATUS_NAME_NOT_FOUND"},
        {STATUS_PERMISSION_DENIED, "STATUS_PERMISSION_DENIED"},
        {STATUS_NO_INIT, "STATUS_NO_INIT"},
        {STATUS_ALREADY_EXISTS, "STATUS_ALREADY_EXISTS"},
        {STATUS_DEAD_OBJECT, "STATUS_DEAD_OBJECT"},
        {STATUS_FAILED_TRANSACTION, "STATUS_FAILED_TRANSACTION"},
        {STATUS_BAD_INDEX, "STATUS_BAD_INDEX"},
        {STATUS_NOT_ENOUGH_DATA, "STATUS_NOT_ENOUGH_DATA"},
        {STATUS_WOULD_BLOCK, "STATUS_WOULD_BLOCK"},
        {STATUS_TIMED_OUT, "STATUS_TIMED_OUT"},
        {STATUS_UNKNOWN_TRANSACTION, "STATUS_UNKNOWN_TRANSACTION"},
        {STATUS_FDS_NOT_ALLOWED, "STATUS_FDS_NOT_ALLOWED"},
        {STATUS_UNEXPECTED_NULL, "STATUS_UNEXPECTED_NULL"},
};

constexpr NamedNumber kCapabilityNames[] = {
        {IVibrator::CAP_ON_CALLBACK, "ON_CALLBACK"},
        {IVibrator::CAP_PERFORM_CALLBACK, "PERFORM_CALLBACK"},
        {IVibrator::CAP_AMPLITUDE_CONTROL, "AMPLITUDE_CONTROL"},
        {IVibrator::CAP_EXTERNAL_CONTROL, "EXTERNAL_CONTROL"},
        {IVibrator::CAP_EXTERNAL_AMPLITUDE_CONTROL, "EXTERNAL_AMPLITUDE_CONTROL"},
        {IVibrator::CAP_COMPOSE_EFFECTS, "COMPOSE_EFFECTS"},
        {IVibrator::CAP_ALWAYS_ON_CONTROL, "ALWAYS_ON_CONTROL"},
        {IVibrator::CAP_GET_RESONANT_FREQUENCY, "GET_RESONANT_FREQUENCY"},
        {IVibrator::CAP_GET_Q_FACTOR, "GET_Q_FACTOR"},
        {IVibrator::CAP_FREQUENCY_CONTROL, "FREQUENCY_CONTROL"},
        {IVibrator::CAP_COMPOSE_PWLE_EFFECTS, "COMPOSE_PWLE_EFFECTS"},
};

template <size_t count>
std::string nameIn(const NamedNumber (&table)[count], int32_t number) {
    const auto* const row = std::find_if(std::begin(table), std::end(table),
                                         [number](auto& one) { return one.number == number; });
    return row == std::end(table) ? std::to_string(number) : row->name;
}

// "36 (AMPLITUDE_CONTROL COMPOSE_EFFECTS)"; bits without a name as one number at the end.
std::string capabilitiesText(int32_t capabilities) {
    std::string names;
    auto rest = static_cast<uint32_t>(capabilities);
    for (const auto& [bit, name] : kCapabilityNames) {
        if ((rest & static_cast<uint32_t>(bit)) == 0) continue;
        rest &= ~static_cast<uint32_t>(bit);
        names += fmt::format("{}{}", names.empty() ? "" : " ", name);
    }
    if (rest != 0) names += fmt::format("{}{:#x}", names.empty() ? "" : " ", rest);
    return names.empty() ? std::to_string(capabilities)
                         : fmt::format("{} ({})", capabilities, names);
}

const char* unitOf(Show show) {
    switch (show) {
        case Show::kMilliseconds:
            return " ms";
        case Show::kHertz:
            return " Hz";
        case Show::kPlain:
        case Show::kCapabilities:
            break;
    }
    return "";
}

std::string jsonOf(const Completion& completion) {
    switch (completion.kind) {
        case Completion::Kind::kCompleted:
            return std::to_string(completion.milliseconds);
        case Completion::Kind::kTimedOut:
            return R"("timeout")";
        case Completion::Kind::kNotAwaited:
            break;
    }
    return "null";
}

std::string textOf(const Completion& completion) {
    switch (completion.kind) {
        case Completion::Kind::kCompleted:
            return fmt::format(", completed after {} ms", completion.milliseconds);
        case Completion::Kind::kTimedOut:
            return fmt::format(", not completed within {} ms", completion.milliseconds);
        case Completion::Kind::kNotAwaited:
            break;
    }
    return "";
}

// What a failure means and where to look next; empty where its name says it all.
std::string hintFor(const Outcome& outcome) {
    switch (outcome.exception) {
        case EX_SECURITY:
            return "the caller may not; the extension answers users 0 and 1000";
        case EX_ILLEGAL_ARGUMENT:
            return "an argument was refused: see phone log, on a board logcat";
        case EX_ILLEGAL_STATE:
            return "the driver refused: see phone log, on a board logcat";
        case EX_UNSUPPORTED_OPERATION:
            return "this phone does not offer it: see vibctl info";
        case EX_TRANSACTION_FAILED:
            return "see vibctl doctor";
        default:
            return "";
    }
}

// What people are shown, but for the method's name.
std::string sentenceFor(const Outcome& outcome) {
    using Reached = Outcome::Reached;
    if (outcome.reached == Reached::kWrongUsage) return outcome.message;
    if (outcome.reached == Reached::kNoService) return outcome.message + "; see vibctl doctor";
    if (outcome.exception == EX_NONE) {
        return fmt::format("ok{}{}{}", outcome.text.empty() ? "" : ", ", outcome.text,
                           textOf(outcome.completion));
    }
    std::string line = exceptionName(outcome.exception);
    if (outcome.exception == EX_TRANSACTION_FAILED) line += " " + statusName(outcome.status);
    if (outcome.exception == EX_SERVICE_SPECIFIC) line += fmt::format(" {}", outcome.serviceError);
    if (!outcome.message.empty()) line += ": " + outcome.message;
    const std::string hint = hintFor(outcome);
    return hint.empty() ? line : line + "; " + hint;
}

}  // namespace

Outcome outcomeOf(const ndk::ScopedAStatus& status) {
    Outcome outcome;
    outcome.exception = status.getExceptionCode();
    outcome.status = status.getStatus();
    outcome.serviceError = status.getServiceSpecificError();
    outcome.message = status.getMessage();
    return outcome;
}

Outcome wrongUsage(const std::string& message) {
    Outcome outcome;
    outcome.reached = Outcome::Reached::kWrongUsage;
    outcome.message = message;
    return outcome;
}

Outcome noService(const std::string& message) {
    Outcome outcome = transportFailure(STATUS_NAME_NOT_FOUND, message);
    outcome.reached = Outcome::Reached::kNoService;
    return outcome;
}

Outcome transportFailure(binder_status_t status, const std::string& message) {
    Outcome outcome;
    outcome.exception = EX_TRANSACTION_FAILED;
    outcome.status = status;
    outcome.message = message;
    return outcome;
}

Outcome noAnswer(std::chrono::milliseconds limit) {
    return transportFailure(
            STATUS_TIMED_OUT,
            fmt::format("no answer within {} s", static_cast<double>(limit.count()) / 1000));
}

std::string jsonLine(const std::string& iface, const std::string& method, const Outcome& outcome) {
    const auto orNull = [](const std::string& word) {
        return word.empty() ? "null" : jsonOf(word);
    };
    const bool called = outcome.reached != Outcome::Reached::kWrongUsage;
    constexpr const char* kForm =
            R"({{"iface":{},"method":{},"exception":{},"status":{},"message":{},"result":{},)"
            R"("callback":{},"us":{},"name":{},"text":{}}})";
    return fmt::format(kForm, orNull(iface), orNull(method),
                       called ? std::to_string(outcome.exception) : "null",
                       called ? std::to_string(outcome.status) : "null", jsonOf(outcome.message),
                       outcome.result, jsonOf(outcome.completion), outcome.microseconds,
                       called ? jsonOf(exceptionName(outcome.exception)) : "null",
                       jsonOf(sentenceFor(outcome)));
}

std::string humanLine(const std::string& method, const Outcome& outcome) {
    return (method.empty() ? "" : method + ": ") + sentenceFor(outcome);
}

Exit exitStatusOf(const Outcome& outcome) {
    if (outcome.reached == Outcome::Reached::kWrongUsage) return Exit::kUsage;
    switch (outcome.exception) {
        case EX_NONE:
            return outcome.completion.kind == Completion::Kind::kTimedOut ? Exit::kNoCallback
                                                                          : Exit::kOk;
        case EX_TRANSACTION_FAILED:
            return Exit::kNoService;
        default:
            return Exit::kException;
    }
}

std::string exceptionName(binder_exception_t exception) {
    return nameIn(kExceptions, exception);
}

std::string statusName(binder_status_t status) {
    return nameIn(kStatuses, status);
}

std::string jsonOf(bool value) {
    return value ? "true" : "false";
}

std::string jsonOf(int32_t value) {
    return std::to_string(value);
}

std::string jsonOf(float value) {
    const std::string shortest = fmt::format("{}", value);
    if (!std::isfinite(value)) return jsonOf(shortest);
    // Programs tell a float from an integer by its point.
    return shortest.find_first_of(".e") == std::string::npos ? shortest + ".0" : shortest;
}

std::string jsonOf(const std::string& value) {
    return inQuotes(value);
}

std::string textOf(bool value, Show) {
    return value ? "true" : "false";
}

std::string textOf(int32_t value, Show show) {
    if (show == Show::kCapabilities) return capabilitiesText(value);
    return fmt::format("{}{}", value, unitOf(show));
}

std::string textOf(float value, Show show) {
    return fmt::format("{}{}", value, unitOf(show));
}

std::string textOf(const std::string& value, Show) {
    return value.empty() ? "empty" : value;
}

}  // namespace vibctl
