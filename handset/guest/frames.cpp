// SPDX-License-Identifier: Apache-2.0
//
// Cutting the port's byte stream into frames and writing frames to it.
#include "handset/guest/frames.h"

#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace handset {
namespace {

constexpr std::size_t kHeaderSize = 5;

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "numbers go out as they lie in memory");

bool writeAll(int fd, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = write(fd, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

std::uint32_t payloadLength(std::string_view header) {
    std::uint32_t length = 0;
    std::memcpy(&length, header.data() + 1, sizeof(length));
    return length;
}

}  // namespace

bool Channel::receive() {
    std::array<char, 32UL * 1024> chunk{};
    ssize_t got = -1;
    do {
        got = read(mFd, chunk.data(), chunk.size());
    } while (got < 0 && errno == EINTR);
    if (got <= 0) return false;
    mReceived.append(chunk.data(), static_cast<std::size_t>(got));
    return mReceived.size() < kHeaderSize || payloadLength(mReceived) <= kMaxPayload;
}

std::optional<Frame> Channel::next() {
    if (mReceived.size() < kHeaderSize) return std::nullopt;
    const std::size_t length = payloadLength(mReceived);
    if (mReceived.size() < kHeaderSize + length) return std::nullopt;
    Frame frame{static_cast<Request>(mReceived[0]), mReceived.substr(kHeaderSize, length)};
    mReceived.erase(0, kHeaderSize + length);
    return frame;
}

bool Channel::send(Reply kind, std::string_view payload) {
    const auto length = static_cast<std::uint32_t>(payload.size());
    std::string frame(kHeaderSize, static_cast<char>(kind));
    std::memcpy(frame.data() + 1, &length, sizeof(length));
    frame += payload;
    return writeAll(mFd, frame);
}

bool Channel::send(Reply kind, std::uint32_t number, std::string_view text) {
    std::string payload(sizeof(number), '\0');
    std::memcpy(payload.data(), &number, sizeof(number));
    payload += text;
    return send(kind, payload);
}

std::uint16_t number16At(std::string_view payload, std::size_t offset) {
    std::uint16_t number = 0;
    if (payload.size() >= offset + sizeof(number)) {
        std::memcpy(&number, payload.data() + offset, sizeof(number));
    }
    return number;
}

}  // namespace handset
