#include "host/VXMediaObject.h"

#include <gtest/gtest.h>
#include <malloc.h>

#include <thread>

#include "framework/HostServices.h"
#include "framework/metadata/MetadataStore.h"
#include "host/VXConstants.h"
#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

class MediaObjectTest : public testing::Test {
  protected:
    VXMediaObjectRef movieAt(const std::string& path) {
        auto movie = std::make_shared<VXMediaObject>(VXMediaTypeMovie, "name", path);
        movie->setPath(path);
        movie->setSpotlightPropertiesOfFile(path);
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

TEST_F(MediaObjectTest, AnAttributeThatIsSetAgainIsReplaced) {
    const auto movie = movieAt("/a.mov");
    movie->setAttribute(1, "second key");
    movie->setAttribute(2, "key");
    movie->setAttribute(3, "second key");
    EXPECT_EQ(movie->attributes(), (platform::Dictionary{{"key", 2}, {"second key", 3}}));
}

TEST_F(MediaObjectTest, AKeyMayGoOnceItsAttributeIsSet) {
    const auto movie = movieAt("/a.mov");
    {
        std::string key = "a key that nothing else names";
        movie->setAttribute(7, key);
        key.assign(key.size(), 'x');
    }
    EXPECT_EQ(movie->attributeForKey("a key that nothing else names"), platform::Value(7));
}

TEST_F(MediaObjectTest, ThePathIsTheLastThatWasSetWhetherItIsTheIDOrNot) {
    VXMediaObject item(VXMediaTypeMovie, "name", "/id.mov");
    EXPECT_EQ(item.path(), std::nullopt);
    for (const std::string path : {"/id.mov", "/other.mov", "/third.mov", "/id.mov", ""}) {
        item.setPath(path);
        EXPECT_EQ(item.path(), path);
        EXPECT_EQ(item.ID(), "/id.mov");
    }
}

// The host's own metadata, of which items keep less than of any other.
class StoredMetadataTest : public MediaObjectTest {
  protected:
    StoredMetadataTest() {
        const HostServices& fake = hostServices();
        scope.emplace(
            HostServices{fake.pathWatcher, fake.imageManager, store, fake.thumbnails, fake.diagnostics});
    }

    std::optional<platform::Value> fileName(const VXMediaObject& item) {
        return item.spotlightProperties()->valueForKey(kMDItemFSName);
    }

    // As a scan of an event makes one.
    VXMediaObjectRef clipAt(const std::string& path, const platform::Value& event) {
        auto clip = movieAt(path);
        clip->setMediaSourceType(VXMediaSourceTypeFile);
        clip->setAttribute(event, VXReelixProjectPathKey);
        return clip;
    }

    MetadataStore store{std::nullopt, nullptr};
    std::optional<HostServicesScope> scope;
};

TEST_F(StoredMetadataTest, PropertiesAreTheSameObjectEachTime) {
    const auto movie = movieAt(environment.home.writeFile("a.mov"));
    const auto properties = movie->spotlightProperties();
    ASSERT_NE(properties, nullptr);
    EXPECT_EQ(movie->spotlightProperties(), properties);
    EXPECT_EQ(fileName(*movie), platform::Value("a.mov"));
}

TEST_F(StoredMetadataTest, PropertiesStayThoseOfTheirFileWhenThePathChanges) {
    const auto movie = movieAt(environment.home.writeFile("a.mov"));
    movie->setPath(environment.home.writeFile("b.mov"));
    EXPECT_EQ(fileName(*movie), platform::Value("a.mov"));
}

TEST_F(StoredMetadataTest, PropertiesOfAFileThatTheIDDoesNotNameAreKept) {
    const auto movie = movieAt(environment.home.writeFile("a.mov"));
    const auto other = VXMediaObject::spotlightProperties(environment.home.writeFile("b.mov"));
    movie->setSpotlightProperties(other);
    EXPECT_EQ(movie->spotlightProperties(), other);
    movie->setSpotlightProperties(nullptr);
    EXPECT_EQ(movie->spotlightProperties(), nullptr);
}

TEST_F(StoredMetadataTest, PropertiesOfAFileThatTheIDDoesNotNameCanBeAskedForByItsPath) {
    const auto movie = movieAt(environment.home.writeFile("a.mov"));
    movie->setSpotlightPropertiesOfFile(environment.home.writeFile("b.mov"));
    const auto properties = movie->spotlightProperties();
    EXPECT_EQ(fileName(*movie), platform::Value("b.mov"));
    EXPECT_EQ(movie->spotlightProperties(), properties);
    movie->setSpotlightPropertiesOfFile(environment.home.path("a.mov"));
    EXPECT_EQ(fileName(*movie), platform::Value("a.mov"));
}

TEST_F(StoredMetadataTest, ThreadsThatAskForPropertiesAtOnceGetTheSameObject) {
    for (int round = 0; round < 100; ++round) {
        const auto movie = movieAt("/a.mov");
        VXMetadataPropertiesRef fromThread;
        std::thread thread([&] { fromThread = movie->spotlightProperties(); });
        const VXMetadataPropertiesRef properties = movie->spotlightProperties();
        thread.join();
        ASSERT_EQ(fromThread, properties);
    }
}

TEST_F(StoredMetadataTest, WhatFewItemsHaveIsKeptBesideTheRest) {
    const auto movie = movieAt(environment.home.writeFile("a.mov"));
    const VXMetadataPropertiesRef properties = movie->spotlightProperties();
    const platform::ImageRef thumbnail = movie->thumbnailImage();
    movie->setAttribute(1, "first");
    movie->setAttribute(2, "second");
    movie->setPath("/b.mov");
    EXPECT_EQ(movie->path(), "/b.mov");
    movie->setPath(movie->ID());
    EXPECT_EQ(movie->path(), movie->ID());
    EXPECT_EQ(movie->spotlightProperties(), properties);
    EXPECT_EQ(movie->thumbnailImage(), thumbnail);
    EXPECT_EQ(movie->attributes().size(), 2u);
    EXPECT_EQ(movie->attributeForKey("second"), platform::Value(2));

    const auto others = VXMediaObject::spotlightProperties(environment.home.writeFile("b.mov"));
    movie->setSpotlightProperties(others);
    EXPECT_EQ(movie->spotlightProperties(), others);
    movie->setSpotlightPropertiesOfFile(movie->ID());
    EXPECT_EQ(fileName(*movie), platform::Value("a.mov"));
    EXPECT_EQ(movie->thumbnailImage(), thumbnail);
}

std::size_t allocatedBytes() {
    const struct mallinfo2 info = mallinfo2();
    return info.uordblks + info.hblkhd;
}

TEST_F(StoredMetadataTest, AClipTakesLittleMoreThanItsPathAndItsName) {
#if VEXO_SANITIZED
    GTEST_SKIP() << "a sanitizer has an allocator of its own";
#endif
    const std::string folder = "/home/somebody/Movies/Reelix Events/A day at the lake";
    const platform::Value event = folder;
    std::vector<VXMediaObjectRef> clips;
    constexpr int small = 1000;
    constexpr int large = 11000;
    clips.reserve(large);
    const auto bytesWith = [&](int count) {
        while (clips.size() < static_cast<std::size_t>(count))
            clips.push_back(clipAt(folder + "/clip " + std::to_string(100'000 + clips.size()), event));
        return allocatedBytes();
    };
    const std::size_t before = bytesWith(small);
    const std::size_t bytes = (bytesWith(large) - before) / (large - small);
    const std::size_t pathAndName = folder.size() + 2 * std::string("/clip 100000").size();
    EXPECT_LE(bytes, pathAndName + 200);
    EXPECT_EQ(clips.back()->attributeForKey(VXReelixProjectPathKey), event);
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

TEST(ItemOfAnEndedHost, KnowsItsNameAndNothingOfItsFile) {
    VXMediaObject movie(VXMediaTypeMovie, "name", "/a.mov");
    {
        const testing_support::HostEnvironment environment;
        const MetadataStore store(std::nullopt, nullptr);
        const HostServices& fake = hostServices();
        const HostServicesScope scope(
            {fake.pathWatcher, fake.imageManager, store, fake.thumbnails, fake.diagnostics});
        movie.setPath("/a.mov");
        movie.setSpotlightPropertiesOfFile("/a.mov");
    }
    EXPECT_EQ(movie.name(), "name");
    EXPECT_DOUBLE_EQ(movie.duration(), 0);
    EXPECT_EQ(movie.thumbnailImage(), nullptr);
    const auto properties = movie.spotlightProperties();
    ASSERT_NE(properties, nullptr);
    EXPECT_TRUE(properties->allValues().empty());
    movie.setSpotlightProperties(properties);
    EXPECT_EQ(movie.spotlightProperties(), properties);
}

TEST(ItemOfAnEndedHost, OnAVolumeRaisesNothing) {
    const std::string file = "/Volumes/Footage/a.mov";
    VXMediaObject movie(VXMediaTypeMovie, "name", file);
    {
        const testing_support::HostEnvironment environment;
        const MetadataStore store(std::nullopt, nullptr);
        const HostServices& fake = hostServices();
        const HostServicesScope scope(
            {fake.pathWatcher, fake.imageManager, store, fake.thumbnails, fake.diagnostics});
        movie.setPath(file);
        movie.setSpotlightPropertiesOfFile(file);
        EXPECT_EQ(movie.spotlightProperties()->valueForKey(kMDItemFSName), std::nullopt);
    }
    EXPECT_EQ(movie.spotlightProperties()->valueForKey(kMDItemFSName), std::nullopt);
    EXPECT_TRUE(movie.spotlightProperties()->allValues().empty());
    EXPECT_EQ(movie.aliasResolvedPath(), file);
    EXPECT_EQ(VXMediaObject::aliasResolvedPath(file), file);
}

}  // namespace
}  // namespace vexo
