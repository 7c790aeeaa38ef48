// SPDX-License-Identifier: Apache-2.0
//
// The schema and the document of profiles, beside the keys that the reader knows.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/driver/profile_reader.h"
#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

using testing::HasSubstr;

Json schema() {
    const Json document =
            Json::parse(contentOf(QVX_PROFILE_DIRECTORY "/profile.schema.json"), nullptr, false);
    return document.value("definitions", Json());
}

std::string document() {
    return contentOf(QVX_PROFILE_DIRECTORY "/../../docs/profile.md");
}

TEST(ProfileSchema, HasTheKeysTheReaderKnowsAndNoOther) {
    const Json definitions = schema();
    size_t known = 0;
    for (const KnownKey& key : knownKeys()) {
        const Json properties = definitions.value(std::string(key.object), Json())["properties"];
        EXPECT_TRUE(properties.contains(std::string(key.key))) << key.object << "." << key.key;
        ++known;
    }
    size_t described = 0;
    for (const auto& [name, definition] : definitions.items()) {
        described += definition["properties"].size();
    }
    EXPECT_EQ(described, known);
    EXPECT_EQ(definitions.size(), 5U);
}

TEST(ProfileSchema, HasTheReadersRangesAndNames) {
    const Json definitions = schema();
    for (const KnownKey& key : knownKeys()) {
        if (key.accepted == nullptr) continue;
        const Json property = definitions[std::string(key.object)]["properties"].value(
                std::string(key.key), Json::object());
        if (key.accepted->type == Accepted::Type::kInteger) {
            EXPECT_EQ(property.value("minimum", uint64_t{99}), key.accepted->least) << key.key;
            EXPECT_EQ(property.value("maximum", uint64_t{0}), key.accepted->most) << key.key;
        } else if (key.accepted->type == Accepted::Type::kName) {
            EXPECT_EQ(property.value("enum", std::vector<std::string>()),
                      (std::vector<std::string>{key.accepted->names.begin(),
                                                key.accepted->names.end()}));
        } else {
            const bool isBoolean = key.accepted->type == Accepted::Type::kBoolean;
            EXPECT_EQ(property.value("type", ""), isBoolean ? "boolean" : "string") << key.key;
        }
    }
}

TEST(ProfileDocument, NamesEveryKey) {
    for (const KnownKey& key : knownKeys()) {
        EXPECT_THAT(document(), HasSubstr("`" + std::string(key.key) + "`"));
    }
}

TEST(ProfileDocument, ItsExampleIsAProfile) {
    const std::string text = document();
    const std::string open = "```json\n";
    const size_t start = text.find(open);
    ASSERT_NE(start, std::string::npos);
    const size_t end = text.find("```", start + open.size());
    const auto profile = parseProfile(text.substr(start + open.size(), end - start - open.size()));
    ASSERT_TRUE(profile) << profile.error().message();
    EXPECT_EQ(profile->faults.size(), 3U);
}

}  // namespace
}  // namespace handset
