// SPDX-License-Identifier: Apache-2.0
//
// Local objects, without any driver: classes, references, how they are sent.
#include "platform/libbinder_ndk/tests/unit/local_binder_test.h"

#include <android/binder_ibinder_platform.h>
#include <android/binder_stability.h>

#include "platform/libbinder_ndk/platform_include/binder_context_manager.h"

namespace binder_test {
namespace {

TEST(Classes, NullArgumentsDefineNothing) {
    EXPECT_EQ(nullptr, AIBinder_Class_define(nullptr, onCreate, onDestroy, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", nullptr, onDestroy, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", onCreate, nullptr, onTransact));
    EXPECT_EQ(nullptr, AIBinder_Class_define("x", onCreate, onDestroy, nullptr));
    EXPECT_EQ(nullptr, AIBinder_new(nullptr, nullptr));
}

TEST(Classes, SameTextIsAnotherClass) {
    const std::string text = "test.ISame";
    const AIBinder_Class* const one = defineClass(text.c_str());
    const AIBinder_Class* const two = defineClass("test.ISame");
    EXPECT_NE(one, two);
    EXPECT_STREQ("test.ISame", AIBinder_Class_getDescriptor(one));
    EXPECT_NE(text.c_str(), AIBinder_Class_getDescriptor(one));
}

TEST(ClassesDeathTest, NullClassAborts) {
    EXPECT_DEATH(AIBinder_Class_setOnDump(nullptr, nullptr), "class is null");
    EXPECT_DEATH(AIBinder_Class_setHandleShellCommand(nullptr, nullptr), "class is null");
    EXPECT_DEATH(AIBinder_Class_getDescriptor(nullptr), "class is null");
}

TEST_F(LocalBinder, UserDataLivesFromNewToTheLastReference) {
    EXPECT_EQ(1, mState.created);
    EXPECT_EQ(&mState, AIBinder_getUserData(mBinder));
    EXPECT_EQ(1, AIBinder_debugGetRefCount(mBinder));
    AIBinder_incStrong(mBinder);
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
    AIBinder_decStrong(mBinder);
    EXPECT_EQ(0, mState.destroyed);
    mOwner.set(nullptr);
    EXPECT_EQ(1, mState.destroyed);
}

TEST_F(LocalBinder, IsAliveAndNotRemote) {
    EXPECT_FALSE(AIBinder_isRemote(mBinder));
    EXPECT_TRUE(AIBinder_isAlive(mBinder));
    EXPECT_EQ(STATUS_OK, AIBinder_ping(mBinder));
    EXPECT_EQ(mClass, AIBinder_getClass(mBinder));
}

TEST(NullBinder, IsAnsweredAsTheInterfaceSays) {
    AIBinder* extension = nullptr;
    EXPECT_FALSE(AIBinder_isRemote(nullptr));
    EXPECT_FALSE(AIBinder_isAlive(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_ping(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_dump(nullptr, -1, nullptr, 0));
    EXPECT_EQ(-1, AIBinder_debugGetRefCount(nullptr));
    EXPECT_FALSE(AIBinder_associateClass(nullptr, defineClass()));
    EXPECT_EQ(nullptr, AIBinder_getClass(nullptr));
    EXPECT_EQ(nullptr, AIBinder_getUserData(nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_getExtension(nullptr, &extension));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_setExtension(nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_linkToDeath(nullptr, nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_unlinkToDeath(nullptr, nullptr, nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_prepareTransaction(nullptr, nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_new(nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_promote(nullptr));
    EXPECT_EQ(nullptr, AIBinder_Weak_clone(nullptr));
    AIBinder_Weak_delete(nullptr);
    AIBinder_incStrong(nullptr);
    AIBinder_decStrong(nullptr);
}

TEST_F(LocalBinder, AssociationNeedsTheVeryClass) {
    EXPECT_TRUE(AIBinder_associateClass(mBinder, mClass));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, defineClass()));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, defineClass("test.IOther")));
    EXPECT_FALSE(AIBinder_associateClass(mBinder, nullptr));
    EXPECT_EQ(mClass, AIBinder_getClass(mBinder));
}

TEST_F(LocalBinder, WeakReferencePromotesWhileTheObjectLives) {
    ndk::ScopedAIBinder_Weak weak(AIBinder_Weak_new(mBinder));
    ndk::ScopedAIBinder_Weak clone(AIBinder_Weak_clone(weak.get()));
    EXPECT_EQ(mBinder, weak.promote().get());
    EXPECT_EQ(1, AIBinder_debugGetRefCount(mBinder));
    mOwner.set(nullptr);
    EXPECT_EQ(1, mState.destroyed);
    EXPECT_EQ(nullptr, weak.promote().get());
    EXPECT_EQ(nullptr, clone.promote().get());
}

TEST_F(LocalBinder, OrdersPutNullFirst) {
    const ndk::SpAIBinder other(AIBinder_new(mClass, &mState));
    EXPECT_TRUE(AIBinder_lt(nullptr, mBinder));
    EXPECT_FALSE(AIBinder_lt(mBinder, nullptr));
    EXPECT_FALSE(AIBinder_lt(nullptr, nullptr));
    EXPECT_FALSE(AIBinder_lt(mBinder, mBinder));
    EXPECT_NE(AIBinder_lt(mBinder, other.get()), AIBinder_lt(other.get(), mBinder));

    const ndk::ScopedAIBinder_Weak one(AIBinder_Weak_new(mBinder));
    const ndk::ScopedAIBinder_Weak same(AIBinder_Weak_new(mBinder));
    const ndk::ScopedAIBinder_Weak two(AIBinder_Weak_new(other.get()));
    EXPECT_TRUE(AIBinder_Weak_lt(nullptr, one.get()));
    EXPECT_FALSE(AIBinder_Weak_lt(one.get(), nullptr));
    EXPECT_FALSE(AIBinder_Weak_lt(nullptr, nullptr));
    EXPECT_FALSE(AIBinder_Weak_lt(one.get(), same.get()));
    EXPECT_FALSE(AIBinder_Weak_lt(same.get(), one.get()));
    EXPECT_EQ(AIBinder_lt(mBinder, other.get()), AIBinder_Weak_lt(one.get(), two.get()));
}

TEST_F(LocalBinder, ExtensionIsHeldAndReplaced) {
    State extensionState;
    State laterState;
    ndk::SpAIBinder extension(AIBinder_new(mClass, &extensionState));
    ndk::SpAIBinder later(AIBinder_new(mClass, &laterState));
    AIBinder* found = mBinder;
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(mBinder, &found));
    EXPECT_EQ(nullptr, found);
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_setExtension(mBinder, nullptr));

    EXPECT_EQ(STATUS_OK, AIBinder_setExtension(mBinder, extension.get()));
    EXPECT_EQ(STATUS_OK, AIBinder_getExtension(mBinder, &found));
    EXPECT_EQ(extension.get(), found);
    EXPECT_EQ(3, AIBinder_debugGetRefCount(found));
    AIBinder_decStrong(found);
    extension.set(nullptr);
    EXPECT_EQ(0, extensionState.destroyed);

    EXPECT_EQ(STATUS_OK, AIBinder_setExtension(mBinder, later.get()));
    EXPECT_EQ(1, extensionState.destroyed);
    mOwner.set(nullptr);
    later.set(nullptr);
    EXPECT_EQ(1, laterState.destroyed);
}

TEST_F(LocalBinder, DeathLinksAreForProxies) {
    const ndk::ScopedAIBinder_DeathRecipient recipient(AIBinder_DeathRecipient_new([](void*) {}));
    EXPECT_EQ(STATUS_INVALID_OPERATION, AIBinder_linkToDeath(mBinder, recipient.get(), nullptr));
    EXPECT_EQ(STATUS_UNEXPECTED_NULL, AIBinder_linkToDeath(mBinder, nullptr, nullptr));
    EXPECT_EQ(nullptr, AIBinder_DeathRecipient_new(nullptr));
    AIBinder_DeathRecipient_delete(nullptr);
}

TEST_F(LocalBinder, SentObjectCarriesKeyCookieAndSystemStability) {
    const ndk::ScopedAParcel parcel(AParcel_create());
    EXPECT_EQ(STATUS_OK, AParcel_writeStrongBinder(parcel.get(), mBinder));
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder)) << "the parcel holds it";
    const auto all = words(parcel.get());
    ASSERT_EQ(7U, all.size());
    EXPECT_EQ(0x73622a85U, all[0]);
    EXPECT_EQ(0x113U, all[1]);
    EXPECT_NE(0U, all[2] | all[3]);
    EXPECT_EQ(reinterpret_cast<uint64_t>(mBinder), all[4] | uint64_t{all[5]} << 32);
    EXPECT_EQ(0x0c000001U, all[6]);
    EXPECT_EQ(0U, (*parcel.get())->offsets()[0]);

