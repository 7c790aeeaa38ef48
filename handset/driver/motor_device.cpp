// SPDX-License-Identifier: Apache-2.0
// The force-feedback motor: the request handlers and the device.
#include "driver/motor_device.h"

#include <cuse_lowlevel.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/uio.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstring>
#include <mutex>
#include <string>
#include <string_view>
#include <utility>

#include "common/unique_fd.h"
#include "driver/caller.h"
#include "driver/effect_line.h"
#include "driver/effect_slots.h"
#include "driver/handle_table.h"
#include "driver/motor_queries.h"
#include "driver/open_flags.h"
#include "driver/request_delay.h"

namespace handset {
namespace {

// More than any waveform memory holds; beyond it the kernel could not carry the data either.
constexpr uint32_t kMostCustomValues = 32768;

constexpr std::chrono::seconds kInitPatience{10};

/// Somebody who waits until the kernel has made the device.
class Announcement {
  public:
    void make() {
        const std::lock_guard lock(mutex_);
        made_ = true;
        changed_.notify_all();
    }

    bool await(std::chrono::seconds patience) {
        std::unique_lock lock(mutex_);
        return changed_.wait_for(lock, patience, [this] { return made_; });
    }

  private:
    std::mutex mutex_;
    std::condition_variable changed_;
    bool made_ = false;
};

}  // namespace

struct MotorDevice::State {
    const MotorSpec& motor;
    FaultBook& faults;
    Journal& journal;
    EffectSlots slots;
    std::mutex slotsMutex{};  ///< also keeps the journal in the order of the slots' changes
    std::atomic<bool> stopping{false};
    HandleTable<const Opener> files{};
    Announcement ready{};
};

namespace {

using State = MotorDevice::State;

State& stateOf(fuse_req_t request) {
    return *static_cast<State*>(fuse_req_userdata(request));
}

bool isUnplugged(const State& state) {
    return state.faults.isUnplugged(kMotorNode);
}

/// Meets the fault that is due, if any: its error, or EINTR where its delay was cut short, or 0.
int meetFault(fuse_req_t request, State& state, const FaultAction& fault) {
    return delayRequest(request, fault.delay, state.stopping) ? fault.error : EINTR;
}

void onInitDone(void* data) {
    static_cast<State*>(data)->ready.make();
}

void onOpen(fuse_req_t request, fuse_file_info* info) {
    State& state = stateOf(request);
    const Opener opener(request);
    const int error = meetFault(request, state, state.faults.next(kMotorNode, FaultOp::kOpen));
    state.journal.record(opener.caller(), JournalLine("open")
                                                  .text("node", kMotorNode)
                                                  .text("flags", openFlagsText(info->flags))
                                                  .result("error", -error));
    if (error != 0) {
        fuse_reply_err(request, error);
        return;
    }
    info->fh = state.files.add(std::make_unique<const Opener>(opener));
    if (fuse_reply_open(request, info) == -ENOENT) state.files.remove(info->fh);
}

void onRelease(fuse_req_t request, fuse_file_info* info) {
    State& state = stateOf(request);
    if (const std::unique_ptr<const Opener> opener = state.files.remove(info->fh)) {
        const std::lock_guard lock(state.slotsMutex);
        for (const int id : state.slots.eraseAllOf(info->fh)) {
            state.journal.record(opener->caller(), JournalLine("erase")
                                                           .text("node", kMotorNode)
                                                           .number("id", id)
                                                           .result("result", 0));
        }
        state.journal.record(opener->caller(), JournalLine("close").text("node", kMotorNode));
    }
    fuse_reply_err(request, 0);
}

/// The motor sends no events: a reader waits until it is interrupted or the device is gone.
void onRead(fuse_req_t request, size_t size, off_t, fuse_file_info* info) {
    State& state = stateOf(request);
    if (size < sizeof(input_event)) {
        fuse_reply_err(request, EINVAL);
    } else if (isUnplugged(state)) {
        fuse_reply_err(request, ENODEV);
    } else if ((info->flags & O_NONBLOCK) != 0) {
        fuse_reply_err(request, EAGAIN);
    } else {
        delayRequest(request, std::chrono::hours(24), state.stopping);
        fuse_reply_err(request, state.stopping ? ENODEV : EINTR);
    }
}

void onPoll(fuse_req_t request, fuse_file_info*, fuse_pollhandle* handle) {
    fuse_reply_poll(request,
                    isUnplugged(stateOf(request)) ? POLLERR | POLLHUP : POLLOUT | POLLWRNORM);
    if (handle != nullptr) fuse_pollhandle_destroy(handle);
}

/// Records the events of one write, each with how many of its bytes were taken.
void recordEvents(State& state, const Caller& caller, std::string_view events, size_t taken,
                  int error) {
    for (size_t at = 0; at < events.size(); at += sizeof(input_event)) {
        input_event event;
        memcpy(&event, events.data() + at, sizeof event);
        const size_t own = std::min(sizeof event, taken - std::min(taken, at));
        state.journal.record(
                caller, JournalLine("event")
                                .text("node", kMotorNode)
                                .number("type", event.type)
                                .number("code", event.code)
                                .number("value", event.value)
                                .result("result", error != 0 ? -error : static_cast<int64_t>(own)));
    }
}

void onWrite(fuse_req_t request, const char* data, size_t size, off_t, fuse_file_info* info) {
    State& state = stateOf(request);
    const Caller caller = state.files.get(info->fh).callerOf(request);
    if (size < sizeof(input_event)) {
        state.journal.record(caller, JournalLine("write")
                                             .text("node", kMotorNode)
                                             .bytes("data", "hex", std::string_view(data, size))
                                             .result("result", -EINVAL));
        fuse_reply_err(request, EINVAL);
        return;
    }
    // A last piece that is no whole event is left over, as evdev does.
    const std::string_view events(data, size - size % sizeof(input_event));
    const FaultAction fault = state.faults.next(kMotorNode, FaultOp::kWrite);
    const int error = meetFault(request, state, fault);
    const size_t taken = std::min(events.size(), fault.shortCount.value_or(events.size()));
    recordEvents(state, caller, events, taken, error);
    if (error != 0) {
        fuse_reply_err(request, error);
    } else {
        fuse_reply_write(request, taken);
    }
}

/// What the kernel still has to fetch from the caller before an upload can be judged, or nothing.
/// It copies exactly what it is asked for, so a bad pointer fails there and never reaches the
/// driver.
size_t customBytes(const ff_effect& effect) {
    const bool custom = effect.type == FF_PERIODIC && effect.u.periodic.waveform == FF_CUSTOM;
    return custom ? effect.u.periodic.custom_len * sizeof(int16_t) : 0;
}

void fetchUpload(fuse_req_t request, char* record, const ff_effect* known) {
    iovec in[2] = {{record, sizeof(ff_effect)}, {}};
    size_t count = 1;
    if (known != nullptr) {
        in[1] = {known->u.periodic.custom_data, customBytes(*known)};
        count = 2;
    }
    // Of the record only the id is written back.
    const iovec out{record + offsetof(ff_effect, id), sizeof(ff_effect::id)};
    fuse_reply_ioctl_retry(request, in, count, &out, 1);
}

/// Whether the slots would take an upload: 0, or why not (negative).
int checkUpload(State& state, uint64_t file, const ff_effect& effect) {
    const std::lock_guard lock(state.slotsMutex);
    return std::min(state.slots.check(file, effect), 0);
}

/// Takes an upload unless it has failed already (`result` negative), notes it and answers.
void finishUpload(fuse_req_t request, uint64_t file, const ff_effect& effect,
                  std::string_view custom, int result) {
    State& state = stateOf(request);
    {
        const std::lock_guard lock(state.slotsMutex);
        if (result == 0) result = state.slots.upload(file, effect);
        state.journal.record(state.files.get(file).callerOf(request),
                             uploadLine(asDriverSees(effect), custom, result));
    }
    if (result < 0) {
        fuse_reply_err(request, -result);
        return;
    }
    const auto id = static_cast<decltype(ff_effect::id)>(result);
    fuse_reply_ioctl(request, 0, &id, sizeof id);
}

/// Comes up to three times for one upload: with nothing, with the record, and with its data, which
/// are asked for only when the input core would have the driver fetch them.
void onUpload(fuse_req_t request, char* record, const fuse_file_info* info, const void* buffer,
              size_t size) {
    State& state = stateOf(request);
    if (size < sizeof(ff_effect)) {
        fetchUpload(request, record, nullptr);
        return;
    }
    ff_effect effect;
    memcpy(&effect, buffer, sizeof effect);
    int result = checkUpload(state, info->fh, effect);
    if (result == 0 && customBytes(effect) > kMostCustomValues * sizeof(int16_t)) result = -EINVAL;
    if (result == 0 && size != sizeof effect + customBytes(effect)) {
        fetchUpload(request, record, &effect);
        return;
    }
    if (result == 0) {
        result = -meetFault(request, state, state.faults.next(kMotorNode, FaultOp::kUpload));
    }
    const std::string_view custom(static_cast<const char*>(buffer) + sizeof effect,
                                  size - sizeof effect);
    finishUpload(request, info->fh, effect, custom, result);
}

void onErase(fuse_req_t request, int id, const fuse_file_info* info) {
    State& state = stateOf(request);
    int result = 0;
    {
        const std::lock_guard lock(state.slotsMutex);
        result = state.slots.checkErase(info->fh, id);
    }
    if (result == 0) {
        result = -meetFault(request, state, state.faults.next(kMotorNode, FaultOp::kErase));
    }
    {
        const std::lock_guard lock(state.slotsMutex);
        if (result == 0) result = state.slots.erase(info->fh, id);
        state.journal.record(state.files.get(info->fh).callerOf(request),
                             JournalLine("erase")
                                     .text("node", kMotorNode)
                                     .number("id", id)
                                     .result("result", result));
    }
    if (result < 0) {
        fuse_reply_err(request, -result);
    } else {
        fuse_reply_ioctl(request, 0, nullptr, 0);
    }
}

void onQuery(fuse_req_t request, unsigned command, void* memory, size_t room) {
    const std::optional<QueryAnswer> answer = answerQuery(stateOf(request).motor, command);
    if (!answer || answer->result < 0) {
        fuse_reply_err(request, answer ? -answer->result : EINVAL);
    } else if (room < answer->data.size()) {
        const iovec out{memory, answer->data.size()};
        fuse_reply_ioctl_retry(request, nullptr, 0, &out, 1);
    } else {
        fuse_reply_ioctl(request, answer->result, answer->data.data(), answer->data.size());
    }
}

/// The kernel takes the size in a request's number for part of its argument, and a record of
/// another size for one it cannot reach.
bool isUploadOfAnotherSize(unsigned command) {
    return command != EVIOCSFF && _IOC_DIR(command) == _IOC_DIR(EVIOCSFF) &&
           _IOC_TYPE(command) == _IOC_TYPE(EVIOCSFF) && _IOC_NR(command) == _IOC_NR(EVIOCSFF);
}

void onIoctl(fuse_req_t request, int number, void* argument, fuse_file_info* info, unsigned flags,
             const void* input, size_t inputSize, size_t outputSize) {
    const auto command = static_cast<unsigned>(number);
    if (isUnplugged(stateOf(request))) {
        fuse_reply_err(request, ENODEV);
    } else if ((flags & FUSE_IOCTL_COMPAT) != 0) {
        fuse_reply_err(request, EINVAL);  // 32-bit clients have another layout
    } else if (command == EVIOCSFF) {
        onUpload(request, static_cast<char*>(argument), info, input, inputSize);
    } else if (isUploadOfAnotherSize(command)) {
        fuse_reply_err(request, EFAULT);
    } else if (command == EVIOCRMFF) {
        // The id is the argument itself, not what it points at.
        onErase(request, static_cast<int>(reinterpret_cast<intptr_t>(argument)), info);
    } else {
        onQuery(request, command, argument, outputSize);
    }
}

cuse_lowlevel_ops operations() {
    cuse_lowlevel_ops ops{};
    ops.init_done = onInitDone;
    ops.open = onOpen;
    ops.release = onRelease;
    ops.read = onRead;
    ops.write = onWrite;
    ops.ioctl = onIoctl;
    ops.poll = onPoll;
    return ops;
}

}  // namespace

Result<std::unique_ptr<MotorDevice>> MotorDevice::start(const MotorSpec& motor, unsigned event,
                                                        FaultBook& faults, Journal& journal,
                                                        int ended) {
    UniqueFd device(open("/dev/cuse", O_RDWR | O_CLOEXEC | O_NONBLOCK));
    if (!device) {
        return Error{fmt::format("/dev/cuse: {}; a motor needs the kernel's cuse module",
                                 strerror(errno))};
    }
    std::unique_ptr<MotorDevice> started(new MotorDevice);
    started->state_ = std::unique_ptr<State>(
            new State{motor, faults, journal, EffectSlots(motor.effectsMax)});
    State& state = *started->state_;

    char name[] = "handset-driver";
    char* arguments[] = {name, nullptr};
    fuse_args args = FUSE_ARGS_INIT(1, arguments);
    const std::string deviceName = fmt::format("DEVNAME=input/event{}", event);
    const char* deviceInfo[] = {deviceName.c_str()};
    const cuse_info info{0, 0, 1, deviceInfo, CUSE_UNRESTRICTED_IOCTL};
    const cuse_lowlevel_ops ops = operations();
    started->session_ = cuse_lowlevel_new(&args, &info, &ops, &state);
    fuse_opt_free_args(&args);
    if (started->session_ == nullptr) return Error{"no CUSE session"};

    const int fd = device.release();  // the session closes it
    fuse_session_mount(started->session_, fmt::format("/dev/fd/{}", fd).c_str());
    started->loop_ = std::make_unique<SessionLoop>(started->session_, fd, ended);
    if (!state.ready.await(kInitPatience)) {
        return Error{fmt::format("{}: the kernel did not make the device", eventNodePath(event))};
    }
    if (auto failure = started->node_.handOver(event)) return *failure;
    return started;
}

MotorDevice::~MotorDevice() {
    if (state_) state_->stopping = true;
    loop_.reset();
    if (session_ != nullptr) fuse_session_destroy(session_);
}

}  // namespace handset
