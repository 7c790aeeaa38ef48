// SPDX-License-Identifier: Apache-2.0
//
// What the launcher and the agent say to each other over the virtio-serial port.
//
// Both directions carry frames: one byte that says the kind, four bytes little-endian for the
// payload's length (at most kMaxPayload), the payload. One command runs at a time: the launcher
// describes it with Argument, Environment, Directory and Terminal frames, then Start runs it.
//
//   'A' "ls"              Argument
//   'A' "-l"              Argument
//   'E' "OUT=/run/x"      Environment
//   'D' "/tmp"            Directory
//   'S'                   Start                ->   'O' "total 0\n"   Output
//                                              ->   'X' 00 00 00 00   Exited
//
// launcher/agent_channel.py is the other end.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace handset {

// The longest payload either side may send, in bytes.
inline constexpr std::size_t kMaxPayload = 1 << 20;

// Standard input the launcher may send ahead of Consumed frames, in bytes.
inline constexpr std::size_t kInputWindow = 64UL * 1024;

// Frames from the launcher.
enum class Request : char {
    Argument = 'A',     // one word of the command, the program first
    Environment = 'E',  // "NAME=value" of the command's environment, which is otherwise empty
    Directory = 'D',    // the command's working directory, absolute; default "/"
    Terminal = 'T',     // rows and columns, two 16-bit little-endian numbers: before Start the
                        // command gets a terminal of that size, later the terminal is resized
    Start = 'S',        // runs the command described so far, empty payload
    Input = 'I',        // bytes for standard input; an empty payload closes it
    KernelLog = 'K',    // asks for the kernel log, at any time
    PowerOff = 'P',     // ends the guest
};

// Frames from the agent.
enum class Reply : char {
    Ready = 'R',     // the guest is up, sent once
    Failed = 'F',    // the command was not started: errno in four bytes, then what failed
    Output = 'O',    // bytes of standard output, or of the terminal
    Error = 'E',     // bytes of standard error
    Consumed = 'C',  // four bytes: how much more standard input the command has taken
    Exited = 'X',    // four bytes: the status waitpid() gave; all output has been sent before
    KernelLog = 'K'  // the kernel log as syslog(2) gives it, in frames that end with an empty one
};

// One frame as received.
struct Frame {
    Request kind;
    std::string payload;
};

// The agent's end of the port. Not thread-safe.
class Channel {
  public:
    // Takes the open port `fd`, which stays the caller's.
    explicit Channel(int fd) : mFd(fd) {}

    // Reads what has arrived into the buffer, blocking when nothing has. False when the launcher
    // has gone or has sent a frame longer than kMaxPayload.
    bool receive();

    // Takes the next whole frame out of the buffer; none when it is not complete yet.
    std::optional<Frame> next();

    // Sends one frame, blocking until the port has taken it. False when the launcher has gone.
    bool send(Reply kind, std::string_view payload);

    // Sends one frame whose payload is `number`, little-endian, followed by `text`.
    bool send(Reply kind, std::uint32_t number, std::string_view text = {});

  private:
    int mFd;
    std::string mReceived;
};

// The little-endian 16-bit number at `offset` of `payload`; 0 where the payload is too short.
std::uint16_t number16At(std::string_view payload, std::size_t offset);

}  // namespace handset
