// SPDX-License-Identifier: Apache-2.0
//
// A client that talks to the binder driver itself, with objects of its own to give away: what it
// sends no library has checked, and what it receives no library has read.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

namespace raw {

/// The body of a transaction, put together by hand.
class Body {
  public:
    /// The interface token: strict mode policy, work source, header, descriptor.
    static Body withToken(std::string_view interface);

    Body& word(uint32_t value);
    Body& text(std::string_view ascii);  ///< String16
    Body& nullText();
    Body& nullBinder();
    /// A local object with its stability word.
    Body& binder(uint64_t key, uint32_t stability);

    std::vector<uint8_t> bytes;
    std::vector<uint64_t> offsets;
};

/// What came back.
struct Reply {
    enum class Kind { kData, kStatus, kDead, kFailed };
    Kind kind = Kind::kFailed;
    int32_t status = 0;                ///< of kStatus
    std::vector<uint32_t> words = {};  ///< of kData
};

/// One open binder device. Not thread-safe.
class Binder {
  public:
    Binder();
    ~Binder();
    Binder(const Binder&) = delete;
    Binder& operator=(const Binder&) = delete;

    bool isOpen() const { return mMapping != nullptr; }

    /// A synchronous call to the context manager.
    Reply callManager(uint32_t code, const Body& body);

    /// True when the context manager answers a ping.
    bool pingManager();

  private:
    bool writeRead(const std::vector<uint8_t>& commands, std::vector<uint8_t>& answers);
    std::optional<Reply> handle(const std::vector<uint8_t>& answers,
                                std::vector<uint8_t>& commands);

    int mDescriptor = -1;
    void* mMapping = nullptr;
};

}  // namespace raw
