// SPDX-License-Identifier: Apache-2.0
//
// A force-feedback motor for the fake kernel, which follows the input subsystem's rules: the
// lowest free id for a new effect, ENOSPC when there is none, EINVAL for an id that is not in use.
//
//     kernel.addDevice("/dev/input/event7", std::make_shared<FakeMotor>());
//
// Its calls are recorded with their fields:
//   upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 custom="00 00 00 00"
//   erase id=0
//   event type=21 code=96 value=5000
#pragma once

#include <linux/input.h>

#include <cstddef>
#include <set>
#include <string>

#include "tests/fake_kernel.h"

namespace fake {

class FakeMotor : public Device {
  public:
    // `effectsMax`: how many effects it holds at a time.
    explicit FakeMotor(int effectsMax = 16) : mEffectsMax(effectsMax) {}

    ssize_t write(const void* data, size_t size) override;
    int ioctl(unsigned long request, void* argument) override;
    std::string describeWrite(const void* data, size_t size) const override;
    std::string describeIoctl(unsigned long request, void* argument) const override;

  private:
    int upload(ff_effect& effect);

    const int mEffectsMax;
    std::set<int> mIds;
};

}  // namespace fake
