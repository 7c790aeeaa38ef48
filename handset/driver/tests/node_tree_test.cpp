// SPDX-License-Identifier: Apache-2.0
//
// The tree of nodes and what a node keeps.
#include "handset/driver/node_tree.h"

#include <gtest/gtest.h>

namespace handset {
namespace {

const std::vector<NodeProfile> kSpecs = {
        {"/sys/class/leds/vibrator/duration", Access::kReadWrite, "0\n", false},
        {"/sys/class/leds/vibrator/motor_type", Access::kReadWrite, "LINEAR\n", true},
        {"/sys/class/leds/vibrator/num_waves", Access::kReadOnly, "137\n", false},
        {"/sys/class/timed_output/vibrator/trigger", Access::kWriteOnly, "", false},
};

class Tree : public testing::Test {
  protected:
    NodeTree mTree{"/sys/class", kSpecs};
};

TEST_F(Tree, DirectoriesAreMadeFromThePaths) {
    const TreeEntry* root = mTree.find(1);
    ASSERT_NE(root, nullptr);
    EXPECT_EQ(root->children.size(), 2U);
    const TreeEntry* leds = mTree.child(1, "leds");
    ASSERT_NE(leds, nullptr);
    EXPECT_EQ(leds->node, nullptr);
    EXPECT_EQ(leds->parent, 1U);
    const TreeEntry* vibrator = mTree.child(leds->inode, "vibrator");
    ASSERT_NE(vibrator, nullptr);
    EXPECT_EQ(vibrator->children.size(), 3U);
    const TreeEntry* duration = mTree.child(vibrator->inode, "duration");
    ASSERT_NE(duration, nullptr);
    ASSERT_NE(duration->node, nullptr);
    EXPECT_EQ(duration->node->path(), "/sys/class/leds/vibrator/duration");
}

TEST_F(Tree, WhatIsNotThereIsNotFound) {
    EXPECT_EQ(mTree.child(1, "vibrator"), nullptr);
    EXPECT_EQ(mTree.child(99, "leds"), nullptr);
    EXPECT_EQ(mTree.find(0), nullptr);
    EXPECT_EQ(mTree.find(99), nullptr);
    EXPECT_EQ(mTree.nodeAt("/sys/class/leds/vibrator"), nullptr);
    EXPECT_EQ(mTree.nodeAt("/sys/class/leds/vibrator/state"), nullptr);
}

TEST_F(Tree, PathsAreSpelledFromTheRoot) {
    const TreeEntry* vibrator = mTree.child(mTree.child(1, "leds")->inode, "vibrator");
    EXPECT_EQ(mTree.pathOf(vibrator->inode, "new"), "/sys/class/leds/vibrator/new");
    EXPECT_EQ(mTree.pathOf(1, "new"), "/sys/class/new");
}

TEST_F(Tree, TheSystemUserOwnsTheNodes) {
    const Attributes both = mTree.nodeAt("/sys/class/leds/vibrator/duration")->attributes();
    EXPECT_EQ(both.mode, 0664U);
    EXPECT_EQ(both.uid, 1000U);
    EXPECT_EQ(both.gid, 1000U);
    EXPECT_EQ(mTree.nodeAt("/sys/class/leds/vibrator/num_waves")->attributes().mode, 0444U);
    EXPECT_EQ(mTree.nodeAt("/sys/class/timed_output/vibrator/trigger")->attributes().mode, 0220U);
}

TEST_F(Tree, AWriteReplacesTheText) {
    Node* node = mTree.nodeAt("/sys/class/leds/vibrator/duration");
    EXPECT_EQ(node->text(), "0\n");
    node->store("500\n");
    EXPECT_EQ(node->text(), "500\n");
    node->store("5");
    EXPECT_EQ(node->text(), "5");
}

TEST_F(Tree, ANodeThatHoldsKeepsItsTextFromClientsOnly) {
    Node* node = mTree.nodeAt("/sys/class/leds/vibrator/motor_type");
    node->store("COINDC\n");
    EXPECT_EQ(node->text(), "LINEAR\n");
    node->setText("COINDC\n");
    EXPECT_EQ(node->text(), "COINDC\n");
}

TEST_F(Tree, ModesSayWhichMethodsThereAre) {
    EXPECT_TRUE(mTree.nodeAt("/sys/class/leds/vibrator/duration")->isReadable());
    EXPECT_TRUE(mTree.nodeAt("/sys/class/leds/vibrator/duration")->isWritable());
    EXPECT_FALSE(mTree.nodeAt("/sys/class/leds/vibrator/num_waves")->isWritable());
    EXPECT_FALSE(mTree.nodeAt("/sys/class/timed_output/vibrator/trigger")->isReadable());
}

TEST(NodeTree, WithoutNodesThereIsAnEmptyRoot) {
    const NodeTree tree("/sys/class", {});
    ASSERT_NE(tree.find(1), nullptr);
    EXPECT_TRUE(tree.find(1)->children.empty());
    EXPECT_EQ(tree.find(2), nullptr);
}

}  // namespace
}  // namespace handset
