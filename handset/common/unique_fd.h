// SPDX-License-Identifier: Apache-2.0
// A file descriptor that closes itself.
#pragma once

#include <unistd.h>

#include <utility>

namespace handset {

/// Owns one file descriptor; -1 stands for none. Move only.
class UniqueFd {
  public:
    UniqueFd() = default;
    explicit UniqueFd(int fd) : fd_(fd) {}
    UniqueFd(UniqueFd&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    UniqueFd& operator=(UniqueFd&& other) noexcept {
        reset(std::exchange(other.fd_, -1));
        return *this;
    }
    ~UniqueFd() { reset(); }

    explicit operator bool() const { return fd_ >= 0; }
    int get() const { return fd_; }

    /// Gives the descriptor away; the caller closes it.
    int release() { return std::exchange(fd_, -1); }

    /// Closes what is held and takes `fd` over.
    void reset(int fd = -1) {
        if (fd_ >= 0) close(fd_);
        fd_ = fd;
    }

  private:
    int fd_ = -1;
};

}  // namespace handset
