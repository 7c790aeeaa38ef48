// SPDX-License-Identifier: Apache-2.0
//
// A client that talks to /dev/binder without the binder library: the tool that starts the library's
// first users does not depend on their health, a test can send what the library never would, and the
// library is not its own witness.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/unique_fd.h>

namespace handset {

// The bytes of a request, written word by word.
class RequestBytes {
  public:
    RequestBytes& int32(int32_t value);
    RequestBytes& word(uint32_t value);
    RequestBytes& string16(std::string_view ascii);
    RequestBytes& nullString16();
    // Strict-mode word, work-source word, header word 'SYST', descriptor.
    RequestBytes& token(std::string_view descriptor);
    // A null binder object with its stability word.
    RequestBytes& nullBinder();
    // An object of the sender's own, known to it as `key`, with its stability word.
    RequestBytes& binder(uint64_t key, uint32_t stability);
    RequestBytes& bytes(size_t count, uint8_t value);

    const std::vector<uint8_t>& data() const { return mData; }
    // Where in the data the sender's own objects stand.
    const std::vector<uint64_t>& offsets() const { return mOffsets; }

  private:
    std::vector<uint8_t> mData;
    std::vector<uint64_t> mOffsets;
};

struct RawReply {
    enum class Kind {
        kData,    // BR_REPLY with data
        kStatus,  // BR_REPLY with TF_STATUS_CODE: `status` is the callee's
        kDead,    // BR_DEAD_REPLY
        kFailed,  // BR_FAILED_REPLY: the driver refused the request
        kError,   // the ioctl failed
    };
    Kind kind = Kind::kError;
    int32_t status = 0;
    std::vector<uint8_t> data;
    std::vector<uint32_t> handles;  // of the remote objects in data; each acquired once

    // The 32-bit word at byte `offset` of the data; 0 past its end.
    int32_t word(size_t offset) const;
    // The data as 32-bit words.
    std::vector<uint32_t> words() const;
};

// One open binder driver. Not thread-safe. Every buffer is freed at once; acquired handles live as
// long as the object. Its own objects can be given away and are never served.
class RawBinder {
  public:
    RawBinder();
    ~RawBinder();
    RawBinder(const RawBinder&) = delete;
    RawBinder& operator=(const RawBinder&) = delete;

    bool isOpen() const { return mFd.ok(); }
    // The open driver, for what is to be said to it in another way.
    int descriptor() const { return mFd.get(); }

    // Sends a two-way request and waits for the answer.
    RawReply transact(uint32_t handle, uint32_t code, const std::vector<uint8_t>& data,
                      const std::vector<uint64_t>& offsets = {});
    RawReply transact(uint32_t handle, uint32_t code, const RequestBytes& request);

    // True when the service manager answers a ping.
    bool pingServiceManager();

    // Asks the service manager for a service's handle.
    std::optional<uint32_t> checkService(std::string_view name);

  private:
    std::optional<RawReply> answered(uint32_t command, const uint8_t* payload);

    android::base::unique_fd mFd;
    void* mMap = nullptr;
    std::vector<uint8_t> mPending;  // commands to send with the next request
};

}  // namespace handset
