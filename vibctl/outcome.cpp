// SPDX-License-Identifier: Apache-2.0
//
// What a call came to, and how it is printed: see outcome.h.
#include "outcome.h"

#include <algorithm>
#include <iterator>

#include <aidl/android/hardware/vibrator/IVibrator.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

using aidl::android::hardware::vibrator::IVibrator;
using nlohmann::ordered_json;

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

constexpr NamedNumber kCapabilities[] = {
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

/// "36 (AMPLITUDE_CONTROL COMPOSE_EFFECTS)"; bits without a name as one number at the end.
std::string capabilitiesText(int32_t capabilities) {
    std::string names;
    auto rest = static_cast<uint32_t>(capabilities);
    for (const auto& [bit, name] : kCapabilities) {
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

ordered_json jsonOf(const Completion& completion) {
    switch (completion.kind) {
        case Completion::Kind::kCompleted:
            return completion.milliseconds;
        case Completion::Kind::kTimedOut:
            return "timeout";
        case Completion::Kind::kNotAwaited:
            break;
    }
    return nullptr;
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

}  // namespace

Outcome outcomeOf(const ndk::ScopedAStatus& status) {
    Outcome outcome;
    outcome.exception = status.getExceptionCode();
    outcome.status = status.getStatus();
    outcome.serviceError = status.getServiceSpecificError();
    outcome.message = status.getMessage();
    return outcome;
}

std::string jsonLine(const std::string& iface, const std::string& method, const Outcome& outcome) {
    ordered_json line;
    line["iface"] = iface;
    line["method"] = method;
    line["exception"] = outcome.exception;
    line["status"] = outcome.status;
    line["message"] = outcome.message;
    line["result"] = outcome.result;
    line["callback"] = jsonOf(outcome.completion);
    line["us"] = outcome.microseconds;
    return line.dump(-1, ' ', false, ordered_json::error_handler_t::replace);
}

std::string humanLine(const std::string& method, const Outcome& outcome) {
    if (outcome.exception == EX_NONE) {
        return fmt::format("{}: ok{}{}{}", method, outcome.text.empty() ? "" : ", ", outcome.text,
                           textOf(outcome.completion));
    }
    std::string line = fmt::format("{}: {}", method, exceptionName(outcome.exception));
    if (outcome.exception == EX_TRANSACTION_FAILED) line += " " + statusName(outcome.status);
    if (outcome.exception == EX_SERVICE_SPECIFIC) line += fmt::format(" {}", outcome.serviceError);
    if (!outcome.message.empty()) line += ": " + outcome.message;
    return line;
}

Exit exitStatusOf(const Outcome& outcome) {
    switch (outcome.exception) {
        case EX_NONE:
            return Exit::kOk;
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

ordered_json jsonOf(float value) {
    const std::string shortest = fmt::format("{}", value);
    if (!std::isfinite(value)) return shortest;
    // Through the text, so that 0.1f prints as 0.1 and not as the double next to the float.
    return std::stod(shortest);
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
