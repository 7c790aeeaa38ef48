// SPDX-License-Identifier: Apache-2.0
//
// What a request makes the service do on the thread that serves it, as a tracer sees it and the log has
// it, and the same done by a bare program: no more than the system calls and the lines themselves.
#pragma once

#include <linux/input.h>
#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include <android-base/logging.h>

namespace bench {

// One call of the driver, or the start of a thread.
struct DriverCall {
    enum class Kind { kOpen, kRead, kWrite, kClose, kUpload, kErase, kEvent, kThread };
    Kind kind;
    std::string path = {};  // of the node
    int flags = 0;          // of an open
    size_t size = 0;        // of a read
    std::string data = {};  // of a write
    input_event event = {};
    ff_effect effect = {};
    std::vector<int16_t> samples = {};  // of an upload
    size_t file = 0;                    // filled by BareDriver
};

struct LogLine {
    std::string tag;
    android::base::LogSeverity severity;
    std::string text;
    bool isStreamed;  // or written in one piece
};

struct RecordedRequest {
    std::vector<DriverCall> calls;
    std::vector<LogLine> lines;
};

// What the service, process `service`, calls while `request` runs, on a thread of its own.
std::vector<DriverCall> traceCalls(pid_t service, const std::function<void()>& request);

// The lines of `log` that the main thread of process `service` has written.
std::vector<LogLine> linesOf(std::string_view log, pid_t service);

// The driver's files as a bare program holds them: what no record opens stays open.
class BareDriver {
  public:
    void prepare(std::vector<DriverCall>& calls);

    // Opens what stays open. False when a file cannot be opened.
    bool open();

    void carryOut(const DriverCall& call);

  private:
    struct File {
        std::string path;
        int fd = -1;
        bool isOpened = false;  // by a record
    };

    std::vector<File> mFiles;
    int16_t mEffect = -1;  // the uploaded one
};

void write(const LogLine& line);

}  // namespace bench
