// SPDX-License-Identifier: Apache-2.0
//
// The force-feedback motor: the request handlers and the device.
#include "handset/driver/motor_device.h"

#include <fcntl.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/uio.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstring>
#include <mutex>
#include <semaphore>
#include <string>
#include <string_view>
#include <utility>

#include <android-base/thread_annotations.h>
#include <android-base/unique_fd.h>
#include <cuse_lowlevel.h>
#include <fmt/format.h>

#include "handset/driver/caller.h"
#include "handset/driver/effect_line.h"
#include "handset/driver/effect_slots.h"
#include "handset/driver/handle_table.h"
#include "handset/driver/motor_queries.h"
#include "handset/driver/printable.h"
#include "handset/driver/request_delay.h"

namespace handset {
namespace {

using android::base::Error;
using android::base::Result;
using android::base::unique_fd;

// More than any waveform memory holds; beyond it the kernel could not carry the data either.
constexpr uint32_t kMostCustomValues = 32768;

constexpr std::chrono::seconds kInitTimeout{10};

}  // namespace

struct MotorDevice::State {
    // A file that is open, and how often the motor had been unplugged when it was opened.
    struct OpenMotor {
        Opener opener;
        uint64_t unplugs;
    };

    const MotorProfile& motor;
    FaultInjector& faults;
    Journal& journal;
    std::mutex slotsMutex{};  // also keeps the journal in the order of the slots' changes
    EffectSlots slots GUARDED_BY(slotsMutex){motor.effectsMax};
    std::atomic<bool> stopping{false};
    HandleTable<const OpenMotor> files{};
    std::binary_semaphore ready{0};  // released once the kernel has made the device
};

namespace {

using MotorState = MotorDevice::State;

MotorState& motorStateOf(fuse_req_t request) {
    return *static_cast<MotorState*>(fuse_req_userdata(request));
}

// True where the motor is gone, or is another one than the file's.
bool isGone(MotorState& state, const fuse_file_info* info) {
    return state.faults.isUnplugged(kMotorNode) ||
           state.faults.unplugsOf(kMotorNode) != state.files.get(info->fh).unplugs;
}

void onInitDone(void* data) {
    static_cast<MotorState*>(data)->ready.release();
}

void onOpen(fuse_req_t request, fuse_file_info* info) {
    MotorState& state = motorStateOf(request);
    const Opener opener(request);
    const auto arrival = std::chrono::steady_clock::now();
    const uint64_t unplugs = state.faults.unplugsOf(kMotorNode);
    const FaultAction fault = state.faults.next(kMotorNode, FaultOp::kOpen);
    const int error = meetFault(request, fault, state.stopping);
    state.journal.record(opener.caller(), openLine(kMotorNode, info->flags, error),
                         {fault, arrival});
    if (error != 0) {
        fuse_reply_err(request, error);
        return;
    }
    info->fh = state.files.add(
            std::make_unique<const MotorState::OpenMotor>(MotorState::OpenMotor{opener, unplugs}));
    if (fuse_reply_open(request, info) == -ENOENT) state.files.remove(info->fh);
}

void onRelease(fuse_req_t request, fuse_file_info* info) {
    MotorState& state = motorStateOf(request);
    if (const std::unique_ptr<const MotorState::OpenMotor> file = state.files.remove(info->fh)) {
        const Caller& caller = file->opener.caller();
        const std::lock_guard lock(state.slotsMutex);
        for (const int id : state.slots.eraseAllOf(info->fh)) {
            state.journal.record(
                    caller, {{"op", "erase"}, {"node", kMotorNode}, {"id", id}, {"result", 0}});
        }
        state.journal.record(caller, {{"op", "close"}, {"node", kMotorNode}});
    }
    fuse_reply_err(request, 0);
}

// The motor sends no events: a reader waits until it is interrupted or the device is gone.
void onRead(fuse_req_t request, size_t size, off_t, fuse_file_info* info) {
    MotorState& state = motorStateOf(request);
    if (size < sizeof(input_event)) {
        fuse_reply_err(request, EINVAL);
    } else if (isGone(state, info)) {
        fuse_reply_err(request, ENODEV);
    } else if ((info->flags & O_NONBLOCK) != 0) {
        fuse_reply_err(request, EAGAIN);
    } else {
        delayRequest(request, std::chrono::hours(24), state.stopping);
        fuse_reply_err(request, state.stopping ? ENODEV : EINTR);
    }
}

void onPoll(fuse_req_t request, fuse_file_info* info, fuse_pollhandle* handle) {
    const bool gone = isGone(motorStateOf(request), info);
    fuse_reply_poll(request, gone ? POLLERR | POLLHUP : POLLOUT | POLLWRNORM);
    if (handle != nullptr) fuse_pollhandle_destroy(handle);
}

// Records the events of one write, each with how many of its bytes were taken.
void recordEvents(MotorState& state, const Caller& caller, std::string_view events, size_t taken,
                  int error, const Strike& strike) {
    for (size_t at = 0; at < events.size(); at += sizeof(input_event)) {
        input_event event;
        memcpy(&event, events.data() + at, sizeof event);
        const size_t own = std::min(sizeof event, taken - std::min(taken, at));
        state.journal.record(
                caller,
                {{"op", "event"},
                 {"node", kMotorNode},
                 {"type", event.type},
                 {"code", event.code},
                 {"value", event.value},
                 {"result", resultOf(error != 0 ? -error : static_cast<int64_t>(own))}},
                strike);
    }
}

void onWrite(fuse_req_t request, const char* data, size_t size, off_t, fuse_file_info* info) {
    MotorState& state = motorStateOf(request);
    const MotorState::OpenMotor& file = state.files.get(info->fh);
    const Caller caller = file.opener.callerOf(request);
    if (size < sizeof(input_event)) {
        JournalFields line{{"op", "write"}, {"node", kMotorNode}};
        putBytes(line, "data", "hex", std::string_view(data, size));
        line["result"] = resultOf(-EINVAL);
        state.journal.record(caller, line);
        fuse_reply_err(request, EINVAL);
        return;
    }
    // A last piece that is no whole event is left over, as evdev does.
    const std::string_view events(data, size - size % sizeof(input_event));
    const auto arrival = std::chrono::steady_clock::now();
    const FaultAction fault = state.faults.nextOf(kMotorNode, FaultOp::kWrite, file.unplugs);
    const int error = meetFault(request, fault, state.stopping);
    const size_t taken = std::min(events.size(), fault.shortCount.value_or(events.size()));
    recordEvents(state, caller, events, taken, error, {fault, arrival});
    if (error != 0) {
        fuse_reply_err(request, error);
    } else {
        fuse_reply_write(request, taken);
    }
}

// What the kernel still has to fetch from the caller before an upload can be judged, or nothing.
// It copies exactly what it is asked for, so a bad pointer fails there and never reaches the
// driver.
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

// Whether the slots would take an upload: 0, or why not (negative).
int checkUpload(MotorState& state, uint64_t file, const ff_effect& effect) {
    const std::lock_guard lock(state.slotsMutex);
    return std::min(state.slots.check(file, effect), 0);
}

// Takes an upload unless it has failed already (`result` negative), notes it and answers.
void finishUpload(fuse_req_t request, uint64_t file, const ff_effect& effect,
                  std::string_view custom, int result, const Strike& strike) {
    MotorState& state = motorStateOf(request);
    {
        const std::lock_guard lock(state.slotsMutex);
        if (result == 0) result = state.slots.upload(file, effect);
        state.journal.record(state.files.get(file).opener.callerOf(request),
                             uploadLine(asDriverSees(effect), custom, result), strike);
    }
    if (result < 0) {
        fuse_reply_err(request, -result);
        return;
    }
    const auto id = static_cast<decltype(ff_effect::id)>(result);
    fuse_reply_ioctl(request, 0, &id, sizeof id);
}

// Comes up to three times for one upload: with nothing, with the record, and with its data, which
// are asked for only when the input core would have the driver fetch them.
void onUpload(fuse_req_t request, char* record, const fuse_file_info* info, const void* buffer,
              size_t size) {
    MotorState& state = motorStateOf(request);
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
    const auto arrival = std::chrono::steady_clock::now();
    FaultAction fault;
    if (result == 0) {
        fault = state.faults.nextOf(kMotorNode, FaultOp::kUpload,
                                    state.files.get(info->fh).unplugs);
        result = -meetFault(request, fault, state.stopping);
    }
    const std::string_view custom(static_cast<const char*>(buffer) + sizeof effect,
                                  size - sizeof effect);
    finishUpload(request, info->fh, effect, custom, result, {fault, arrival});
}

void onErase(fuse_req_t request, int id, const fuse_file_info* info) {
    MotorState& state = motorStateOf(request);
    int result = 0;
    {
        const std::lock_guard lock(state.slotsMutex);
        result = state.slots.checkErase(info->fh, id);
    }
    const MotorState::OpenMotor& file = state.files.get(info->fh);
    const auto arrival = std::chrono::steady_clock::now();
    FaultAction fault;
    if (result == 0) {
        fault = state.faults.nextOf(kMotorNode, FaultOp::kErase, file.unplugs);
        result = -meetFault(request, fault, state.stopping);
    }
    {
        const std::lock_guard lock(state.slotsMutex);
        if (result == 0) result = state.slots.erase(info->fh, id);
        state.journal.record(
                file.opener.callerOf(request),
                {{"op", "erase"}, {"node", kMotorNode}, {"id", id}, {"result", resultOf(result)}},
                {fault, arrival});
    }
    if (result < 0) {
        fuse_reply_err(request, -result);
    } else {
        fuse_reply_ioctl(request, 0, nullptr, 0);
    }
}

void onQuery(fuse_req_t request, unsigned command, void* memory, size_t room) {
    const std::optional<QueryAnswer> answer = answerQuery(motorStateOf(request).motor, command);
    if (!answer || answer->result < 0) {
        fuse_reply_err(request, answer ? -answer->result : EINVAL);
    } else if (room < answer->data.size()) {
        const iovec out{memory, answer->data.size()};
        fuse_reply_ioctl_retry(request, nullptr, 0, &out, 1);
    } else {
        fuse_reply_ioctl(request, answer->result, answer->data.data(), answer->data.size());
    }
}

// The kernel takes the size in a request's number for part of its argument, and a record of
// another size for one it cannot reach.
bool isUploadOfAnotherSize(unsigned command) {
    return command != EVIOCSFF && _IOC_DIR(command) == _IOC_DIR(EVIOCSFF) &&
           _IOC_TYPE(command) == _IOC_TYPE(EVIOCSFF) && _IOC_NR(command) == _IOC_NR(EVIOCSFF);
}

void onIoctl(fuse_req_t request, int number, void* argument, fuse_file_info* info, unsigned flags,
             const void* input, size_t inputSize, size_t outputSize) {
    const auto command = static_cast<unsigned>(number);
    if (isGone(motorStateOf(request), info)) {
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

Result<std::unique_ptr<MotorDevice>> MotorDevice::start(const MotorProfile& motor, unsigned event,
                                                        FaultInjector& faults, Journal& journal,
                                                        int ended) {
    unique_fd device(open("/dev/cuse", O_RDWR | O_CLOEXEC | O_NONBLOCK));
    if (!device.ok()) {
        return Error() << fmt::format("/dev/cuse: {}; a motor needs the kernel's cuse module",
                                      strerror(errno));
    }
    std::unique_ptr<MotorDevice> started(new MotorDevice);
    started->mState = std::unique_ptr<MotorState>(new MotorState{motor, faults, journal});
    MotorState& state = *started->mState;

    char name[] = "handset-driver";
    char* arguments[] = {name, nullptr};
    fuse_args args = FUSE_ARGS_INIT(1, arguments);
    const std::string deviceName = fmt::format("DEVNAME=input/event{}", event);
    const char* deviceInfo[] = {deviceName.c_str()};
    const cuse_info info{0, 0, 1, deviceInfo, CUSE_UNRESTRICTED_IOCTL};
    const cuse_lowlevel_ops ops = operations();
    fuse_session* const session = cuse_lowlevel_new(&args, &info, &ops, &state);
    fuse_opt_free_args(&args);
    if (session == nullptr) return Error() << "no CUSE session";
    started->mLoop = std::make_unique<SessionLoop>(session, std::move(device), ended);
    if (!state.ready.try_acquire_for(kInitTimeout)) {
        return Error() << fmt::format("{}: the kernel did not make the device",
                                      eventNodePath(event));
    }
    if (auto done = started->mNode.handOver(event); !done) return done.error();
    return started;
}

void MotorDevice::forgetEffects() {
    const std::lock_guard lock(mState->slotsMutex);
    mState->slots = EffectSlots(mState->motor.effectsMax);
}

MotorDevice::~MotorDevice() {
    if (mState) mState->stopping = true;
}

}  // namespace handset
