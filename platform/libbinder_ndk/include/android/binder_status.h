// SPDX-License-Identifier: Apache-2.0
//
// Results of binder calls: the transport's status codes, the exceptions a service may answer with,
// and AStatus, which carries either.
#pragma once

#include <errno.h>
#include <stdbool.h>
#include <stdint.h>

#include <android/binder_bionic_compat.h>

#if !defined(__ANDROID_API__)
#error "define __ANDROID_API__ (31 or above) to say which API level the code is written for"
#endif

__BEGIN_DECLS

// Transport results. Negative errno values where the system has a fitting one.
enum {
    STATUS_OK = 0,

    STATUS_UNKNOWN_ERROR = (-2147483647 - 1),
    STATUS_NO_MEMORY = -ENOMEM,
    STATUS_INVALID_OPERATION = -ENOSYS,
    STATUS_BAD_VALUE = -EINVAL,
    STATUS_BAD_TYPE = STATUS_UNKNOWN_ERROR + 1,
    STATUS_NAME_NOT_FOUND = -ENOENT,
    STATUS_PERMISSION_DENIED = -EPERM,
    STATUS_NO_INIT = -ENODEV,
    STATUS_ALREADY_EXISTS = -EEXIST,
    STATUS_DEAD_OBJECT = -EPIPE,
    STATUS_FAILED_TRANSACTION = STATUS_UNKNOWN_ERROR + 2,
    STATUS_BAD_INDEX = -EOVERFLOW,
    STATUS_NOT_ENOUGH_DATA = -ENODATA,
    STATUS_WOULD_BLOCK = -EWOULDBLOCK,
    STATUS_TIMED_OUT = -ETIMEDOUT,
    STATUS_UNKNOWN_TRANSACTION = -EBADMSG,
    STATUS_FDS_NOT_ALLOWED = STATUS_UNKNOWN_ERROR + 7,
    STATUS_UNEXPECTED_NULL = STATUS_UNKNOWN_ERROR + 8,
};

// One of the STATUS_ values; a function never returns another.
typedef int32_t binder_status_t;

// What a service may answer instead of a result.
enum {
    EX_NONE = 0,
    EX_SECURITY = -1,
    EX_BAD_PARCELABLE = -2,
    EX_ILLEGAL_ARGUMENT = -3,
    EX_NULL_POINTER = -4,
    EX_ILLEGAL_STATE = -5,
    EX_NETWORK_MAIN_THREAD = -6,
    EX_UNSUPPORTED_OPERATION = -7,
    // Carries an error number of the service's own, AStatus_getServiceSpecificError.
    EX_SERVICE_SPECIFIC = -8,
    EX_PARCELABLE = -9,

    // Never travels: the call itself failed, AStatus_getStatus says how.
    EX_TRANSACTION_FAILED = -129,
};

// One of the EX_ values; any other is taken as EX_TRANSACTION_FAILED.
typedef int32_t binder_exception_t;

struct AStatus;
// The outcome of a call: success, an exception with a message, or a transport failure.
typedef struct AStatus AStatus;

// A success. All successes are one shared object; deleting it does nothing.
__attribute__((warn_unused_result)) AStatus* AStatus_newOk(void) __INTRODUCED_IN(29);

// A new status, to be deleted by the caller; ok for EX_NONE. An unknown exception and
// EX_TRANSACTION_FAILED give the transport failure STATUS_FAILED_TRANSACTION.
__attribute__((warn_unused_result)) AStatus* AStatus_fromExceptionCode(binder_exception_t exception)
        __INTRODUCED_IN(29);

// As above with a text for people, copied. `message` must not be null.
__attribute__((warn_unused_result)) AStatus* AStatus_fromExceptionCodeWithMessage(
        binder_exception_t exception, const char* message) __INTRODUCED_IN(29);

// A new status of EX_SERVICE_SPECIFIC, an error even when `serviceSpecific` is 0.
__attribute__((warn_unused_result)) AStatus* AStatus_fromServiceSpecificError(
        int32_t serviceSpecific) __INTRODUCED_IN(29);

// As above with a text for people, copied. `message` must not be null.
__attribute__((warn_unused_result)) AStatus* AStatus_fromServiceSpecificErrorWithMessage(
        int32_t serviceSpecific, const char* message) __INTRODUCED_IN(29);

// A new status: ok for STATUS_OK, else EX_TRANSACTION_FAILED with that status.
__attribute__((warn_unused_result)) AStatus* AStatus_fromStatus(binder_status_t status)
        __INTRODUCED_IN(29);

// True exactly when the exception is EX_NONE.
bool AStatus_isOk(const AStatus* status) __INTRODUCED_IN(29);

// The exception, EX_NONE for a success.
binder_exception_t AStatus_getExceptionCode(const AStatus* status) __INTRODUCED_IN(29);

// The service's own error number; 0 unless the exception is EX_SERVICE_SPECIFIC.
int32_t AStatus_getServiceSpecificError(const AStatus* status) __INTRODUCED_IN(29);

// The transport's result; STATUS_OK unless the exception is EX_TRANSACTION_FAILED.
binder_status_t AStatus_getStatus(const AStatus* status) __INTRODUCED_IN(29);

// The string that came with the status, "" when none. Belongs to the status, never null.
const char* AStatus_getMessage(const AStatus* status) __INTRODUCED_IN(29);

// The whole status as a text for people; to be freed with AStatus_deleteDescription.
__attribute__((warn_unused_result)) const char* AStatus_getDescription(const AStatus* status)
        __INTRODUCED_IN(30);

// Frees a string of AStatus_getDescription. Null is allowed.
void AStatus_deleteDescription(const char* description) __INTRODUCED_IN(30);

// Frees a status. Null is allowed.
void AStatus_delete(AStatus* status) __INTRODUCED_IN(29);

__END_DECLS
