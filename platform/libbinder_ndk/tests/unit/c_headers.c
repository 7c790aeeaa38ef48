// SPDX-License-Identifier: Apache-2.0
//
// The C headers are C: that this file compiles is the test.
#include <android/binder_ibinder.h>
#include <android/binder_ibinder_platform.h>
#include <android/binder_manager.h>
#include <android/binder_parcel.h>
#include <android/binder_parcel_platform.h>
#include <android/binder_process.h>
#include <android/binder_shell.h>
#include <android/binder_stability.h>
#include <android/binder_status.h>
#include <binder_context_manager.h>

_Static_assert(FLAG_PRIVATE_LOCAL == 0, "code outside the vendor image");
_Static_assert(sizeof(binder_status_t) == 4 && sizeof(binder_exception_t) == 4, "");
_Static_assert(sizeof(transaction_code_t) == 4 && sizeof(binder_flags_t) == 4, "");
