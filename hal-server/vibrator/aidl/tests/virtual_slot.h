// SPDX-License-Identifier: Apache-2.0
//
// Where a virtual operation stands in its class's virtual table. A virtual operation's member
// pointer holds its place (Itanium C++ ABI, 2.3, and its variant for Arm), so no object is needed.
#pragma once

#include <cstdint>
#include <cstring>

// The slot, the two destructor entries of a class with a virtual destructor being slots 0 and 1;
// -1 for an operation that is not virtual.
template <typename Member>
int virtualSlot(Member member) {
    struct {
        uintptr_t pointer;
        uintptr_t adjustment;
    } representation;
    static_assert(sizeof(member) == sizeof(representation));
    memcpy(&representation, &member, sizeof(member));
#if defined(__aarch64__)
    const bool isVirtual = (representation.adjustment & 1) != 0;
    const uintptr_t offset = representation.pointer;
#else
    const bool isVirtual = (representation.pointer & 1) != 0;
    const uintptr_t offset = representation.pointer - 1;
#endif
    return isVirtual ? static_cast<int>(offset / sizeof(void*)) : -1;
}
