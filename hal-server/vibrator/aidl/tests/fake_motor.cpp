// SPDX-License-Identifier: Apache-2.0
//
// The rules are those of the kernel's input/ff-core.c.
#include "tests/fake_motor.h"

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <vector>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace fake {
namespace {

// EVIOCRMFF takes its number in place of the pointer.
int idArgument(void* argument) {
    return static_cast<int>(reinterpret_cast<intptr_t>(argument));
}

std::string describeUpload(const ff_effect& effect) {
    const ff_periodic_effect& periodic = effect.u.periodic;
    std::vector<uint8_t> custom(periodic.custom_len * sizeof(int16_t));
    if (!custom.empty()) memcpy(custom.data(), periodic.custom_data, custom.size());
    return fmt::format(
            "upload id={} type={:#x} waveform={:#x} length={} delay={} custom=\"{:02x}\"",
            effect.id, effect.type, periodic.waveform, effect.replay.length, effect.replay.delay,
            fmt::join(custom, " "));
}

}  // namespace

int FakeMotor::upload(ff_effect& effect) {
    if (effect.id != -1) return mIds.count(effect.id) != 0 ? 0 : -EINVAL;
    for (int id = 0; id < mEffectsMax; ++id) {
        if (mIds.insert(id).second) {
            effect.id = static_cast<int16_t>(id);
            return 0;
        }
    }
    return -ENOSPC;
}

int FakeMotor::ioctl(unsigned long request, void* argument) {
    switch (request) {
        case EVIOCSFF:
            return upload(*static_cast<ff_effect*>(argument));
        case EVIOCRMFF:
            return mIds.erase(idArgument(argument)) != 0 ? 0 : -EINVAL;
        default:
            return -ENOTTY;
    }
}

ssize_t FakeMotor::write(const void* /*data*/, size_t size) {
    return size < sizeof(input_event) ? -EINVAL : static_cast<ssize_t>(size);
}

std::string FakeMotor::describeWrite(const void* data, size_t size) const {
    input_event event = {};
    if (size != sizeof(event)) return fmt::format("event of {} bytes", size);
    memcpy(&event, data, sizeof(event));
    return fmt::format("event type={} code={} value={}", event.type, event.code, event.value);
}

std::string FakeMotor::describeIoctl(unsigned long request, void* argument) const {
    switch (request) {
        case EVIOCSFF:
            return describeUpload(*static_cast<const ff_effect*>(argument));
        case EVIOCRMFF:
            return fmt::format("erase id={}", idArgument(argument));
        default:
            return fmt::format("ioctl {:#x}", request);
    }
}

}  // namespace fake
