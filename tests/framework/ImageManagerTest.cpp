#include "framework/ImageManager.h"

#include <gtest/gtest.h>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

class ImageManagerTest : public testing::Test {
  protected:
    // The name of the icon of a path in the temporary folder; "nil" where there is no icon.
    std::string iconNameOf(std::string_view relative) {
        const platform::ImageRef icon = manager_.iconForFile(folder_.path(relative));
        return icon ? icon->name() : "nil";
    }

    testing_support::HostEnvironment host_;
    const testing_support::TemporaryFolder& folder_ = host_.home;
    ImageManager manager_{[](const std::string& path) { return path.ends_with(".mov"); }};
};

TEST_F(ImageManagerTest, EachKindOfFileHasItsIcon) {
    folder_.makeFolder("Movies");
    folder_.makeFolder("Summer.qnproject");
    folder_.writeFile("clip.mov");
    folder_.writeFile("notes.txt");
    folder_.makeFifo("pipe");

    EXPECT_EQ(iconNameOf("Movies"), "folder");
    EXPECT_EQ(iconNameOf("Summer.qnproject"), "package");
    EXPECT_EQ(iconNameOf("clip.mov"), "movie");
    EXPECT_EQ(iconNameOf("notes.txt"), "document");
    EXPECT_EQ(iconNameOf("pipe"), "document");
}

TEST_F(ImageManagerTest, NothingHasNoIcon) {
    EXPECT_EQ(iconNameOf("missing.mov"), "nil");
    EXPECT_EQ(manager_.iconForFile(""), nullptr);
}

TEST_F(ImageManagerTest, WhatMakesAMovieOfAFileMakesNoneOfAFolder) {
    folder_.makeFolder("folder.mov");
    folder_.writeFile("file.qnproject");
    EXPECT_EQ(iconNameOf("folder.mov"), "folder");
    EXPECT_EQ(iconNameOf("file.qnproject"), "document");
}

TEST_F(ImageManagerTest, ALinkHasTheIconOfWhatItLeadsTo) {
    folder_.makeLink("to folder", folder_.makeFolder("Movies"));
    folder_.makeLink("to clip.mov", folder_.writeFile("clip.mov"));
    EXPECT_EQ(iconNameOf("to folder"), "folder");
    EXPECT_EQ(iconNameOf("to clip.mov"), "movie");
}

TEST_F(ImageManagerTest, ALinkThatLeadsNowhereStillHasAnIcon) {
    folder_.makeLink("broken", folder_.path("missing"));
    EXPECT_EQ(iconNameOf("broken"), "document");
}

TEST_F(ImageManagerTest, AMountPointHasTheIconOfAVolume) {
    host_.workspace.setVolumes({"/", folder_.makeFolder("disk")});
    folder_.makeFolder("disk/Movies");
    EXPECT_EQ(iconNameOf("disk"), "volume");
    EXPECT_EQ(iconNameOf("disk/Movies"), "folder");
}

TEST_F(ImageManagerTest, FilesOfAKindShareOneImage) {
    folder_.writeFile("one.mov");
    folder_.writeFile("two.mov");
    EXPECT_EQ(manager_.iconForFile(folder_.path("one.mov")), manager_.iconForFile(folder_.path("two.mov")));
}

TEST_F(ImageManagerTest, IconsAreDrawableAndThirtyTwoPoints) {
    const platform::ImageRef icon = manager_.iconForFile(folder_.path());
    EXPECT_TRUE(icon->isValid());
    EXPECT_EQ(icon->size(), (platform::Size{32, 32}));
}

}  // namespace
}  // namespace vexo
