#include "host/VXMediaObject.h"

#include <gtest/gtest.h>

#include "host/VXConstants.h"
#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

class MediaObjectTest : public testing::Test {
  protected:
    VXMediaObjectRef movieAt(const std::string& path) {
        auto movie = std::make_shared<VXMediaObject>(VXMediaTypeMovie, "name", path);
        movie->setPath(path);
        movie->setSpotlightProperties(VXMediaObject::spotlightProperties(path));
        return movie;
    }

    testing_support::HostEnvironment environment;
};

TEST_F(MediaObjectTest, ResolutionAndDurationComeFromTheMetadataWhenNotSet) {
    environment.metadata.setMovie("/a.mov", {1920, 1080}, 12.5);
    const auto movie = movieAt("/a.mov");

    EXPECT_EQ(movie->attributeForKey(VXMediaObjectResolutionKey),
              platform::Value(platform::Size{1920, 1080}));
    EXPECT_EQ(movie->attributeForKey(VXMediaObjectResolutionStringKey), platform::Value("{1920, 1080}"));
    EXPECT_EQ(movie->attributeForKey(VXMediaObjectDurationKey), platform::Value(12.5));
    EXPECT_DOUBLE_EQ(movie->duration(), 12.5);
}

TEST_F(MediaObjectTest, WhatIsSetWinsOverTheMetadata) {
    environment.metadata.setMovie("/a.mov", {1920, 1080}, 12.5);
    const auto movie = movieAt("/a.mov");
    movie->setAttribute(3.0, VXMediaObjectDurationKey);
    EXPECT_DOUBLE_EQ(movie->duration(), 3.0);
}

TEST_F(MediaObjectTest, TheMetadataIsNotAskedBeforeAPropertyIs) {
    const auto movie = movieAt("/a.mov");
    movie->setAttribute("/project", VXReelixProjectPathKey);
    EXPECT_EQ(movie->attributeForKey(VXReelixProjectPathKey), platform::Value("/project"));
    EXPECT_EQ(environment.metadata.questions(), 0);
}

TEST_F(MediaObjectTest, AMovieWithoutMetadataHasNeitherResolutionNorDuration) {
    const auto movie = movieAt("/a.mov");
    EXPECT_EQ(movie->attributeForKey(VXMediaObjectResolutionKey), std::nullopt);
    EXPECT_DOUBLE_EQ(movie->duration(), 0);
}

TEST_F(MediaObjectTest, TheStoredAttributesLeaveOutTheMetadata) {
    environment.metadata.setMovie("/a.mov", {1920, 1080});
    const auto movie = movieAt("/a.mov");
    EXPECT_TRUE(movie->attributes().empty());
}

TEST_F(MediaObjectTest, AnItemWithoutAPathHasNoURL) {
    const VXMediaObject item(VXMediaTypeMovie, "name", "id");
    EXPECT_EQ(item.path(), std::nullopt);
    EXPECT_EQ(item.URL(), std::nullopt);
    EXPECT_EQ(item.aliasResolvedPath(), std::nullopt);
}

TEST_F(MediaObjectTest, AliasResolvedPathsLeaveTheProgramByTheirMountPoints) {
    environment.mounts.list = {{"/mnt/stick", "/dev/sdb1", "ext4", "Footage", true}};
    EXPECT_EQ(VXMediaObject::aliasResolvedPath("/Volumes/Footage/a.mov"), "/mnt/stick/a.mov");
    EXPECT_EQ(movieAt("/Volumes/Footage/a.mov")->aliasResolvedPath(), "/mnt/stick/a.mov");
}

TEST_F(MediaObjectTest, APathOnAVolumeThatIsNotThereStaysAsItIs) {
    EXPECT_EQ(VXMediaObject::aliasResolvedPath("/Volumes/Gone/a.mov"), "/Volumes/Gone/a.mov");
    EXPECT_EQ(movieAt("/Volumes/Gone/a.mov")->aliasResolvedPath(), std::nullopt);
}

TEST_F(MediaObjectTest, ALinkKeepsItsOwnPath) {
    environment.home.makeFolder("real");
    const std::string link = environment.home.makeLink("link", environment.home.path("real"));
    EXPECT_EQ(VXMediaObject::aliasResolvedPath(link), link);
}

}  // namespace
}  // namespace vexo