    ndk::SpAIBinder read;
    AParcel_setDataPosition(parcel.get(), 0);
    EXPECT_EQ(STATUS_OK, AParcel_readStrongBinder(parcel.get(), read.getR()));
    EXPECT_EQ(mBinder, read.get());
    AParcel_reset(parcel.get());
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
}

TEST_F(LocalBinder, RequestingTheCallersContextShowsInTheFlags) {
    AIBinder_setRequestingSid(mBinder, true);
    const ndk::ScopedAParcel parcel(AParcel_create());
    AParcel_writeStrongBinder(parcel.get(), mBinder);
    EXPECT_EQ(0x1113U, words(parcel.get())[1]);
}

TEST_F(LocalBinder, AppendingAnObjectTakesAReference) {
    const ndk::ScopedAParcel from(AParcel_create());
    ndk::ScopedAParcel to(AParcel_create());
    AParcel_writeStrongBinder(from.get(), mBinder);
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), to.get(), 0, 28));
    EXPECT_EQ(3, AIBinder_debugGetRefCount(mBinder));
    EXPECT_EQ(words(from.get()), words(to.get()));
    to.set(nullptr);
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));

    to.set(AParcel_create());
    EXPECT_EQ(STATUS_OK, AParcel_appendFrom(from.get(), to.get(), 0, 20));
    EXPECT_EQ(0U, (*to.get())->offsetCount()) << "a part of an object is plain data";
    EXPECT_EQ(2, AIBinder_debugGetRefCount(mBinder));
}

