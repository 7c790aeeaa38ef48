// SPDX-License-Identifier: Apache-2.0
//
// A motor's device, open.
#include "handset/driver/tests/motor_file.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include "handset/driver/tests/client_process.h"

namespace handset {

MotorFile::MotorFile(const std::string& path, int flags)
    : mFd(open(path.c_str(), flags | O_CLOEXEC)) {}

MotorFile::~MotorFile() {
    if (mFd >= 0) close(mFd);
}

std::string MotorFile::upload(int id, int16_t index, uint16_t length) const {
    int16_t data[2] = {0, index};
    ff_effect effect = record(id, length, data, 2);
    return upload(effect);
}

std::string MotorFile::upload(ff_effect& effect) const {
    const std::string result = outcome(ioctl(mFd, EVIOCSFF, &effect));
    return result == "0" ? std::to_string(effect.id) : result;
}

std::string MotorFile::erase(int id) const {
    return outcome(ioctl(mFd, EVIOCRMFF, id));
}

std::string MotorFile::event(uint16_t code, int32_t value) const {
    input_event event{};
    event.type = EV_FF;
    event.code = code;
    event.value = value;
    return outcome(write(mFd, &event, sizeof event));
}

ff_effect MotorFile::record(int id, uint16_t length, int16_t* data, uint32_t count) {
    ff_effect effect{};
    effect.type = FF_PERIODIC;
    effect.id = static_cast<int16_t>(id);
    effect.replay.length = length;
    effect.u.periodic.waveform = FF_CUSTOM;
    effect.u.periodic.custom_len = count;
    effect.u.periodic.custom_data = data;
    return effect;
}

}  // namespace handset
