// SPDX-License-Identifier: Apache-2.0
//
// The doctor's questions over binder.
#pragma once

#include "vibctl/doctor/doctor.h"

namespace vibctl {

// Asks the service manager and the service; waits a few seconds at most for either.
BinderFacts askOverBinder();

}  // namespace vibctl
