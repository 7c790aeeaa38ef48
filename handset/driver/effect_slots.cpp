// SPDX-License-Identifier: Apache-2.0
//
// The force-feedback effects a motor holds.
#include "handset/driver/effect_slots.h"

#include <cerrno>

namespace handset {
namespace {

// The period, in milliseconds, of the sine the core turns a rumble into.
constexpr uint16_t kRumblePeriod = 50;

// The kinds the motor announces. Rumble is there wherever periodic effects are.
bool isKindKnown(const ff_effect& effect) {
    if (effect.type == FF_RUMBLE) return true;
    return effect.type == FF_PERIODIC && effect.u.periodic.waveform == FF_CUSTOM;
}

}  // namespace

ff_effect asDriverSees(const ff_effect& effect) {
    if (effect.type != FF_RUMBLE) return effect;
    // Two thirds of the strong motor and one third of the weak one, halved to a signed magnitude.
    const int magnitude = effect.u.rumble.strong_magnitude / 3 + effect.u.rumble.weak_magnitude / 6;
    ff_effect sine = effect;
    sine.type = FF_PERIODIC;
    sine.u.periodic = {};
    sine.u.periodic.waveform = FF_SINE;
    sine.u.periodic.period = kRumblePeriod;
    sine.u.periodic.magnitude = static_cast<int16_t>(magnitude);
    return sine;
}

int EffectSlots::checkAccess(Owner owner, int id) const {
    if (id < 0 || static_cast<size_t>(id) >= mSlots.size()) return -EINVAL;
    const Slot& slot = mSlots[static_cast<size_t>(id)];
    if (!slot.owner) return -EINVAL;
    return *slot.owner == owner ? 0 : -EACCES;
}

int EffectSlots::check(Owner owner, const ff_effect& given) const {
    if (!isKindKnown(given)) return -EINVAL;
    if (given.id == -1) {
        for (size_t id = 0; id < mSlots.size(); ++id) {
            if (!mSlots[id].owner) return static_cast<int>(id);
        }
        return -ENOSPC;
    }
    if (const int error = checkAccess(owner, given.id); error != 0) return error;
    const ff_effect effect = asDriverSees(given);
    const Slot& slot = mSlots[static_cast<size_t>(given.id)];
    const bool same = slot.type == effect.type && slot.waveform == effect.u.periodic.waveform;
    return same ? given.id : -EINVAL;
}

int EffectSlots::upload(Owner owner, const ff_effect& given) {
    const int id = check(owner, given);
    if (id < 0) return id;
    const ff_effect effect = asDriverSees(given);
    mSlots[static_cast<size_t>(id)] = {owner, effect.type, effect.u.periodic.waveform};
    return id;
}

int EffectSlots::checkErase(Owner owner, int id) const {
    return checkAccess(owner, id);
}

int EffectSlots::erase(Owner owner, int id) {
    const int error = checkAccess(owner, id);
    if (error == 0) mSlots[static_cast<size_t>(id)].owner.reset();
    return error;
}

std::vector<int> EffectSlots::eraseAllOf(Owner owner) {
    std::vector<int> erased;
    for (size_t id = 0; id < mSlots.size(); ++id) {
        if (mSlots[id].owner != owner) continue;
        mSlots[id].owner.reset();
        erased.push_back(static_cast<int>(id));
    }
    return erased;
}

}  // namespace handset
