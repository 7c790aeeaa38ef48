// SPDX-License-Identifier: Apache-2.0
// An owned file descriptor.
#pragma once

#include <unistd.h>

#include <utility>

namespace handset {

/// Owns one file descriptor and closes it; -1 means none. Moves, never copies.
class UniqueFd {
  public:
    UniqueFd() = default;
    explicit UniqueFd(int fd) : mFd(fd) {}
    UniqueFd(UniqueFd&& other) noexcept : mFd(std::exchange(other.mFd, -1)) {}
    UniqueFd& operator=(UniqueFd&& other) noexcept {
        reset(std::exchange(other.mFd, -1));
        return *this;
    }
    ~UniqueFd() { reset(); }

    /// The descriptor, still owned by this object.
    int get() const { return mFd; }

    /// True when a descriptor is held.
    bool isOpen() const { return mFd >= 0; }

    /// Closes what is held and takes `fd` instead.
    void reset(int fd = -1) {
        if (mFd >= 0) close(mFd);
        mFd = fd;
    }

  private:
    int mFd = -1;
};

}  // namespace handset
