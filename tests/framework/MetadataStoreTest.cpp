#include "framework/metadata/MetadataStore.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <thread>

#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

using namespace testing_support;
using namespace vexo;
using platform::Array;
using platform::Dictionary;
using platform::Value;

namespace {

// Answers by what the file says: "WIDTHxHEIGHT" is a movie of that size, all else is none.
class ScriptedReader final : public MediaReader {
  public:
    MediaReaderAnswer read(int descriptor) override {
        ++reads;
        std::array<char, 100> content{};
        if (pread(descriptor, content.data(), content.size() - 1, 0) < 0)
            return MediaFailure{"cannot read"};
        MediaProperties movie{{"Video", "Sound"}, {}, {}, 2.5, {"h264"}, 86400.0};
        int width, height;
        if (std::sscanf(content.data(), "%dx%d", &width, &height) != 2)
            return MediaFailure{"no movie", failureCause};
        movie.pixelWidth = width;
        movie.pixelHeight = height;
        return movie;
    }

    MediaFrameAnswer frame(int, int) override { return MediaFailure{"no picture"}; }

    std::atomic<int> reads{0};
    FailureCause failureCause = FailureCause::file;
};

class MetadataOfFiles : public testing::Test {
  protected:
    std::optional<Value> valueOf(const std::string& path, std::string_view key) const {
        return store_.propertiesForFile(path)->valueForKey(key);
    }

    TemporaryFolder folder_;
    const std::string index_ = folder_.path("cache/metadata.sqlite");
    const std::shared_ptr<ScriptedReader> reader_ = std::make_shared<ScriptedReader>();
    MetadataStore store_{index_, reader_};
};

}  // namespace

TEST_F(MetadataOfFiles, AMovieHasAllOfThem) {
    const std::string path = folder_.writeFile("Clip.MOV", "1920x1080");
    const Dictionary expected{
        {"kMDItemFSName", "Clip.MOV"},
        {"kMDItemFSSize", 9},
        {"kMDItemKind", "QuickTime movie"},
        {"kMDItemContentType", "com.norvale.quicktime-movie"},
        {"kMDItemContentTypeTree",
         Array{"com.norvale.quicktime-movie", "public.movie", "public.audiovisual-content", "public.data",
               "public.item", "public.content"}},
        {"kMDItemMediaTypes", Array{"Video", "Sound"}},
        {"kMDItemPixelWidth", 1920},
        {"kMDItemPixelHeight", 1080},
        {"kMDItemDurationSeconds", 2.5},
        {"kMDItemCodecs", Array{"h264"}},
        {"kMDItemContentCreationDate", platform::Date::since1970(86400)},
    };
    const auto properties = store_.propertiesForFile(path);
    EXPECT_EQ(properties->allValues(), expected);
    for (const auto& [key, value] : expected)
        EXPECT_EQ(properties->valueForKey(key), value) << key;
    EXPECT_EQ(properties->valueForKey("kMDItemNothing"), std::nullopt);
}

TEST_F(MetadataOfFiles, NothingIsLookedAtBeforeItIsAskedFor) {
    const auto properties = store_.propertiesForFile(folder_.path("later.mov"));
    folder_.writeFile("later.mov", "640x480");
    EXPECT_EQ(reader_->reads, 0);
    EXPECT_EQ(properties->valueForKey(kMDItemPixelWidth), Value(640));
}

