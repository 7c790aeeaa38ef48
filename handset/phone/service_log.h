// SPDX-License-Identifier: Apache-2.0
//
// The service's standard error, line by line with the time of each.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace handset {

// Takes what the service writes and puts it into a file, each line after the microseconds since boot
// at which it was written. The time is the kernel's: the service writes into a datagram socket, which
// stamps what it takes.
class ServiceLog {
  public:
    // Creates or empties the file at `path`, mode 0644.
    static android::base::Result<ServiceLog> create(const std::string& path);

    // What becomes the service's standard error.
    int writer() const { return mWriter.get(); }

    // Becomes readable when drain() has something to do.
    int reader() const { return mReader.get(); }

    // Writes what has come in; never waits.
    void drain();

    // Writes the beginning of a line whose end will not come.
    void flush();

  private:
    void take(std::string_view part, int64_t microseconds);

    android::base::unique_fd mReader;
    android::base::unique_fd mWriter;
    android::base::unique_fd mFile;
    std::string mPart;      // what is read at once
    std::string mLine;      // a line without its end yet
    int64_t mLineTime = 0;  // of its beginning
};

}  // namespace handset