TEST_F(LocalBinder, StabilityMarks) {
    const auto word = [](AIBinder* binder) {
        const ndk::ScopedAParcel parcel(AParcel_create());
        AParcel_writeStrongBinder(parcel.get(), binder);
        return words(parcel.get())[6];
    };
    State state;
    const ndk::SpAIBinder vendor(AIBinder_new(mClass, &state));
    const ndk::SpAIBinder vintf(AIBinder_new(mClass, &state));
    AIBinder_markVendorStability(vendor.get());
    AIBinder_markVendorStability(vendor.get());
    AIBinder_markVintfStability(vintf.get());
    AIBinder_markCompilationUnitStability(mBinder);
    EXPECT_EQ(0x03000001U, word(vendor.get()));
    EXPECT_EQ(0x3f000001U, word(vintf.get()));
    EXPECT_EQ(0x0c000001U, word(mBinder));
    EXPECT_TRUE(AIBinder_requiresVintfDeclaration(vintf.get()));
    EXPECT_FALSE(AIBinder_requiresVintfDeclaration(vendor.get()));
    EXPECT_FALSE(AIBinder_requiresVintfDeclaration(nullptr));
    AIBinder_forceDowngradeToVendorStability(vintf.get());
    EXPECT_EQ(0x03000001U, word(vintf.get()));
}

TEST_F(LocalBinder, AnotherStabilityMarkAborts) {
    AIBinder_markVintfStability(mBinder);
    EXPECT_DEATH(AIBinder_markVendorStability(mBinder), "cannot be marked");
    EXPECT_DEATH(AIBinder_markSystemStability(nullptr), "local binder");
}

}  // namespace
}  // namespace binder_test
