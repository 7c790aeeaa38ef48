// SPDX-License-Identifier: Apache-2.0
// Included before everything else in every source of the library: what the public headers declare
// is exported, all the rest stays inside.
#pragma once

#pragma GCC visibility push(default)
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
#pragma GCC visibility pop
