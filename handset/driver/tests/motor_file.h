// SPDX-License-Identifier: Apache-2.0
//
// A motor's device, open, and what a client asks of it; the answers are short texts: a number, or
// the error's name.
#pragma once

#include <linux/input.h>

#include <cstdint>
#include <string>

namespace handset {

class MotorFile {
  public:
    explicit MotorFile(const std::string& path, int flags);
    ~MotorFile();
    MotorFile(const MotorFile&) = delete;
    MotorFile& operator=(const MotorFile&) = delete;

    int fd() const { return mFd; }

    // The id that the upload of a custom effect {0, index} gets.
    std::string upload(int id = -1, int16_t index = 0, uint16_t length = 500) const;

    // The id that an upload gets, which is written back into the record.
    std::string upload(ff_effect& effect) const;

    std::string erase(int id) const;

    // Writes one force-feedback event.
    std::string event(uint16_t code, int32_t value) const;

    // A custom effect of `count` values at `data`.
    static ff_effect record(int id, uint16_t length, int16_t* data, uint32_t count);

  private:
    int mFd;
};

}  // namespace handset
