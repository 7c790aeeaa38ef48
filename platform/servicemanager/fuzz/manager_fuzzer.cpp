// SPDX-License-Identifier: Apache-2.0
//
// Asks the service manager for anything, as anyone, while the objects that it was given die and its
// callbacks cannot be called. It waits for nobody, answers with what the interface promises, lets no
// app register, and has forgotten everything when all objects are dead.
//
// An input is one step after another. A step is a byte: the method (its low four bits; from 12 on no
// method but what is in step() below) and, of a request, a byte that chooses the caller, the number of
// arguments and these: a byte for the kind, then its value.
#include <linux/android/binder.h>

#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include <binder_context_manager.h>

#include "fuzz/input.h"
#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/death.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/servicemanager/service_manager.h"

namespace {

using binder_ndk::CallContext;
using binder_ndk::Parcel;
using fuzz::Input;
using fuzz::require;

constexpr uint32_t kAddService = 3;
constexpr uint32_t kListServices = 4;
constexpr uid_t kUsers[] = {0, 1000, 1001, 2000, 10123, 99001};
constexpr const char* kNames[] = {"a",
                                  "b",
                                  "manager",
                                  "p.IDeclared/default",
                                  "p.IDeclared",
                                  "no such\nname",
                                  "android.hardware.vibrator.IVibrator/default"};
constexpr binder_exception_t kPromised[] = {
        EX_NONE,         EX_SECURITY,      EX_ILLEGAL_ARGUMENT,
        EX_NULL_POINTER, EX_ILLEGAL_STATE, EX_UNSUPPORTED_OPERATION};

// The driver's side.
std::map<uint32_t, int> references;         // by handle
std::map<uint32_t, uint64_t> deathCookies;  // by handle
int buffersHeld = 0;
binder_status_t callbackStatus = STATUS_OK;
uint32_t holders = 1;

servicemanager::ServiceManager& manager() {
    static auto* const kManager = [] {
        // One manifest, and no more files than that.
        static std::string root = std::filesystem::temp_directory_path() / "manager.XXXXXX";
        require(mkdtemp(root.data()) != nullptr);
        std::atexit([] { std::filesystem::remove_all(root); });
        std::filesystem::create_directories(root + "/vendor/etc/vintf");
        std::ofstream(root + "/vendor/etc/vintf/manifest.xml")
                << "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\">"
                   "<name>p</name><fqname>IDeclared/default</fqname></hal></manifest>";
        servicemanager::RegistrationRules rules;
        rules.allow("a", 1000);
        return new servicemanager::ServiceManager(root, std::move(rules));
    }();
    return *kManager;
}

// A request as the driver hands it over: its objects are where the list says.
class Request {
  public:
    Request() {
        for (const uint32_t word : {0x80000000U, 0xffffffffU, 0x53595354U}) add(word);
        addString(u"android.os.IServiceManager");
    }

    void addArgument(Input& input) {
        switch (input.byte() % 8) {
            case 0: {
                const std::string name = kNames[input.byte() % std::size(kNames)];
                addString({name.begin(), name.end()});
                break;
            }
            case 1: {
                const std::string_view bytes = input.bytes(input.byte());
                addString({bytes.begin(), bytes.end()});
                break;
            }
            case 2: {
                flat_binder_object object = {};
                object.hdr.type = BINDER_TYPE_HANDLE;
                object.handle = 1U + input.byte() % 8;
                mOffsets.push_back(mData.size());
                add(object);
                add(input.byte() % 2 == 0 ? 0x0c000001U : 0x3f000001U);  // system, VINTF
                break;
            }
            case 3: {
                flat_binder_object object = {};
                object.hdr.type = BINDER_TYPE_BINDER;
                add(object);
                add(0U);
                break;
            }
            case 4:
                add(input.word());
                break;
            default:
                add(uint32_t{input.byte()});
        }
    }

    void handTo(Parcel* parcel) {
        ++buffersHeld;
        parcel->adopt(mData.data(), mData.size(), mOffsets.data(), mOffsets.size(),
                      binder_ndk::kernel::freeBuffer);
    }

  private:
    template <typename T>
    void add(const T& value) {
        const auto* const bytes = reinterpret_cast<const uint8_t*>(&value);
        mData.insert(mData.end(), bytes, bytes + sizeof value);
    }

