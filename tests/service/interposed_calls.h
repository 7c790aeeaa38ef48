// SPDX-License-Identifier: Apache-2.0
//
// Which kernel the replaced C library functions ask.
#pragma once

namespace imitated {

class ImitatedKernel;

// Null: every call goes to the real kernel.
void setActiveKernel(ImitatedKernel* kernel);

}  // namespace imitated
