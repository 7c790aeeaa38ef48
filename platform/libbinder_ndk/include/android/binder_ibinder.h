// SPDX-License-Identifier: Apache-2.0
//
// Binder objects. A local object has a class (its functions) and user data; a remote one is a proxy
// for an object of another process. Both are an AIBinder, counted by strong references:
//
//     service process                  |  client process
//                                      |
//     user data <-- AIBinder (local) <-|-- AIBinder (proxy) <-- SpAIBinder
//                        ^             |
//                   driver's reference, as long as a proxy lives
#pragma once

#include <stdbool.h>
#include <stdint.h>
#include <sys/types.h>

#include <android/binder_bionic_compat.h>
#include <android/binder_parcel.h>
#include <android/binder_status.h>

__BEGIN_DECLS

// Number of a method. Users have FIRST_CALL_TRANSACTION to LAST_CALL_TRANSACTION.
typedef uint32_t transaction_code_t;
enum {
    FIRST_CALL_TRANSACTION = 0x00000001,
    LAST_CALL_TRANSACTION = 0x00ffffff,
};

// How a transaction is sent.
typedef uint32_t binder_flags_t;
enum {
    // Return once the driver has the call; calls to one object arrive in order.
    FLAG_ONEWAY = 0x01,
};

struct AIBinder;
// A local object or a proxy.
typedef struct AIBinder AIBinder;

struct AIBinder_Class;
// The functions of a kind of local object. Never freed.
typedef struct AIBinder_Class AIBinder_Class;

struct AIBinder_Weak;
// A reference that does not keep the object alive.
typedef struct AIBinder_Weak AIBinder_Weak;

struct AIBinder_DeathRecipient;
// Someone to be told when the process of a remote object dies.
typedef struct AIBinder_DeathRecipient AIBinder_DeathRecipient;

// Makes an object's user data from the argument of AIBinder_new.
typedef void* (*AIBinder_Class_onCreate)(void* args);
// Called once when the last strong reference goes; `userData` is what onCreate returned.
typedef void (*AIBinder_Class_onDestroy)(void* userData);
// Serves a user transaction whose interface token was right; `in` stands after the token.
typedef binder_status_t (*AIBinder_Class_onTransact)(AIBinder* binder, transaction_code_t code,
                                                     const AParcel* in, AParcel* out);
// Writes a report about the object to `fd`, which stays the caller's.
typedef binder_status_t (*AIBinder_onDump)(AIBinder* binder, int fd, const char** args,
                                           uint32_t numArgs);
// Told of a death, on a binder thread, with the cookie of the link.
typedef void (*AIBinder_DeathRecipient_onBinderDied)(void* cookie);

// Defines a class of local objects under a descriptor (copied). Null when an argument is null.
// Every definition is a class of its own, also under the same string.
__attribute__((warn_unused_result)) AIBinder_Class* AIBinder_Class_define(
        const char* interfaceDescriptor, AIBinder_Class_onCreate onCreate,
        AIBinder_Class_onDestroy onDestroy, AIBinder_Class_onTransact onTransact)
        __INTRODUCED_IN(29);

// Sets the function for dump requests; before the first object is made. Aborts on a null class.
void AIBinder_Class_setOnDump(AIBinder_Class* clazz, AIBinder_onDump onDump) __INTRODUCED_IN(29);

// The class's descriptor, owned by the class. Aborts on null.
const char* AIBinder_Class_getDescriptor(const AIBinder_Class* clazz) __INTRODUCED_IN(31);

// A new local object with one strong reference, the caller's; null for a null class.
__attribute__((warn_unused_result)) AIBinder* AIBinder_new(const AIBinder_Class* clazz, void* args)
        __INTRODUCED_IN(29);

// True for a proxy; false for null.
bool AIBinder_isRemote(const AIBinder* binder) __INTRODUCED_IN(29);

// What is known without asking: false for null and for a proxy once a death notice or a
// STATUS_DEAD_OBJECT came for it.
bool AIBinder_isAlive(const AIBinder* binder) __INTRODUCED_IN(29);

// Asks the object's process for a sign of life. STATUS_OK for a local object.
binder_status_t AIBinder_ping(AIBinder* binder) __INTRODUCED_IN(29);

// Asks the object to report to `fd`, which stays the caller's. `args` holds `numArgs` strings.
binder_status_t AIBinder_dump(AIBinder* binder, int fd, const char** args, uint32_t numArgs)
        __INTRODUCED_IN(29);

// Links `recipient` to the death of a proxy's process; `cookie` is handed to it. Each link fires
// once; the same pair may be linked again. STATUS_UNEXPECTED_NULL, STATUS_INVALID_OPERATION (local
// object) or STATUS_DEAD_OBJECT (already reported) on failure. Links vanish with the proxy's last
// reference. Needs a thread in the pool to be told on.
binder_status_t AIBinder_linkToDeath(AIBinder* binder, AIBinder_DeathRecipient* recipient,
                                     void* cookie) __INTRODUCED_IN(29);