    void addString(const std::u16string& text) {
        add(static_cast<int32_t>(text.size()));
        for (const char16_t unit : text) add(unit);
        add(char16_t{0});
        mData.resize((mData.size() + 3) / 4 * 4);
    }

    std::vector<uint8_t> mData;
    std::vector<binder_size_t> mOffsets;
};

// The exception in the reply's header; a transport's status stays what it is.
binder_status_t ask(uint32_t code, Request request, const CallContext& caller, Parcel* reply) {
    CallContext::current() = caller;
    binder_status_t status = STATUS_OK;
    {
        Parcel parcel;
        request.handTo(&parcel);
        status = manager().binder()->transact(code, parcel, reply, 0);
    }
    CallContext::current() = CallContext();
    require(buffersHeld == 0);
    return status;
}

void serveRequest(uint32_t code, Input& input) {
    const uint8_t chosen = input.byte();
    const uid_t uid = kUsers[chosen % std::size(kUsers)];
    Request request;
    for (int left = input.byte() % 6; left > 0; --left) request.addArgument(input);
    Parcel reply;
    const binder_status_t status = ask(code, std::move(request), {100 + chosen / 64, uid}, &reply);
    if (status != STATUS_OK || !binder_ndk::isUserCode(code)) return;
    int32_t exception = 0;
    require(reply.read(&exception) == STATUS_OK);
    require(std::find(std::begin(kPromised), std::end(kPromised), exception) !=
            std::end(kPromised));
    if (code == kAddService && uid >= 10000) require(exception != EX_NONE);
}

void die(uint32_t handle) {
    const auto cookie = deathCookies.find(handle);
    if (cookie != deathCookies.end()) binder_ndk::handleDeathNotice(cookie->second);
}

void step(Input& input) {
    const uint8_t choice = input.byte();
    switch (choice % 16) {
        case 12:
            serveRequest(input.word(), input);
            break;
        case 13:
            die(1U + input.byte() % 8);
            break;
        case 14:
            manager().checkClients();
            break;
        case 15:
            holders = input.byte() % 4;
            callbackStatus = choice / 16 % 2 == 0 ? STATUS_OK : STATUS_DEAD_OBJECT;
            break;
        default:
            serveRequest(1U + choice % 16, input);
    }
}

}  // namespace

namespace binder_ndk::kernel {

binder_status_t transact(uint32_t /*handle*/, uint32_t /*code*/, const Parcel& /*request*/,
                         Parcel* /*reply*/, uint32_t flags) {
    require((flags & TF_ONE_WAY) != 0);  // else it would wait for a client
    return callbackStatus;
}

void acquire(uint32_t handle) {
    ++references[handle];
}
void release(uint32_t handle) {
    require(--references[handle] >= 0);
}
void requestDeathNotification(uint32_t handle, uint64_t cookie) {
    require(deathCookies.emplace(handle, cookie).second);
}
void clearDeathNotification(uint32_t handle, uint64_t cookie) {
    require(deathCookies[handle] == cookie);
    deathCookies.erase(handle);
}
void freeBuffer(const uint8_t* /*buffer*/) {
    --buffersHeld;
}

}  // namespace binder_ndk::kernel

// As the driver counts; it refuses to where `holders` is 0.
binder_status_t AIBinder_countHolders(AIBinder* /*binder*/, uint32_t* count) {
    *count = holders;
    return holders == 0 ? -EINVAL : STATUS_OK;
}

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    manager();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    Input input{data, size};
    while (input.left > 0) step(input);
    callbackStatus = STATUS_OK;
    for (uint32_t handle = 1; handle <= 8; ++handle) die(handle);
    for (const auto& [handle, count] : references) require(count == 0);
    require(deathCookies.empty());

    Request everything;
    constexpr uint8_t kAllPriorities[] = {4, 15, 0, 0, 0};
    Input priorities{kAllPriorities, sizeof kAllPriorities};
    everything.addArgument(priorities);
    Parcel reply;
    require(ask(kListServices, std::move(everything), {100, 0}, &reply) == STATUS_OK);
    int32_t exception = -1;
    int32_t count = -1;
    require(reply.read(&exception) == STATUS_OK && exception == EX_NONE);
    require(reply.read(&count) == STATUS_OK && count <= 1);  // itself
    return 0;
}
