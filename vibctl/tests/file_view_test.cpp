// SPDX-License-Identifier: Apache-2.0
//
// Files as another user may open them.
#include "vibctl/doctor/file_view.h"

#include <unistd.h>

#include <functional>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/process.h"
#include "vibctl/tests/doctor_root.h"

namespace vibctl {
namespace {

using ::testing::ElementsAre;

// A user that the machine running the test does not have.
constexpr uid_t kStranger = 4242;

// Runs `body` as a user that is neither root nor any that owns a file here; what it returns.
bool asSomebodyElse(const std::function<bool()>& body) {
    const uid_t somebody = geteuid() == 0 ? 4243 : geteuid();
    return qvx::test::Process(somebody, [&] { EXPECT_TRUE(body()); }).wait() == 0;
}

struct ModeCase {
    const char* name;
    mode_t mode;
    User user;
    int error;  // of opening read-write
};

class ModeBits : public ::testing::TestWithParam<ModeCase> {};

TEST_P(ModeBits, DecideWhereTheUserCannotBeTakenOn) {
    const fake::Root root;
    root.put("/node");
    root.chmod("/node", GetParam().mode);
    const gid_t ownGroup = getegid();
    EXPECT_TRUE(asSomebodyElse([&] {
        const FileView view(root.path());
        User user = GetParam().user;
        if (user.groups == std::vector<gid_t>{0}) user.groups = {ownGroup};
        const std::vector<Access> accesses = {{"/node", 2 /* O_RDWR */}};
        return !FileView::canBecome(user) && view.open(user, accesses)[0] == GetParam().error;
    }));
}

const ModeCase kModeCases[] = {
        {"Others", 0666, {kStranger, kStranger, {}}, 0},
        {"OthersMayOnlyRead", 0664, {kStranger, kStranger, {}}, 13},
        {"Group", 0660, {kStranger, kStranger, {0}}, 0},
        {"GroupCountsBeforeOthers", 0606, {kStranger, kStranger, {0}}, 13},
};

INSTANTIATE_TEST_SUITE_P(Doctor, ModeBits, ::testing::ValuesIn(kModeCases),
                         [](const auto& one) { return one.param.name; });

TEST(FileViewTest, DirectoriesMustLetTheUserThrough) {
    const fake::Root root;
    root.put("/directory/node");
    root.chmod("/directory", 0700);
    const std::vector<Access> accesses = {{"/directory/node", 0 /* O_RDONLY */}};
    const User stranger = {kStranger, kStranger, {}};
    EXPECT_THAT(FileView(root.path()).open(stranger, accesses), ElementsAre(13 /* EACCES */));
    // Kept open, because somebody else may not look the directory up again.
    const FileView view(root.path());
    EXPECT_TRUE(
            asSomebodyElse([&] { return view.open(stranger, accesses) == std::vector<int>{13}; }));
}

TEST(FileViewTest, ListsADirectoryInOrder) {
    const fake::Root root;
    root.putNodes("/nodes", {"state", "activate"});
    EXPECT_THAT(FileView(root.path()).list("/nodes/"), ElementsAre("activate", "state"));
    EXPECT_THAT(FileView(root.path()).list("/none/"), ElementsAre());
}

}  // namespace
}  // namespace vibctl
