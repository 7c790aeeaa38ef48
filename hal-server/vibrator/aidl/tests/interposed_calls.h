// SPDX-License-Identifier: Apache-2.0
//
// Which kernel the replaced C library functions ask.
#pragma once

namespace fake {

class FakeKernel;

// Null: every call goes to the real kernel.
void setActiveKernel(FakeKernel* kernel);

}  // namespace fake
