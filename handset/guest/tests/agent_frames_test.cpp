// SPDX-License-Identifier: Apache-2.0
//
// The agent's end of the conversation with the launcher, byte by byte.
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <string>
#include <string_view>

#include <android-base/unique_fd.h>
#include <gtest/gtest.h>

#include "handset/guest/frames.h"

namespace handset {
namespace {

using android::base::unique_fd;

using namespace std::string_literals;

class AgentFrames : public testing::Test {
  protected:
    void SetUp() override {
        int ends[2];
        ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, ends), 0);
        mLauncher.reset(ends[0]);
        mAgent.reset(ends[1]);
    }

    // Sends as the launcher does.
    void give(std::string_view bytes) {
        ASSERT_EQ(write(mLauncher.get(), bytes.data(), bytes.size()),
                  static_cast<ssize_t>(bytes.size()));
    }

    // What the launcher receives.
    std::string taken() {
        std::array<char, 256> bytes{};
        const ssize_t count = read(mLauncher.get(), bytes.data(), bytes.size());
        return {bytes.data(), static_cast<std::size_t>(count > 0 ? count : 0)};
    }

    unique_fd mLauncher;
    unique_fd mAgent;
};

TEST_F(AgentFrames, FrameIsKindLengthAndPayload) {
    Channel channel(mAgent.get());
    ASSERT_TRUE(channel.send(Reply::Output, "hello"));
    EXPECT_EQ(taken(), "O\x05\0\0\0hello"s);
}

TEST_F(AgentFrames, NumberComesBeforeTheText) {
    Channel channel(mAgent.get());
    ASSERT_TRUE(channel.send(Reply::Failed, 0x01020304, "ls"));
    EXPECT_EQ(taken(), "F\x06\0\0\0\x04\x03\x02\x01ls"s);
}

TEST_F(AgentFrames, EmptyPayloadIsAFrame) {
    Channel channel(mAgent.get());
    give("S\0\0\0\0"s);
    ASSERT_TRUE(channel.receive());
    const std::optional<Frame> frame = channel.next();
    ASSERT_TRUE(frame);
    EXPECT_EQ(frame->kind, Request::Start);
    EXPECT_EQ(frame->payload, "");
}

TEST_F(AgentFrames, ZeroBytesAreKept) {
    Channel channel(mAgent.get());
    give("I\x03\0\0\0a\0b"s);
    ASSERT_TRUE(channel.receive());
    EXPECT_EQ(channel.next()->payload, "a\0b"s);
}

TEST_F(AgentFrames, FrameInPiecesComesWhenItIsWhole) {
    Channel channel(mAgent.get());
    for (const char byte : "A\x02\0\0\0l"s) {
        give(std::string_view(&byte, 1));
        ASSERT_TRUE(channel.receive());
        EXPECT_FALSE(channel.next());
    }
    give("s");
    ASSERT_TRUE(channel.receive());
    EXPECT_EQ(channel.next()->payload, "ls");
}

TEST_F(AgentFrames, SeveralFramesInOnePieceComeInOrder) {
    Channel channel(mAgent.get());
    give("A\x01\0\0\0aA\x01\0\0\0bS\0\0\0\0"s);
    ASSERT_TRUE(channel.receive());
    EXPECT_EQ(channel.next()->payload, "a");
    EXPECT_EQ(channel.next()->payload, "b");
    EXPECT_EQ(channel.next()->kind, Request::Start);
    EXPECT_FALSE(channel.next());
}

TEST_F(AgentFrames, LongestPayloadIsTaken) {
    Channel channel(mAgent.get());
    give("I\0\0\x10\0"s);
    EXPECT_TRUE(channel.receive());
}

TEST_F(AgentFrames, LongerPayloadEndsTheSession) {
    Channel channel(mAgent.get());
    give("I\x01\0\x10\0"s);
    EXPECT_FALSE(channel.receive());
}

TEST_F(AgentFrames, LauncherThatHangsUpEndsTheSession) {
    Channel channel(mAgent.get());
    mLauncher.reset();
    EXPECT_FALSE(channel.receive());
}

TEST(AgentNumbers, AreLittleEndian) {
    EXPECT_EQ(number16At("\x18\0\x50\x01"s, 0), 24);
    EXPECT_EQ(number16At("\x18\0\x50\x01"s, 2), 336);
}

TEST(AgentNumbers, AreZeroBeyondThePayload) {
    EXPECT_EQ(number16At("", 0), 0);
    EXPECT_EQ(number16At("\x18\0\x50"s, 2), 0);
}

}  // namespace
}  // namespace handset
