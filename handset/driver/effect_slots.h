// SPDX-License-Identifier: Apache-2.0
//
// The force-feedback effects a motor holds, under the rules of the kernel's input core
// (drivers/input/ff-core.c), which stands between a client and every real driver.
#pragma once

#include <linux/input.h>

#include <cstdint>
#include <optional>
#include <vector>

namespace handset {

// Not thread-safe: the core serialises these calls, and so does the motor.
class EffectSlots {
  public:
    // Identifies the open file an effect belongs to.
    using Owner = uint64_t;

    // `count` slots, ids 0 to count - 1.
    explicit EffectSlots(unsigned count) : mSlots(count) {}

    // Whether `owner` may upload `effect`: the id it would get (the lowest free one for id -1, or
    // its own), or a negative error. Kinds the motor does not have are EINVAL, as are unused ids
    // and an update to another kind; another owner's id is EACCES, no free slot ENOSPC.
    int check(Owner owner, const ff_effect& effect) const;

    // Takes the effect. Same result as check().
    int upload(Owner owner, const ff_effect& effect);

    // Frees a slot: 0, EINVAL for an unused id or EACCES for another owner's (both negative).
    int erase(Owner owner, int id);

    // Whether erase() would succeed, and its error otherwise.
    int checkErase(Owner owner, int id) const;

    // Frees every slot of an owner and returns the ids, in order.
    std::vector<int> eraseAllOf(Owner owner);

  private:
    struct Slot {
        std::optional<Owner> owner;
        uint16_t type = 0;
        uint16_t waveform = 0;  // of a periodic effect
    };

    int checkAccess(Owner owner, int id) const;

    std::vector<Slot> mSlots;
};

// What the core hands to the driver: rumble as a sine, everything else as it is.
ff_effect asDriverSees(const ff_effect& effect);

}  // namespace handset