TEST_F(MetadataOfFiles, NameSizeAndTypeNeedNoReading) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    for (const auto key :
         {kMDItemFSName, kMDItemFSSize, kMDItemKind, kMDItemContentType, kMDItemContentTypeTree})
        EXPECT_TRUE(valueOf(path, key)) << key;
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(MetadataOfFiles, AnUnchangedFileIsReadOnce) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    const auto properties = store_.propertiesForFile(path);
    EXPECT_EQ(properties->valueForKey(kMDItemPixelWidth), Value(640));
    EXPECT_EQ(properties->valueForKey(kMDItemPixelHeight), Value(480));
    EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(640));
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataOfFiles, StoresThatShareAnIndexReadAFileOnce) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    const std::string noMovie = folder_.writeFile("text.mov", "text");
    const MetadataStore other(index_, reader_);
    for (const MetadataStore* store : {const_cast<const MetadataStore*>(&store_), &other}) {
        EXPECT_EQ(store->propertiesForFile(path)->valueForKey(kMDItemPixelWidth), Value(640));
        EXPECT_EQ(store->propertiesForFile(noMovie)->valueForKey(kMDItemPixelWidth), std::nullopt);
        EXPECT_EQ(store->indexPath(), index_);
    }
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataOfFiles, AFailureIsRemembered) {
    const std::string path = folder_.writeFile("text.mov", "text");
    EXPECT_EQ(valueOf(path, kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(valueOf(path, kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataOfFiles, AFailureThatIsNotTheFilesIsTriedAgain) {
    const std::string path = folder_.writeFile("text.mov", "text");
    reader_->failureCause = FailureCause::elsewhere;
    EXPECT_EQ(valueOf(path, kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(valueOf(path, kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataOfFiles, ATouchedFileIsReadAgain) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(640));
    folder_.writeFile("clip.mov", "320x240");
    setModificationTime(path, 1e9);
    EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(320));
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataOfFiles, AMovedFileIsNotReadAgain) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(640));
    const std::string moved = folder_.path("moved.mov");
    ASSERT_EQ(rename(path.c_str(), moved.c_str()), 0);
    EXPECT_EQ(valueOf(moved, kMDItemPixelWidth), Value(640));
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataOfFiles, LinksAreFollowed) {
    const std::string link = folder_.makeLink("link.mov", folder_.writeFile("clip.mov", "640x480"));
    EXPECT_EQ(valueOf(link, kMDItemPixelWidth), Value(640));
    EXPECT_EQ(valueOf(link, kMDItemFSName), Value("link.mov"));
}

TEST_F(MetadataOfFiles, WhatIsKnownToBeNoMovieIsNotRead) {
    for (const char* name : {"notes.txt", "image.png", "Info.plist", "archive.zip"})
        EXPECT_EQ(valueOf(folder_.writeFile(name, "640x480"), kMDItemMediaTypes), std::nullopt) << name;
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(MetadataOfFiles, WhatMayBeAMovieIsRead) {
    for (const char* name : {"recording", "recording.vob", "sound.m4a"})
        EXPECT_TRUE(valueOf(folder_.writeFile(name, "640x480"), kMDItemMediaTypes)) << name;
}

TEST_F(MetadataOfFiles, OnlyPlainFilesWithAContentAreRead) {
    EXPECT_EQ(valueOf(folder_.makeFifo("fifo.mov"), kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(valueOf(folder_.makeFolder("folder.mov"), kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(valueOf(folder_.makeLink("device.mov", "/dev/zero"), kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(valueOf(folder_.makeLink("circle.mov", folder_.path("circle.mov")), kMDItemMediaTypes),
              std::nullopt);
    EXPECT_EQ(valueOf(folder_.writeFile("empty.mov"), kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(MetadataOfFiles, AMissingFileHasNone) {
    EXPECT_EQ(store_.propertiesForFile(folder_.path("missing.mov"))->allValues(), Dictionary{});
}

TEST_F(MetadataOfFiles, AFolderHasNameAndTypeAlone) {
    const Dictionary expected{
        {"kMDItemFSName", "Trip.qnproject"},
        {"kMDItemKind", "Reelix Project"},
        {"kMDItemContentType", "com.norvale.reelix.project"},
        {"kMDItemContentTypeTree",
         Array{"com.norvale.reelix.project", "com.norvale.package", "public.directory", "public.item"}},
    };
    EXPECT_EQ(store_.propertiesForFile(folder_.makeFolder("Trip.qnproject"))->allValues(), expected);
}

TEST_F(MetadataOfFiles, PropertiesOutliveTheirStore) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    auto store = std::make_unique<MetadataStore>(std::nullopt, reader_);
    const auto read = store->propertiesForFile(path);
    const auto unread = store->propertiesForFile(path);
    EXPECT_EQ(read->valueForKey(kMDItemPixelWidth), Value(640));
    store.reset();
    EXPECT_EQ(read->valueForKey(kMDItemPixelWidth), Value(640));
    EXPECT_EQ(unread->valueForKey(kMDItemPixelWidth), std::nullopt);
    EXPECT_EQ(unread->valueForKey(kMDItemFSName), Value("clip.mov"));
}

TEST_F(MetadataOfFiles, ThreadsThatAskAtOnceReadTheFileOnce) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    const auto shared = store_.propertiesForFile(path);
    std::vector<std::thread> threads;
    for (int i = 0; i < 6; ++i)
        threads.emplace_back([&] {
            EXPECT_EQ(shared->valueForKey(kMDItemPixelWidth), Value(640));
            EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(640));
        });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataOfFiles, WithoutAnIndexFileAFileIsReadOnceAllTheSame) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    const MetadataStore store(std::nullopt, reader_);
    EXPECT_EQ(store.indexPath(), "");
    store.propertiesForFile(path)->allValues();
    store.propertiesForFile(path)->allValues();
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataOfFiles, AreThoseOfTheRealMovie) {
    const MetadataStore store(index_, std::make_shared<ProcessMediaReader>(
                                          ProcessMediaReader::Settings{VEXO_BIN_DIR "/vexo-media-reader"}));
    const std::string path = folder_.path("real.mov");
    makeSampleMovie(path, {.size = "640x360", .seconds = 2});
    const auto properties = store.propertiesForFile(path);
    EXPECT_EQ(properties->valueForKey(kMDItemPixelWidth), Value(640));
    EXPECT_EQ(properties->valueForKey(kMDItemPixelHeight), Value(360));
    EXPECT_EQ(properties->valueForKey(kMDItemDurationSeconds), Value(2.0));
}

TEST(SupportedMovieFile, IsAPlainFileOfAMovieType) {
    const MetadataStore store(std::nullopt, nullptr);
    const TemporaryFolder folder;
    EXPECT_TRUE(store.supportedMovieFile(folder.writeFile("a.mov")));
    EXPECT_TRUE(store.supportedMovieFile(folder.writeFile("A.M4V", "no movie at all")));
    EXPECT_TRUE(store.supportedMovieFile(folder.makeLink("link.mp4", folder.path("a.mov"))));
    EXPECT_FALSE(store.supportedMovieFile(folder.path("missing.mov")));
    EXPECT_FALSE(store.supportedMovieFile(folder.makeFolder("folder.mov")));
    EXPECT_FALSE(store.supportedMovieFile(folder.makeFifo("fifo.mov")));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("sound.m4a")));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("picture.jpg")));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("mov")));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile(".mov")));
}
