#include "framework/Bundle.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <fstream>

#include "framework/PluginSearch.h"
#include "host/VXMediaManager.h"
#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::HasSubstr;

// The bundle that was built, and copies of it that a test damages.
class BundleTest : public testing::Test {
  protected:
    std::string copyOfBundle(const std::string& name = "Copy.vxplugin") {
        const std::string copy = environment.home.path(name);
        fs::create_directories(fs::path(copy).parent_path());
        fs::copy(REELIX_BUNDLE_DIR, copy, fs::copy_options::recursive);
        return copy;
    }
    void writeDescriptor(const std::string& bundle, const std::string& entries) {
        environment.home.writeFile(
            fs::relative(bundle, environment.home.path()).string() + "/Contents/Info.plist",
            "<?xml version=\"1.0\"?><plist version=\"1.0\"><dict>" + entries + "</dict></plist>");
    }

    testing_support::HostEnvironment environment;
    const std::string identifier = "<key>CFBundleIdentifier</key><string>test</string>";
    const std::string executable = "<key>CFBundleExecutable</key><string>Reelix.so</string>";
    const std::string principal = "<key>NSPrincipalClass</key><string>VXReelixPlugin</string>";
    const std::string version = "<key>VXHostInterfaceVersion</key><integer>1</integer>";
};

TEST_F(BundleTest, TheBuiltBundleMakesItsPrincipalClass) {
    const BundleResult result = Bundle::open(REELIX_BUNDLE_DIR);
    ASSERT_NE(result.bundle, nullptr) << result.error;
    EXPECT_EQ(result.bundle->identifier(), "com.vexo.plugin.reelix");

    std::string error;
    const VXPrincipalClass* principalClass = result.bundle->principalClass(error);
    ASSERT_NE(principalClass, nullptr) << error;
    EXPECT_FALSE(principalClass->isManagedMediaSource());
    EXPECT_DOUBLE_EQ(principalClass->versionNumber, 507.3);
    EXPECT_EQ(std::string(principalClass->versionString), "@(#)PROGRAM:Reelix  PROJECT:Vexo-507.3\n");
    EXPECT_EQ(principalClass->supportedPasteboardTypes(),
              (platform::Array{platform::Value(platform::Array{"VXReelixProjectsPboardType"})}));

    const auto manager = principalClass->newObject(result.bundle);
    ASSERT_NE(manager, nullptr);
    EXPECT_EQ(manager->uniqueID(), "Reelix Media Manager");
    EXPECT_EQ(manager->rootMediaGroupIcon()->name(), "MBReelixAppIconSmall");
}

TEST_F(BundleTest, TextsAndIconsComeFromItsResources) {
    const BundleResult result = Bundle::open(REELIX_BUNDLE_DIR);
    ASSERT_NE(result.bundle, nullptr) << result.error;
    EXPECT_EQ(result.bundle->localizedString("ReelixProjectLibrary"), "Project Library");
    EXPECT_EQ(result.bundle->localizedString("missing"), std::nullopt);
    const auto icon = result.bundle->iconNamed("Reelix-icon-event");
    ASSERT_NE(icon, nullptr);
    EXPECT_EQ(icon->name(), "Reelix-icon-event");
    EXPECT_NE(icon, result.bundle->iconNamed("Reelix-icon-event"));
    EXPECT_EQ(result.bundle->iconNamed("missing"), nullptr);
    EXPECT_EQ(result.bundle->iconNamed("../Icons/Reelix-icon-event"), nullptr);
}

TEST_F(BundleTest, EachIconIsReadOnceAndShownByImagesOfTheirOwn) {
    const std::string bundlePath = copyOfBundle();
    const BundleResult result = Bundle::open(bundlePath);
    ASSERT_NE(result.bundle, nullptr) << result.error;
    const auto first = result.bundle->iconNamed("Reelix-icon-event");
    fs::remove_all(bundlePath + "/Contents/Resources/Icons");
    const auto second = result.bundle->iconNamed("Reelix-icon-event");
    ASSERT_NE(second, nullptr);
    EXPECT_NE(first, second);
    EXPECT_EQ(first->picture(), second->picture());
    first->setSize({16, 16});
    EXPECT_EQ(second->size(), (platform::Size{32, 32}));
}

TEST_F(BundleTest, AnIconThatWasMissingOrDamagedIsLookedForAgain) {
    const std::string bundlePath = copyOfBundle();
    const std::string icons = bundlePath + "/Contents/Resources/Icons/";
    const BundleResult result = Bundle::open(bundlePath);
    ASSERT_NE(result.bundle, nullptr) << result.error;
    EXPECT_EQ(result.bundle->iconNamed("new"), nullptr);
    std::ofstream(icons + "new.svg") << "<svg";
    EXPECT_FALSE(result.bundle->iconNamed("new")->isValid());
    fs::copy_file(icons + "Reelix-icon-event.svg", icons + "new.svg", fs::copy_options::overwrite_existing);
    EXPECT_TRUE(result.bundle->iconNamed("new")->isValid());
}

