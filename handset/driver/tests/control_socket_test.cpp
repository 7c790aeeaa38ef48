// SPDX-License-Identifier: Apache-2.0
//
// The control socket and its client.
#include "handset/driver/control_socket.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <atomic>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "handset/common/control_client.h"
#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

using android::base::Result;
using android::base::unique_fd;

// A control socket served from a thread; it answers "ok" and the request turned round.
class EchoServer {
  public:
    explicit EchoServer(const std::string& path)
        : mControl(std::move(*ControlSocket::listenAt(
                  path,
                  [](std::string_view request) {
                      return request == "bad"
                                     ? std::string("error no good")
                                     : "ok " + std::string(request.rbegin(), request.rend());
                  }))),
          mThread([this] {
              while (!mStop) {
                  pollfd polled{mControl->descriptor(), POLLIN, 0};
                  if (poll(&polled, 1, 10) > 0) mControl->serve();
              }
          }) {}
    ~EchoServer() {
        mStop = true;
        mThread.join();
    }

  private:
    std::unique_ptr<ControlSocket> mControl;
    std::atomic<bool> mStop{false};
    std::thread mThread;
};

int connectTo(const std::string& path) {
    const int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, path.size());
    EXPECT_EQ(connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    return fd;
}

class Control : public testing::Test {
  protected:
    TemporaryDir mDirectory;
    std::string mPath = fileIn(mDirectory, "control");
};

TEST_F(Control, ARequestIsAnswered) {
    const EchoServer server(mPath);
    const Result<std::string> answer = askDriver(mPath, "abc");
    ASSERT_TRUE(answer);
    EXPECT_EQ(*answer, "cba");
}

TEST_F(Control, ARefusalIsAnError) {
    const EchoServer server(mPath);
    const Result<std::string> answer = askDriver(mPath, "bad");
    ASSERT_FALSE(answer);
    EXPECT_EQ(answer.error().message(), "no good");
}

TEST_F(Control, ASilentClientHoldsNobodyUp) {
    const EchoServer server(mPath);
    const unique_fd silent(connectTo(mPath));
    const Result<std::string> answer = askDriver(mPath, "abc");
    ASSERT_TRUE(answer);
    EXPECT_EQ(*answer, "cba");
}

TEST_F(Control, SeveralRequestsInOnePieceAreAnsweredInOrder) {
    const EchoServer server(mPath);
    const unique_fd client(connectTo(mPath));
    ASSERT_EQ(write(client.get(), "ab\ncd\ne", 7), 7);
    std::string answers;
    char part[64];
    while (answers.size() < 12) {
        const ssize_t size = read(client.get(), part, sizeof part);
        ASSERT_GT(size, 0);
        answers.append(part, static_cast<size_t>(size));
    }
    EXPECT_EQ(answers, "ok ba\nok dc\n");
}

TEST_F(Control, OnlyRootMayOpenIt) {
    const EchoServer server(mPath);
    struct stat attributes {};
    ASSERT_EQ(stat(mPath.c_str(), &attributes), 0);
    EXPECT_EQ(attributes.st_mode & 0777U, 0600U);
}

TEST_F(Control, ThePathGoesAwayWithTheServer) {
    { const EchoServer server(mPath); }
    EXPECT_NE(access(mPath.c_str(), F_OK), 0);
    const Result<std::string> answer = askDriver(mPath, "abc");
    ASSERT_FALSE(answer);
    EXPECT_EQ(answer.error().message(), "the driver does not answer: No such file or directory");
}

TEST_F(Control, ASocketLeftBehindIsReplacedAndAFileIsNot) {
    const int left = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    mPath.copy(address.sun_path, mPath.size());
    ASSERT_EQ(bind(left, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    close(left);
    { const EchoServer server(mPath); }

    ASSERT_EQ(close(creat(mPath.c_str(), 0600)), 0);
    const auto refused = ControlSocket::listenAt(mPath, [](auto) { return std::string(); });
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error().message(), "control socket " + mPath + ": Address already in use");
    EXPECT_EQ(access(mPath.c_str(), F_OK), 0);
}

TEST_F(Control, APathTooLongForASocketIsRefused) {
    const std::string path = "/tmp/" + std::string(110, 'x');
    const auto refused = ControlSocket::listenAt(path, [](auto) { return std::string(); });
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error().message(), "control socket " + path + ": longer than 107 characters");
}

}  // namespace
}  // namespace handset
