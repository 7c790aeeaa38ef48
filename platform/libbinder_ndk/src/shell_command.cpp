// SPDX-License-Identifier: Apache-2.0
//
// Dump and shell commands, both sides.
#include "platform/libbinder_ndk/src/shell_command.h"

#include <linux/android/binder.h>

#include <string>
#include <vector>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"
#include "platform/libbinder_ndk/src/token.h"
#include "platform/libbinder_ndk/src/utf.h"

namespace binder_ndk {
namespace {

constexpr uid_t kRootUid = 0;
constexpr uid_t kShellUid = 2000;

// The arguments of a request, and pointers to them as the class's functions want them.
struct Arguments {
    std::vector<std::string> texts;
    std::vector<const char*> pointers;

    // Reads as many as the request holds of those it announces. What is not a string counts as "".
    explicit Arguments(const Parcel& request) {
        int32_t count = 0;
        request.read(&count);
        for (int32_t i = 0; i < count && request.available() >= sizeof(int32_t); ++i) {
            std::u16string_view text;
            request.readString16(&text);
            texts.push_back(utf16ToUtf8(text));
        }
        for (const std::string& text : texts) pointers.push_back(text.c_str());
    }

    const char** data() { return pointers.data(); }
    uint32_t size() const { return static_cast<uint32_t>(pointers.size()); }
};

int readDescriptorOrNone(const Parcel& request) {
    int fd = -1;
    request.readFileDescriptor(&fd);
    return fd;
}

// Someone of the shell's who waits for the result.
class ResultReceiver {
  public:
    explicit ResultReceiver(const Parcel& request) { request.readStrongBinder(&mBinder); }
    ~ResultReceiver() {
        if (mBinder != nullptr) mBinder->decStrong();
    }
    ResultReceiver(const ResultReceiver&) = delete;
    ResultReceiver& operator=(const ResultReceiver&) = delete;

    void send(int32_t result) const {
        constexpr uint32_t kSend = FIRST_CALL_TRANSACTION;
        if (mBinder == nullptr) return;
        Parcel request;
        Parcel reply;
        if (writeInterfaceToken(request, u"com.android.internal.os.IResultReceiver") == STATUS_OK &&
            request.write(result) == STATUS_OK) {
            mBinder->transact(kSend, request, &reply, FLAG_ONEWAY);
        }
    }

  private:
    AIBinder* mBinder = nullptr;
};

}  // namespace

binder_status_t serveDump(LocalBinder* binder, const Parcel& request) {
    const AIBinder_onDump onDump = binder->clazz.load()->onDump;
    if (onDump == nullptr) return STATUS_OK;
    const int fd = readDescriptorOrNone(request);
    Arguments arguments(request);
    return onDump(binder, fd, arguments.data(), arguments.size());
}

binder_status_t serveShellCommand(LocalBinder* binder, const Parcel& request) {
    const int in = readDescriptorOrNone(request);
    const int out = readDescriptorOrNone(request);
    const int err = readDescriptorOrNone(request);
    Arguments arguments(request);
    const ResultReceiver shellCallback(request);  // not used, but it comes first
    const ResultReceiver receiver(request);

    const AIBinder_handleShellCommand handle = binder->clazz.load()->handleShellCommand;
    if (handle == nullptr) {
        receiver.send(STATUS_INVALID_OPERATION);
        return STATUS_OK;
    }
    const uid_t uid = CallContext::current().uid;
    if (uid != kRootUid && uid != kShellUid) {
        receiver.send(-1);
        return STATUS_PERMISSION_DENIED;
    }
    if (in < 0 || out < 0 || err < 0) {
        receiver.send(-1);
        return STATUS_BAD_VALUE;
    }
    const binder_status_t status = handle(binder, in, out, err, arguments.data(), arguments.size());
    receiver.send(status);
    return status;
}

}  // namespace binder_ndk

using namespace binder_ndk;

binder_status_t AIBinder_dump(AIBinder* binder, int fd, const char** args, uint32_t numArgs) {
    if (binder == nullptr) return STATUS_UNEXPECTED_NULL;
    if (LocalBinder* const local = binder->asLocal(); local != nullptr) {
        const AIBinder_onDump onDump = local->clazz.load()->onDump;
        return onDump != nullptr ? onDump(binder, fd, args, numArgs) : STATUS_OK;
    }
    Parcel request;
    Parcel reply;
    binder_status_t status = request.writeFileDescriptor(fd, false);
    if (status == STATUS_OK) status = request.write(static_cast<int32_t>(numArgs));
    for (uint32_t i = 0; i < numArgs && status == STATUS_OK; ++i)
        status = request.writeString16(utf8ToUtf16Lossy(args[i]));
    if (status == STATUS_OK) status = binder->transact(kDumpTransaction, request, &reply, 0);
    return knownStatus(status);
}
