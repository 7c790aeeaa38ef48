// SPDX-License-Identifier: Apache-2.0
//
// The AStatus functions, and the names of status codes and exceptions.
#include "platform/libbinder_ndk/src/status.h"

#include <cstring>

#include "platform/libbinder_ndk/src/log.h"

namespace binder_ndk {
namespace {

struct Name {
    int32_t value;
    const char* text;
};

constexpr Name kStatusNames[] = {
        {STATUS_OK, "OK"},
        {STATUS_UNKNOWN_ERROR, "UNKNOWN_ERROR"},
        {STATUS_NO_MEMORY, "NO_MEMORY"},
        {STATUS_INVALID_OPERATION, "INVALID_OPERATION"},
        {STATUS_BAD_VALUE, "BAD_VALUE"},
        {STATUS_BAD_TYPE, "BAD_TYPE"},
        {STATUS_NAME_NOT_FOUND, "NAME_NOT_FOUND"},
        {STATUS_PERMISSION_DENIED, "PERMISSION_DENIED"},
        {STATUS_NO_INIT, "NO_INIT"},
        {STATUS_ALREADY_EXISTS, "ALREADY_EXISTS"},
        {STATUS_DEAD_OBJECT, "DEAD_OBJECT"},
        {STATUS_FAILED_TRANSACTION, "FAILED_TRANSACTION"},
        {STATUS_BAD_INDEX, "BAD_INDEX"},
        {STATUS_NOT_ENOUGH_DATA, "NOT_ENOUGH_DATA"},
        {STATUS_WOULD_BLOCK, "WOULD_BLOCK"},
        {STATUS_TIMED_OUT, "TIMED_OUT"},
        {STATUS_UNKNOWN_TRANSACTION, "UNKNOWN_TRANSACTION"},
        {STATUS_FDS_NOT_ALLOWED, "FDS_NOT_ALLOWED"},
        {STATUS_UNEXPECTED_NULL, "UNEXPECTED_NULL"},
};

constexpr Name kExceptionNames[] = {
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
        {kHasReplyHeader, "EX_HAS_REPLY_HEADER"},
        {EX_TRANSACTION_FAILED, "EX_TRANSACTION_FAILED"},
};

template <size_t N>
const char* nameOf(const Name (&names)[N], int32_t value) {
    for (const Name& name : names)
        if (name.value == value) return name.text;
    return nullptr;
}

template <size_t N>
std::string nameOrNumber(const Name (&names)[N], int32_t value) {
    const char* const name = nameOf(names, value);
    return name != nullptr ? name : std::to_string(value);
}

std::string describe(const AStatus& status) {
    if (status.exception == EX_NONE) return "No error";
    std::string text = "Status(" + std::to_string(status.exception) + ", " +
                       nameOrNumber(kExceptionNames, status.exception) + "): '";
    if (status.exception == EX_SERVICE_SPECIFIC) {
        text += std::to_string(status.error) + ": ";
    } else if (status.exception == EX_TRANSACTION_FAILED) {
        text += nameOrNumber(kStatusNames, status.error) + ": ";
    }
    return text + status.message + "'";
}

// Shared by every success, so that the common reply allocates nothing. Never freed: statuses may
// outlive static destruction.
AStatus* sharedOk() {
    static AStatus* const ok = new AStatus;
    return ok;
}

AStatus* fromException(binder_exception_t exception, const char* message) {
    const binder_exception_t known = knownException(exception);
    const int32_t error = known == EX_TRANSACTION_FAILED ? STATUS_FAILED_TRANSACTION : 0;
    return new AStatus{known, error, message};
}

}  // namespace

binder_status_t knownStatus(int32_t status) {
    if (status == STATUS_OK || nameOf(kStatusNames, status) != nullptr) return status;
    logWarning("status %d has no name, reported as UNKNOWN_ERROR", status);
    return STATUS_UNKNOWN_ERROR;
}

binder_exception_t knownException(int32_t exception) {
    // The reply header's mark is not an exception anybody may raise.
    if (exception != kHasReplyHeader && nameOf(kExceptionNames, exception) != nullptr)
        return exception;
    logWarning("exception %d has no name, reported as EX_TRANSACTION_FAILED", exception);
    return EX_TRANSACTION_FAILED;
}

}  // namespace binder_ndk

using namespace binder_ndk;

AStatus* AStatus_newOk() {
    return sharedOk();
}

AStatus* AStatus_fromExceptionCode(binder_exception_t exception) {
    return fromException(exception, "");
}

AStatus* AStatus_fromExceptionCodeWithMessage(binder_exception_t exception, const char* message) {
    return fromException(exception, message);
}

AStatus* AStatus_fromServiceSpecificError(int32_t serviceSpecific) {
    return new AStatus{EX_SERVICE_SPECIFIC, serviceSpecific, ""};
}

AStatus* AStatus_fromServiceSpecificErrorWithMessage(int32_t serviceSpecific, const char* message) {
    return new AStatus{EX_SERVICE_SPECIFIC, serviceSpecific, message};
}

AStatus* AStatus_fromStatus(binder_status_t status) {
    const binder_status_t known = knownStatus(status);
    return new AStatus{known == STATUS_OK ? EX_NONE : EX_TRANSACTION_FAILED, known, ""};
}

bool AStatus_isOk(const AStatus* status) {
    return status->exception == EX_NONE;
}

binder_exception_t AStatus_getExceptionCode(const AStatus* status) {
    return knownException(status->exception);
}

int32_t AStatus_getServiceSpecificError(const AStatus* status) {
    return status->exception == EX_SERVICE_SPECIFIC ? status->error : 0;
}

binder_status_t AStatus_getStatus(const AStatus* status) {
    return status->exception == EX_TRANSACTION_FAILED ? knownStatus(status->error) : STATUS_OK;
}

const char* AStatus_getMessage(const AStatus* status) {
    return status->message.c_str();
}

const char* AStatus_getDescription(const AStatus* status) {
    const std::string text = describe(*status);
    char* const copy = new char[text.size() + 1];
    std::memcpy(copy, text.c_str(), text.size() + 1);
    return copy;
}

void AStatus_deleteDescription(const char* description) {
    delete[] description;
}

void AStatus_delete(AStatus* status) {
    if (status != sharedOk()) delete status;
}
