// SPDX-License-Identifier: Apache-2.0
//
// What the manifests declare, and how a faulty one is reported.
#include "platform/servicemanager/manifests.h"

#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/fake_root.h"

namespace servicemanager {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

// A root, and the log lines of what reads its manifests.
class ManifestsTest : public ::testing::Test {
  protected:
    const qvx::test::FakeRoot mRoot;
    std::vector<std::string> mLines;
    const Manifests mManifests{mRoot.path(),
                               [this](const std::string& line) { mLines.push_back(line); }};
};

// A device manifest around these <hal> elements.
std::string device(const std::string& hals) {
    return "<manifest version=\"1.0\" type=\"device\">\n" + hals + "</manifest>\n";
}

std::string framework(const std::string& hals) {
    return "<manifest version=\"1.0\" type=\"framework\">\n" + hals + "</manifest>\n";
}

constexpr const char* kVibrator =
        "<hal format=\"aidl\">\n"
        "<name>android.hardware.vibrator</name>\n"
        "<version>2</version>\n"
        "<fqname>IVibrator/default</fqname>\n"
        "</hal>\n";

constexpr const char* kVibratorName = "android.hardware.vibrator.IVibrator/default";

TEST_F(ManifestsTest, WithoutAnyFileNothingIsDeclaredAndNothingIsLogged) {
    EXPECT_FALSE(mManifests.isDeclared(kVibratorName));
    EXPECT_THAT(mManifests.instancesOf("android.hardware.vibrator.IVibrator"), IsEmpty());
    EXPECT_FALSE(mManifests.updatableViaApex(kVibratorName));
    EXPECT_THAT(mLines, IsEmpty());
}

TEST_F(ManifestsTest, DeviceManifestIsRead) {
    mRoot.put("/vendor/etc/vintf/manifest.xml", device(kVibrator));
    EXPECT_TRUE(mManifests.isDeclared(kVibratorName));
}

TEST_F(ManifestsTest, EveryPlaceForADeviceManifestIsRead) {
    for (const char* path :
         {"/vendor/etc/vintf/manifest.xml", "/vendor/etc/vintf/manifest/vibrator.xml",
          "/odm/etc/vintf/manifest.xml", "/odm/etc/vintf/manifest/vibrator.xml"}) {
        mRoot.put(path, device(kVibrator));
        EXPECT_TRUE(mManifests.isDeclared(kVibratorName)) << path;
        mRoot.remove(path);
        EXPECT_FALSE(mManifests.isDeclared(kVibratorName)) << path;
    }
}

TEST_F(ManifestsTest, EveryPlaceForAFrameworkManifestIsRead) {
    for (const char* path :
         {"/system/etc/vintf/manifest.xml", "/system/etc/vintf/manifest/vibrator.xml",
          "/product/etc/vintf/manifest.xml", "/system_ext/etc/vintf/manifest/vibrator.xml"}) {
        mRoot.put(path, framework(kVibrator));
        EXPECT_TRUE(mManifests.isDeclared(kVibratorName)) << path;
        mRoot.remove(path);
    }
}

TEST_F(ManifestsTest, FilesAreReadAnewForEveryQuestion) {
    EXPECT_FALSE(mManifests.isDeclared(kVibratorName));
    mRoot.put("/vendor/etc/vintf/manifest/vibrator.xml", device(kVibrator));
    EXPECT_TRUE(mManifests.isDeclared(kVibratorName));
    mRoot.remove("/vendor/etc/vintf/manifest/vibrator.xml");
    EXPECT_FALSE(mManifests.isDeclared(kVibratorName));
}

TEST_F(ManifestsTest, OnlyFilesThatEndInXmlAreFragments) {
    mRoot.put("/vendor/etc/vintf/manifest/vibrator.xml.bak", device(kVibrator));
    mRoot.put("/vendor/etc/vintf/manifest/README", "notes");
    EXPECT_FALSE(mManifests.isDeclared(kVibratorName));
    EXPECT_THAT(mLines, IsEmpty());
}

TEST_F(ManifestsTest, PackageInterfaceAndInstanceMustAllMatch) {
    mRoot.put("/vendor/etc/vintf/manifest.xml", device(kVibrator));
    EXPECT_FALSE(mManifests.isDeclared("android.hardware.vibrator.IVibrator/other"));
    EXPECT_FALSE(mManifests.isDeclared("android.hardware.vibrator.IVibratorManager/default"));
    EXPECT_FALSE(mManifests.isDeclared("android.hardware.light.IVibrator/default"));
    EXPECT_FALSE(mManifests.isDeclared("android.hardware.vibrator.IVibrator"));
    EXPECT_FALSE(mManifests.isDeclared("vibrator/default"));
    EXPECT_FALSE(mManifests.isDeclared(""));
}

TEST_F(ManifestsTest, VersionOfTheHalDoesNotMatter) {
    mRoot.put("/vendor/etc/vintf/manifest.xml",
              device("<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/x</fqname></hal>"
                     "<hal format=\"aidl\"><name>a.b</name><version>7</version>"
                     "<fqname>IFoo/y</fqname></hal>"));
    EXPECT_TRUE(mManifests.isDeclared("a.b.IFoo/x"));
    EXPECT_TRUE(mManifests.isDeclared("a.b.IFoo/y"));
}

TEST_F(ManifestsTest, OtherFormatsDeclareNoAidlService) {
    mRoot.put(
            "/vendor/etc/vintf/manifest.xml",
            device("<hal format=\"hidl\"><name>a.b</name><fqname>@1.0::IFoo/default</fqname></hal>"
                   "<hal><name>a.b</name><fqname>IFoo/default</fqname></hal>"));
    EXPECT_FALSE(mManifests.isDeclared("a.b.IFoo/default"));
    EXPECT_THAT(mLines, IsEmpty());
}

TEST_F(ManifestsTest, OlderFormWithInterfaceElementsIsUnderstood) {
    mRoot.put("/vendor/etc/vintf/manifest.xml",
              device("<hal format=\"aidl\"><name>a.b</name><interface><name>IFoo</name>"
                     "<instance>left</instance><instance>right</instance></interface></hal>"));
    EXPECT_TRUE(mManifests.isDeclared("a.b.IFoo/left"));
    EXPECT_TRUE(mManifests.isDeclared("a.b.IFoo/right"));
    EXPECT_FALSE(mManifests.isDeclared("a.b.IFoo/default"));
}

TEST_F(ManifestsTest, InstancesAreTheDevicesInByteOrderThenTheFrameworks) {
    mRoot.put("/vendor/etc/vintf/manifest.xml",
              device("<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/z</fqname>"
                     "<fqname>IFoo/Z</fqname><fqname>IBar/no</fqname></hal>"));
    mRoot.put("/odm/etc/vintf/manifest/foo.xml",
              device("<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/m</fqname></hal>"));
    mRoot.put("/system/etc/vintf/manifest.xml",
              framework("<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/a</fqname></hal>"));
    EXPECT_THAT(mManifests.instancesOf("a.b.IFoo"), ElementsAre("Z", "m", "z", "a"));
    EXPECT_THAT(mManifests.instancesOf("IFoo"), IsEmpty());
}

TEST_F(ManifestsTest, ApexIsTheOneItsEntryNames) {
    mRoot.put("/vendor/etc/vintf/manifest.xml",
              device("<hal format=\"aidl\" updatable-via-apex=\"com.acme.foo\"><name>a.b</name>"
                     "<fqname>IFoo/x</fqname></hal>"
                     "<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/y</fqname></hal>"));
    EXPECT_EQ(mManifests.updatableViaApex("a.b.IFoo/x"), "com.acme.foo");
    EXPECT_FALSE(mManifests.updatableViaApex("a.b.IFoo/y"));
    EXPECT_FALSE(mManifests.updatableViaApex("a.b.IFoo/z"));
}

// Text of a faulty manifest, and what the log says about it.
struct Fault {
    const char* name;
    const char* text;
    const char* reason;
};

class FaultyManifest : public ManifestsTest, public ::testing::WithParamInterface<Fault> {};

TEST_P(FaultyManifest, IsReportedInOneLineAndPassedOver) {
    mRoot.put("/vendor/etc/vintf/manifest/bad.xml", GetParam().text);
    mRoot.put("/vendor/etc/vintf/manifest/good.xml", device(kVibrator));
    EXPECT_TRUE(mManifests.isDeclared(kVibratorName));
    EXPECT_THAT(mLines, ElementsAre("manifest " + mRoot.at("/vendor/etc/vintf/manifest/bad.xml") +
                                    " is passed over: " + GetParam().reason));
}

constexpr Fault kFaults[] = {
        {"Empty", "", "XML_ERROR_EMPTY_DOCUMENT"},
        {"NewlineInAQuotedText",
         "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\"><name>p</name>"
         "<fqname>I\nFoo</fqname></hal></manifest>",
         "line 1: fqname \"I\\nFoo\" is not of the form IFoo/instance"},
        {"CutOff", "<manifest version=\"1.0\" type=\"device\">\n<hal>\n",
         "line 2: XML_ERROR_PARSING"},
        {"MismatchedTag", "<manifest version=\"1.0\" type=\"device\">\n<hal>\n</lah></manifest>",
         "line 2: XML_ERROR_MISMATCHED_ELEMENT"},
        {"AnotherDocument", "<compatibility-matrix version=\"1.0\"/>", "no <manifest> element"},
        {"NoVersion", "<manifest type=\"device\"/>", "line 1: version \"\" is not 1.0 to 4.0"},
        {"VersionTooNew", "<manifest version=\"4.1\" type=\"device\"/>",
         "line 1: version \"4.1\" is not 1.0 to 4.0"},
        {"VersionNoNumber", "<manifest version=\"1.0b\" type=\"device\"/>",
         "line 1: version \"1.0b\" is not 1.0 to 4.0"},
        {"OtherType", "<manifest version=\"1.0\" type=\"framework\"/>",
         "line 1: type \"framework\" where \"device\" is expected"},
        {"HalWithoutName",
         "<manifest version=\"1.0\" type=\"device\">\n<hal format=\"aidl\"/>"
         "</manifest>",
         "line 2: hal has no name"},
        {"FqnameWithPackage",
         "<manifest version=\"1.0\" type=\"device\">\n<hal format=\"aidl\"><name>a.b</name>\n"
         "<fqname>a.b.IFoo/default</fqname></hal></manifest>",
         "line 3: fqname \"a.b.IFoo/default\" is not of the form IFoo/instance"},
        {"FqnameWithVersion",
         "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\"><name>a.b</name>"
         "<fqname>@1.0::IFoo/default</fqname></hal></manifest>",
         "line 1: fqname \"@1.0::IFoo/default\" is not of the form IFoo/instance"},
        {"FqnameWithoutInstance",
         "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\"><name>a.b</name>"
         "<fqname>IFoo</fqname></hal></manifest>",
         "line 1: fqname \"IFoo\" is not of the form IFoo/instance"},
        {"InterfaceWithoutName",
         "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\"><name>a.b</name>"
         "<interface><instance>x</instance></interface></hal></manifest>",
         "line 1: interface has no name"},
};

INSTANTIATE_TEST_SUITE_P(Manifests, FaultyManifest, ::testing::ValuesIn(kFaults),
                         [](const auto& fault) { return fault.param.name; });

TEST_F(ManifestsTest, AFaultDropsTheWholeFileNotItsBeginning) {
    mRoot.put("/vendor/etc/vintf/manifest.xml",
              device("<hal format=\"aidl\"><name>a.b</name><fqname>IFoo/x</fqname></hal>"
                     "<hal format=\"aidl\"/>"));
    EXPECT_FALSE(mManifests.isDeclared("a.b.IFoo/x"));
    EXPECT_EQ(mLines.size(), 1u);
}

}  // namespace
}  // namespace servicemanager
