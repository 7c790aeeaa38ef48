// SPDX-License-Identifier: Apache-2.0
//
// The service the tests call, and a client of it.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>

#include "tests/support/process.h"

namespace binder_test {

using qvx::test::eventually;
using qvx::test::inProcess;
using qvx::test::kApp;
using qvx::test::kRoot;
using qvx::test::kShell;
using qvx::test::kSystem;
using qvx::test::Process;

// Methods of test.IService. Replies have no status header; every method returns its results
// plainly.
enum Method : transaction_code_t {
    kEcho = 1,      // i32 -> i32
    kCaller,        // -> uid i32, pid i32
    kCallBack,      // binder of test.ICallback, i32 n -> what the callback answers to n
    kRemember,      // i32, oneway
    kRemembered,    // -> i32 list
    kKeep,          // binder: kept
    kDropKept,      //
    kGiveObject,    // -> a new object, counted until it is destroyed
    kLiveObjects,   // -> i32
    kDie,           // ends the process in the middle of the call
    kSleep,         // i32 milliseconds
    kWatch,         // binder: its death is counted
    kDeaths,        // -> i32
    kDescriptors,   // -> i32 open descriptors
    kWriteTo,       // descriptor: gets "hello"
    kEchoBytes,     // byte list -> byte list
    kEchoBinder,    // binder -> the same binder
    kIsOwn,         // binder -> bool, true for an object kGiveObject made
    kAnswerStatus,  // i32 -> that status instead of a reply
    kOverlaps,      // -> bool, true when two kSleep ever ran at the same time
    kThreadName,    // -> String, name of the serving thread
    kAssociate,     // binder: becomes one of test.ICallback, without being called
};

inline constexpr const char* kServiceDescriptor = "test.IService";
inline constexpr const char* kCallbackDescriptor = "test.ICallback";

// Class of proxies and objects.
const AIBinder_Class* serviceClass();
const AIBinder_Class* callbackClass();

// A new service object.
ndk::SpAIBinder makeService();

// A callback that answers i32 n with what `answer(n)` says; user data is a copy of `answer`.
ndk::SpAIBinder makeCallback(std::function<int32_t(int32_t)> answer);

// Registers a service with an extension under `name` with no more threads than the one that calls
// this, and serves. Does not return.
void serve(const std::string& name, const std::function<void()>& ready);

// The running test's own name, which its service is registered under.
std::string testName();

// A process of the system user that serves under that name.
Process startService();

// Starts that process, and calls its service as `uid` in a process of its own.
void callService(uid_t uid, const std::function<void(const ndk::SpAIBinder& binder)>& body);

// Finds and associates the service of that name; a failed expectation and null otherwise.
ndk::SpAIBinder find(const std::string& name);

// One call. `write` adds arguments; the reply is null when `*status` is not STATUS_OK.
ndk::ScopedAParcel call(const ndk::SpAIBinder& binder, transaction_code_t code,
                        const std::function<void(AParcel*)>& write = nullptr,
                        binder_status_t* status = nullptr, binder_flags_t flags = 0);

// Entries of this process's table of descriptors.
int countDescriptors();

// Calls whose results are one number, or that take one.
int32_t callForInt(const ndk::SpAIBinder& binder, transaction_code_t code,
                   const std::function<void(AParcel*)>& write = nullptr);
int32_t echo(const ndk::SpAIBinder& binder, int32_t value);

}  // namespace binder_test
