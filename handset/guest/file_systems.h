// SPDX-License-Identifier: Apache-2.0
//
// The file systems and device nodes a guest needs beside its root.
#pragma once

#include <string>

namespace handset {

// Mounts /proc, /sys, /dev and the like, and the directory for a session's results at
// /run/handset/out, which the launcher exports from outside or which stays in the guest's memory.
// Opens /dev/binder, /dev/hwbinder and /dev/vndbinder to every user, as the phone's init does, and
// the directories above the running program, whatever their modes are outside.
// Returns what went wrong, empty when nothing did.
std::string setUpFileSystems();

}  // namespace handset
