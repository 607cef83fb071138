#include "framework/metadata/MetadataStore.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

using namespace std::string_literals;
using namespace testing_support;
using namespace vexo;
using platform::Array;
using platform::Dictionary;
using platform::Value;

namespace {

// Answers by what the file says: "WIDTHxHEIGHT" is a movie of that size, "sound" is sound, all else is none.
class ScriptedReader final : public MediaReader {
  public:
    MediaReaderAnswer read(int descriptor) override {
        ++reads;
        std::array<char, 100> content{};
        if (pread(descriptor, content.data(), content.size() - 1, 0) < 0)
            return MediaFailure{"cannot read"};
        MediaProperties movie{{"Video", "Sound"}, {}, {}, 2.5, {"h264"}, 86400.0};
        if (content.data() == std::string_view("sound"))
            return MediaProperties{{"Sound"}};
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

// Counts how often the files of a folder are opened.
class OpenCounter {
  public:
    explicit OpenCounter(const std::string& folder) {
        EXPECT_GE(inotify_add_watch(events_.number(), folder.c_str(), IN_OPEN), 0);
    }

    // Since the last call.
    int count() const {
        std::array<char, 4096> buffer;
        const ssize_t size = read(events_.number(), buffer.data(), buffer.size());
        int opened = 0;
        for (ssize_t at = 0; at < size; ++opened) {
            inotify_event event;
            std::memcpy(&event, buffer.data() + at, sizeof event);
            at += static_cast<ssize_t>(sizeof event + event.len);
        }
        return opened;
    }

  private:
    const platform::FileDescriptor events_{inotify_init1(IN_NONBLOCK | IN_CLOEXEC)};
};

template <typename Time>
platform::DateRef dateOf(const Time& time) {
    return platform::Date::since1970(static_cast<double>(time.tv_sec) +
                                     static_cast<double>(time.tv_nsec) / 1e9);
}

// nil where the file system keeps no such time.
std::optional<Value> birthTimeOf(const std::string& path) {
    struct statx status {};
    if (statx(AT_FDCWD, path.c_str(), 0, STATX_BTIME, &status) != 0 || !(status.stx_mask & STATX_BTIME))
        return std::nullopt;
    return dateOf(status.stx_btime);
}

// Neither text nor the beginning of anything known.
const std::string unknownContent = "640x480\1\2\3\4";
const std::string movieContent = "\0\0\0\x14"s + "ftypqt  \0\0\0\0\0\0\0\0"s;
const std::string soundContent = "ID3\4";

class MetadataOfFiles : public testing::Test {
  protected:
    std::optional<Value> valueOf(const std::string& path, std::string_view key) const {
        return store_.propertiesForFile(path)->valueForKey(key);
    }

    const HostEnvironment environment_;
    const TemporaryFolder& folder_ = environment_.home;
    const std::string index_ = folder_.path("cache/metadata.sqlite");
    const std::shared_ptr<ScriptedReader> reader_ = std::make_shared<ScriptedReader>();
    MetadataStore store_{index_, reader_};
};

class SupportedMovieFile : public testing::Test {
  protected:
    const HostEnvironment environment;
    const TemporaryFolder& folder = environment.home;
    const MetadataStore store{std::nullopt, nullptr};
};

}  // namespace

TEST_F(MetadataOfFiles, AMovieHasAllOfThem) {
    const std::string path = folder_.writeFile("Clip.MOV", "1920x1080");
    setModificationTime(path, 1e9);
    Dictionary expected{
        {"kMDItemPath", path},
        {"kMDItemFSContentChangeDate", platform::Date::since1970(1e9)},
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
    if (const auto birth = birthTimeOf(path))
        expected.emplace("kMDItemFSCreationDate", *birth);
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

TEST_F(MetadataOfFiles, ANameThatIsNotUTF8Survives) {
    const std::string path = folder_.writeFile("Urlaub \xfc\xff.mov", "640x480");
    EXPECT_EQ(valueOf(path, kMDItemFSName), Value("Urlaub \xfc\xff.mov"));
    EXPECT_EQ(valueOf(path, kMDItemPath), Value(path));
    EXPECT_EQ(valueOf(path, kMDItemPixelWidth), Value(640));
}

TEST_F(MetadataOfFiles, TheTypeComesFromTheContentWhereTheNameTellsNone) {
    for (const char* name : {"recording", "recording.xyz"}) {
        const std::string path = folder_.writeFile(name, movieContent);
        EXPECT_EQ(valueOf(path, kMDItemContentType), Value("com.norvale.quicktime-movie")) << name;
        EXPECT_EQ(valueOf(path, kMDItemKind), Value("QuickTime movie")) << name;
    }
}

TEST_F(MetadataOfFiles, AnExtensionThatIsKnownWinsOverTheContent) {
    EXPECT_EQ(valueOf(folder_.writeFile("clip.avi", movieContent), kMDItemKind), Value("AVI movie"));
    EXPECT_EQ(valueOf(folder_.writeFile("notes.txt", movieContent), kMDItemKind),
              Value("Plain text document"));
    EXPECT_EQ(valueOf(folder_.writeFile("a.qnproject", movieContent), kMDItemKind), Value("Document"));
}

TEST_F(MetadataOfFiles, ForItsTypeAFileIsOpenedOnlyWhereTheNameTellsNone) {
    const std::string untold = folder_.writeFile("recording", movieContent);
    const std::string told = folder_.writeFile("clip.mov", movieContent);
    const std::string fifo = folder_.makeFifo("fifo");
    const OpenCounter opened(folder_.path());
    for (const std::string& path : {told, fifo}) {
        EXPECT_TRUE(valueOf(path, kMDItemContentType)) << path;
        store_.supportedMovieFile(path);
    }
    EXPECT_TRUE(valueOf(untold, kMDItemFSSize));
    EXPECT_EQ(opened.count(), 0);
    EXPECT_TRUE(valueOf(untold, kMDItemContentType));
    EXPECT_EQ(opened.count(), 1);
}

TEST_F(MetadataOfFiles, AChangeOfTheFileLeavesItsCreationDate) {
    const std::string path = folder_.writeFile("clip.mov");
    const auto birth = birthTimeOf(path);
    if (!birth)
        GTEST_SKIP() << "the file system keeps no creation dates";
    struct stat status;
    do {  // until the file system's clock has moved on
        setModificationTime(path, 1e9);
        ASSERT_EQ(stat(path.c_str(), &status), 0);
    } while (Value(dateOf(status.st_ctim)) == *birth);
    EXPECT_EQ(valueOf(path, kMDItemFSCreationDate), birth);
    EXPECT_EQ(valueOf(path, kMDItemFSContentChangeDate), Value(platform::Date::since1970(1e9)));
}

TEST_F(MetadataOfFiles, WhatNobodyKnowsIsData) {
    EXPECT_EQ(valueOf(folder_.writeFile("unknown", unknownContent), kMDItemContentType),
              Value("public.data"));
    EXPECT_EQ(valueOf(folder_.writeFile("empty.xyz"), kMDItemContentType), Value("public.data"));
    EXPECT_EQ(valueOf(folder_.makeFifo("fifo"), kMDItemContentType), Value("public.data"));
    EXPECT_EQ(valueOf(folder_.makeLink("device", "/dev/zero"), kMDItemContentType), Value("public.data"));
}

TEST_F(MetadataOfFiles, NameSizeAndTypeNeedNoReading) {
    for (const char* name : {"clip.mov", "clip"}) {
        const std::string path = folder_.writeFile(name, movieContent);
        for (const auto key : {kMDItemPath, kMDItemFSName, kMDItemFSSize, kMDItemFSContentChangeDate,
                               kMDItemKind, kMDItemContentType, kMDItemContentTypeTree})
            EXPECT_TRUE(valueOf(path, key)) << key;
    }
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

TEST_F(MetadataOfFiles, WhatIsNoMovieByItsContentIsNotRead) {
    EXPECT_EQ(valueOf(folder_.writeFile("README", "640x480"), kMDItemMediaTypes), std::nullopt);
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(MetadataOfFiles, WhatMayBeAMovieIsRead) {
    for (const char* name : {"recording", "recording.xyz", "recording.qnproject", "clip.vob", "sound.m4a"})
        EXPECT_TRUE(valueOf(folder_.writeFile(name, unknownContent), kMDItemMediaTypes)) << name;
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

TEST_F(MetadataOfFiles, AFolderHasNameTypeAndTimesAlone) {
    const std::string path = folder_.makeFolder("Trip.qnproject");
    setModificationTime(path, 1e9);
    Dictionary expected{
        {"kMDItemPath", path},
        {"kMDItemFSContentChangeDate", platform::Date::since1970(1e9)},
        {"kMDItemFSName", "Trip.qnproject"},
        {"kMDItemKind", "Reelix Project"},
        {"kMDItemContentType", "com.norvale.reelix.project"},
        {"kMDItemContentTypeTree",
         Array{"com.norvale.reelix.project", "com.norvale.package", "public.directory", "public.item"}},
    };
    if (const auto birth = birthTimeOf(path))
        expected.emplace("kMDItemFSCreationDate", *birth);
    EXPECT_EQ(store_.propertiesForFile(path)->allValues(), expected);
}

TEST_F(MetadataOfFiles, OfAFileWhatWasReadOutlivesTheStore) {
    const std::string path = folder_.writeFile("clip.mov", "640x480");
    auto store = std::make_unique<MetadataStore>(std::nullopt, reader_);
    const auto read = store->propertiesForFile(path);
    const auto unread = store->propertiesForFile(path);
    EXPECT_EQ(read->valueForKey(kMDItemPixelWidth), Value(640));
    store.reset();
    EXPECT_EQ(read->valueForKey(kMDItemPixelWidth), Value(640));
    EXPECT_EQ(unread->valueForKey(kMDItemPixelWidth), std::nullopt);
    EXPECT_EQ(unread->valueForKey(kMDItemFSName), std::nullopt);
    EXPECT_EQ(unread->allValues(), Dictionary{});
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

TEST_F(SupportedMovieFile, IsAPlainFileOfAMovieType) {
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

TEST_F(SupportedMovieFile, IsTheSameOfWhatIsKnownToBeAPlainFile) {
    for (const char* name :
         {"a.mov", "A.M4V", "sound.m4a", "picture.jpg", "mov", ".mov", "project.qnproject"}) {
        const std::string file = folder.writeFile(name);
        EXPECT_EQ(store.supportedPlainFile(file), store.supportedMovieFile(file)) << name;
    }
    EXPECT_TRUE(store.supportedPlainFile(folder.writeFile("movie", movieContent)));
    EXPECT_FALSE(store.supportedPlainFile(folder.writeFile("sound", soundContent)));
}

TEST_F(SupportedMovieFile, IsToldByTheContentWhereTheNameTellsNoType) {
    EXPECT_TRUE(store.supportedMovieFile(folder.writeFile("movie", movieContent)));
    EXPECT_TRUE(store.supportedMovieFile(folder.writeFile("movie.xyz", movieContent)));
    EXPECT_TRUE(store.supportedMovieFile(folder.makeLink("link", folder.path("movie"))));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("sound", soundContent)));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("text", "ftypqt  ")));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("unknown", unknownContent)));
    EXPECT_FALSE(store.supportedMovieFile(folder.writeFile("picture.jpg", movieContent)));
    EXPECT_FALSE(store.supportedMovieFile(folder.makeFifo("fifo")));
    EXPECT_FALSE(store.supportedMovieFile(folder.makeFolder("folder")));
}

namespace {

class ProblemWithFile : public MetadataOfFiles {
  protected:
    std::optional<std::string> problemWith(const std::string& path) const {
        return store_.problemWithFile(path);
    }
};

}  // namespace

TEST_F(ProblemWithFile, AMovieHasNone) {
    EXPECT_EQ(problemWith(folder_.writeFile("clip.mov", "640x480")), std::nullopt);
    EXPECT_EQ(problemWith(folder_.writeFile("unknown", unknownContent)), std::nullopt);
}

TEST_F(ProblemWithFile, IsTheReadersReason) {
    EXPECT_EQ(problemWith(folder_.writeFile("text.mov", "text")), "no movie");
}

TEST_F(ProblemWithFile, WhatIsNoMovieByItsTypeIsNotRead) {
    EXPECT_EQ(problemWith(folder_.writeFile("notes.txt", "640x480")), "Plain text document, no movie");
    EXPECT_EQ(problemWith(folder_.writeFile("README", "640x480")), "Plain text document, no movie");
    EXPECT_EQ(problemWith(folder_.writeFile("cover.jpg", "640x480")), "JPEG image, no movie");
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(ProblemWithFile, SoundIsNoMovie) {
    const std::string soundAlone = "sound without a picture, no movie";
    EXPECT_EQ(problemWith(folder_.writeFile("song.mp3", "640x480")), soundAlone);
    EXPECT_EQ(problemWith(folder_.writeFile("song", soundContent)), soundAlone);
    EXPECT_EQ(reader_->reads, 0);
    EXPECT_EQ(problemWith(folder_.writeFile("song.mov", "sound")), soundAlone);
}

TEST_F(ProblemWithFile, AFolderOrAPackageIsNoMovie) {
    EXPECT_EQ(problemWith(folder_.makeFolder("folder.mov")), "it is a folder");
    EXPECT_EQ(problemWith(folder_.makeFolder("Trip.qnproject")), "it is a package");
}

TEST_F(ProblemWithFile, AMissingFileHasTheSystemsMessage) {
    EXPECT_EQ(problemWith(folder_.path("missing.mov")), "No such file or directory");
    EXPECT_EQ(problemWith(folder_.makeLink("circle.mov", folder_.path("circle.mov"))),
              "Too many levels of symbolic links");
}

TEST_F(ProblemWithFile, WhatIsNoPlainFileIsNoneWhateverItsName) {
    for (const char* name : {"fifo.mov", "fifo", "fifo.txt", "fifo.mp3", "fifo.qnproject"})
        EXPECT_EQ(problemWith(folder_.makeFifo(name)), "it is no plain file") << name;
    EXPECT_EQ(problemWith(folder_.makeLink("device.mov", "/dev/zero")), "it is no plain file");
}

TEST_F(ProblemWithFile, AnEmptyFileIsEmpty) {
    EXPECT_EQ(problemWith(folder_.writeFile("empty.mov")), "it is empty");
    EXPECT_EQ(problemWith(folder_.writeFile("empty")), "it is empty");
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(ProblemWithFile, ThePathIsNotInIt) {
    for (const std::string& path : {folder_.path("missing.mov"), folder_.writeFile("text.mov", "text"),
                                    folder_.makeFifo("fifo.mov"), folder_.writeFile("empty.mov")})
        EXPECT_EQ(problemWith(path).value_or("").find('/'), std::string::npos) << path;
}
