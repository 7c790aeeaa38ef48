// SPDX-License-Identifier: Apache-2.0
//
// Stability: the promise how long an object's interface stays what it is, and with it who may call
// the object. Vendor code calls vendor and VINTF objects, system code system and VINTF objects.
#pragma once

#include <android/binder_ibinder.h>

__BEGIN_DECLS

enum {
    // The caller is vendor code.
    FLAG_PRIVATE_VENDOR = 0x10000000,
#if defined(__ANDROID_VENDOR__)
    // The caller is code of this image.
    FLAG_PRIVATE_LOCAL = FLAG_PRIVATE_VENDOR,
#else
    FLAG_PRIVATE_LOCAL = 0,
#endif
};

// Marks a local object as stable within the vendor image, system image, or for as long as the
// interface is served at all. Aborts when the object has another mark.
void AIBinder_markVendorStability(AIBinder* binder);
void AIBinder_markSystemStability(AIBinder* binder);
void AIBinder_markVintfStability(AIBinder* binder) __INTRODUCED_IN(30);

// Lowers the mark of a local object that was not sent yet.
void AIBinder_forceDowngradeToVendorStability(AIBinder* binder);
void AIBinder_forceDowngradeToSystemStability(AIBinder* binder);

// The mark for the image this code is compiled for.
static inline void AIBinder_markCompilationUnitStability(AIBinder* binder) {
#if defined(__ANDROID_VENDOR__)
    AIBinder_markVendorStability(binder);
#else
    AIBinder_markSystemStability(binder);
#endif
}

// Lowers the mark to that of the image this code is compiled for.
static inline void AIBinder_forceDowngradeToLocalStability(AIBinder* binder) {
#if defined(__ANDROID_VENDOR__)
    AIBinder_forceDowngradeToVendorStability(binder);
#else
    AIBinder_forceDowngradeToSystemStability(binder);
#endif
}

__END_DECLS