// Removes the newest link made with these arguments; STATUS_NAME_NOT_FOUND when there is none
// (any more).
binder_status_t AIBinder_unlinkToDeath(AIBinder* binder, AIBinder_DeathRecipient* recipient,
                                       void* cookie) __INTRODUCED_IN(29);

// In a transaction the sender's effective uid, else this process's real uid.
uid_t AIBinder_getCallingUid(void) __INTRODUCED_IN(29);

// In a transaction the sender's pid (0 in a oneway one, where it is unknown), else our own.
pid_t AIBinder_getCallingPid(void) __INTRODUCED_IN(29);

// Takes a strong reference. Null is allowed.
void AIBinder_incStrong(AIBinder* binder) __INTRODUCED_IN(29);

// Drops a strong reference.
void AIBinder_decStrong(AIBinder* binder) __INTRODUCED_IN(29);

// The number of strong references at this moment, -1 for null. For tests and reports only.
int32_t AIBinder_debugGetRefCount(AIBinder* binder) __INTRODUCED_IN(29);

// Gives a proxy its class after asking the object for its descriptor; true when the object has
// this very class, now or before. On a thread that serves a call nobody is asked: what a caller
// hands over is taken on trust, since its process might never answer, and an object of another
// interface refuses calls itself.
bool AIBinder_associateClass(AIBinder* binder, const AIBinder_Class* clazz) __INTRODUCED_IN(29);

// The class, null for null and for a proxy that has none yet.
const AIBinder_Class* AIBinder_getClass(AIBinder* binder) __INTRODUCED_IN(29);

// What onCreate returned; null for a proxy.
void* AIBinder_getUserData(AIBinder* binder) __INTRODUCED_IN(29);

// A new parcel for a call to `binder`, starting with the interface token; the caller owns it until
// AIBinder_transact. STATUS_INVALID_OPERATION for an object without a class.
binder_status_t AIBinder_prepareTransaction(AIBinder* binder, AParcel** in) __INTRODUCED_IN(29);

// Calls a user method. `*in` is deleted and set to null in every case; `*out` is a new parcel of
// the caller's on STATUS_OK (empty after a oneway call), else null.
binder_status_t AIBinder_transact(AIBinder* binder, transaction_code_t code, AParcel** in,
                                  AParcel** out, binder_flags_t flags) __INTRODUCED_IN(29);

// A weak reference to be deleted by the caller; null for null.
__attribute__((warn_unused_result)) AIBinder_Weak* AIBinder_Weak_new(AIBinder* binder)
        __INTRODUCED_IN(29);

// Frees a weak reference. Null is allowed.
void AIBinder_Weak_delete(AIBinder_Weak* weakBinder) __INTRODUCED_IN(29);

// A strong reference for the caller, or null when the object is gone.
__attribute__((warn_unused_result)) AIBinder* AIBinder_Weak_promote(AIBinder_Weak* weakBinder)
        __INTRODUCED_IN(29);

// A recipient to be deleted by the caller; null for null.
__attribute__((warn_unused_result)) AIBinder_DeathRecipient* AIBinder_DeathRecipient_new(
        AIBinder_DeathRecipient_onBinderDied onBinderDied) __INTRODUCED_IN(29);

// Drops all links of a recipient without firing them and frees it. Null is allowed.
void AIBinder_DeathRecipient_delete(AIBinder_DeathRecipient* recipient) __INTRODUCED_IN(29);

// The object a vendor attached to `binder`. STATUS_OK with null in `*outExt` when there is none;
// else one strong reference for the caller. Asks anew each time for a proxy.
binder_status_t AIBinder_getExtension(AIBinder* binder, AIBinder** outExt) __INTRODUCED_IN(30);

// Attaches `ext` to a local object, which takes a strong reference. To be done before the object
// is shared: there is no lock.
binder_status_t AIBinder_setExtension(AIBinder* binder, AIBinder* ext) __INTRODUCED_IN(30);

// An order of objects for sorted containers; null comes first.
bool AIBinder_lt(const AIBinder* lhs, const AIBinder* rhs) __INTRODUCED_IN(31);

// Another weak reference to the same object; null for null.
__attribute__((warn_unused_result)) AIBinder_Weak* AIBinder_Weak_clone(const AIBinder_Weak* weak)
        __INTRODUCED_IN(31);

// An order of weak references that holds also after the object is gone; null comes first.
bool AIBinder_Weak_lt(const AIBinder_Weak* lhs, const AIBinder_Weak* rhs) __INTRODUCED_IN(31);

__END_DECLS
