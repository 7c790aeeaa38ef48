// SPDX-License-Identifier: Apache-2.0
//
// The socket through which a running driver is asked for things: a line in, a line out.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

namespace handset {

// Serves any number of clients from one thread; a client that says nothing holds nobody up.
class ControlSocket {
  public:
    // Turns a request (a line without its end) into the line that answers it.
    using Answer = std::function<std::string(std::string_view request)>;

    // Listens at `path`, which only root may open; a socket left there by a driver that died is
    // replaced. The path is removed with this object.
    static android::base::Result<std::unique_ptr<ControlSocket>> listenAt(const std::string& path,
                                                                          Answer answer);

    ~ControlSocket();
    ControlSocket(const ControlSocket&) = delete;
    ControlSocket& operator=(const ControlSocket&) = delete;

    // Becomes readable when serve() has something to do.
    int descriptor() const { return mEvents.get(); }

    // Answers what has come in; never waits.
    void serve();

  private:
    struct Client {
        android::base::unique_fd socket;
        std::string received;
    };

    explicit ControlSocket(Answer answer) : mAnswer(std::move(answer)) {}

    void accept();
    bool serveClient(Client& client);

    std::string mPath;  // empty until the socket is there
    Answer mAnswer;
    android::base::unique_fd mListener;
    android::base::unique_fd mEvents;
    std::map<int, Client> mClients;
};

}  // namespace handset
