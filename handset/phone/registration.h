// SPDX-License-Identifier: Apache-2.0
//
// Whether clients find the service.
#pragma once

namespace handset {

inline constexpr int kProbeDone = 0;
inline constexpr int kProbeFailed = 1;

// Asks the service manager, over and over, until the service is registered, or is no more. For a
// process of its own: a question waits for the manager's answer, for ever if it takes for ever.
// SIGTERM ends it between two questions: one that is cut off would leave the answer undelivered.
// Returns kProbeDone, or kProbeFailed where there is no binder or SIGTERM came first.
int awaitService(bool registered);

// What the service manager says now.
enum class Registration { kRegistered, kUnknown, kNoAnswer };
Registration askRegistration();

}  // namespace handset
