// SPDX-License-Identifier: Apache-2.0
// The control socket and its client.
#include "driver/control_socket.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <atomic>
#include <string>
#include <thread>

#include "phone/control_client.h"
#include "temporary_folder.h"

namespace handset {
namespace {

/// A control socket served from a thread; it answers "ok" and the request turned round.
class EchoServer {
  public:
    explicit EchoServer(const std::string& path)
        : control_(std::move(*ControlSocket::listenAt(
                  path,
                  [](std::string_view request) {
                      return request == "bad"
                                     ? std::string("error no good")
                                     : "ok " + std::string(request.rbegin(), request.rend());
                  }))),
          thread_([this] {
              while (!stop_) {
                  pollfd polled{control_->descriptor(), POLLIN, 0};
                  if (poll(&polled, 1, 10) > 0) control_->serve();
              }
          }) {}
    ~EchoServer() {
        stop_ = true;
        thread_.join();
    }

  private:
    std::unique_ptr<ControlSocket> control_;
    std::atomic<bool> stop_{false};
    std::thread thread_;
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
    TemporaryFolder folder_;
    std::string path_ = folder_.file("control");
};

TEST_F(Control, ARequestIsAnswered) {
    const EchoServer server(path_);
    const Result<std::string> answer = askDriver(path_, "abc");
    ASSERT_TRUE(answer);
    EXPECT_EQ(*answer, "cba");
}

TEST_F(Control, ARefusalIsAnError) {
    const EchoServer server(path_);
    const Result<std::string> answer = askDriver(path_, "bad");
    ASSERT_FALSE(answer);
    EXPECT_EQ(answer.error().text, "no good");
}

TEST_F(Control, ASilentClientHoldsNobodyUp) {
    const EchoServer server(path_);
    const UniqueFd silent(connectTo(path_));
    const Result<std::string> answer = askDriver(path_, "abc");
    ASSERT_TRUE(answer);
    EXPECT_EQ(*answer, "cba");
}

TEST_F(Control, SeveralRequestsInOnePieceAreAnsweredInOrder) {
    const EchoServer server(path_);
    const UniqueFd client(connectTo(path_));
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
    const EchoServer server(path_);
    struct stat attributes {};
    ASSERT_EQ(stat(path_.c_str(), &attributes), 0);
    EXPECT_EQ(attributes.st_mode & 0777U, 0600U);
}

TEST_F(Control, ThePathGoesAwayWithTheServer) {
    { const EchoServer server(path_); }
    EXPECT_NE(access(path_.c_str(), F_OK), 0);
    const Result<std::string> answer = askDriver(path_, "abc");
    ASSERT_FALSE(answer);
    EXPECT_EQ(answer.error().text, "the driver does not answer: No such file or directory");
}

TEST_F(Control, ASocketLeftBehindIsReplacedAndAFileIsNot) {
    const int left = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path_.copy(address.sun_path, path_.size());
    ASSERT_EQ(bind(left, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    close(left);
    { const EchoServer server(path_); }

    ASSERT_EQ(close(creat(path_.c_str(), 0600)), 0);
    const auto refused = ControlSocket::listenAt(path_, [](auto) { return std::string(); });
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error().text, "control socket " + path_ + ": Address already in use");
    EXPECT_EQ(access(path_.c_str(), F_OK), 0);
}

TEST_F(Control, APathTooLongForASocketIsRefused) {
    const std::string path = "/tmp/" + std::string(110, 'x');
    const auto refused = ControlSocket::listenAt(path, [](auto) { return std::string(); });
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.error().text, "control socket " + path + ": longer than 107 characters");
}

}  // namespace
}  // namespace handset