TEST_F(BundleTest, AFolderThatIsNoBundleIsRefused) {
    const BundleResult result = Bundle::open(environment.home.path());
    EXPECT_EQ(result.bundle, nullptr);
    EXPECT_THAT(result.error, HasSubstr("Contents/Info.plist cannot be read"));
}

TEST_F(BundleTest, ADamagedDescriptorIsRefused) {
    const std::string bundle = copyOfBundle();
    environment.home.writeFile("Copy.vxplugin/Contents/Info.plist", "no property list");
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("is damaged"));
}

TEST_F(BundleTest, EachPieceOfTheDescriptorIsNeeded) {
    const std::string bundle = copyOfBundle();
    writeDescriptor(bundle, executable + principal + version);
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("no CFBundleIdentifier"));
    writeDescriptor(bundle, identifier + principal + version);
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("no CFBundleExecutable"));
    writeDescriptor(bundle, identifier + executable + version);
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("no NSPrincipalClass"));
    writeDescriptor(bundle, identifier + executable + principal);
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("no VXHostInterfaceVersion"));
}

TEST_F(BundleTest, AnotherInterfaceVersionIsRefusedBeforeTheCodeIsLoaded) {
    const std::string bundle = copyOfBundle();
    writeDescriptor(bundle, identifier + executable + principal +
                                "<key>VXHostInterfaceVersion</key><integer>99</integer>");
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("built for version 99"));
}

TEST_F(BundleTest, AnExecutableOutsideTheBundleIsRefused) {
    const std::string bundle = copyOfBundle();
    writeDescriptor(bundle, identifier + principal + version +
                                "<key>CFBundleExecutable</key><string>../../evil.so</string>");
    EXPECT_THAT(Bundle::open(bundle).error, HasSubstr("is no file name"));
}

TEST_F(BundleTest, ABundleThatEveryUserMayChangeIsRefused) {
    const std::string bundle = copyOfBundle();
    ASSERT_EQ(chmod((bundle + "/Contents/Linux/Reelix.so").c_str(), 0777), 0);
    const BundleResult result = Bundle::open(bundle);
    EXPECT_EQ(result.bundle, nullptr);
    EXPECT_THAT(result.error, HasSubstr("every user may change"));
}

TEST_F(BundleTest, CodeThatIsNoModuleOrMissingIsAnError) {
    const std::string bundle = copyOfBundle();
    environment.home.writeFile("Copy.vxplugin/Contents/Linux/Reelix.so", "no module");
    const BundleResult opened = Bundle::open(bundle);
    ASSERT_NE(opened.bundle, nullptr) << opened.error;
    std::string error;
    EXPECT_EQ(opened.bundle->principalClass(error), nullptr);
    EXPECT_THAT(error, HasSubstr("cannot be loaded"));
}

TEST_F(BundleTest, AnUnknownPrincipalClassIsAnError) {
    const std::string bundle = copyOfBundle();
    writeDescriptor(bundle,
                    identifier + executable + version + "<key>NSPrincipalClass</key><string>Nobody</string>");
    std::string error;
    EXPECT_EQ(Bundle::open(bundle).bundle->principalClass(error), nullptr);
    EXPECT_THAT(error, HasSubstr("no principal class named 'Nobody'"));
}

TEST_F(BundleTest, NamedBundlesAreTheOnlyOnes) {
    EXPECT_THAT(pluginBundles({"/a.vxplugin", "/b.vxplugin"}), ElementsAre("/a.vxplugin", "/b.vxplugin"));
}

TEST_F(BundleTest, TheSearchPathComesBeforeTheBuildTree) {
    const std::string bundle = copyOfBundle("plugins/Copy.vxplugin");
    environment.home.makeFolder("plugins/no bundle");
    const testing_support::ScopedEnvironment path(
        "VEXO_PLUGIN_PATH",
        (environment.home.path("missing") + "::" + environment.home.path("plugins")).c_str());
    const auto found = pluginBundles({});
    ASSERT_GE(found.size(), 2u);
    EXPECT_EQ(found[0], bundle);
    EXPECT_EQ(found[1], REELIX_BUNDLE_DIR);
}

TEST_F(BundleTest, TheUsersOwnPluginFolderIsSearched) {
    const std::string bundle = copyOfBundle("share/vexo/plugins/Copy.vxplugin");
    const testing_support::ScopedEnvironment path("VEXO_PLUGIN_PATH", bundle.c_str());
    EXPECT_EQ(pluginBundles({})[0], bundle);
}

}  // namespace
}  // namespace vexo
