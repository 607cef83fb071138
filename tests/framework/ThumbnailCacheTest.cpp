// The shared thumbnails, by the rules that other programs go by.
#include "framework/thumbnails/ThumbnailCache.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstring>
#include <filesystem>
#include <fstream>

#include "platform/URL.h"
#include "tests/support/Pixels.h"
#include "tests/support/Program.h"
#include "tests/support/TemporaryFolder.h"

using namespace testing_support;
using namespace vexo;
using platform::Bitmap;
using testing::HasSubstr;
using testing::Not;

namespace {

mode_t modeOf(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 ? status.st_mode & 07777 : 0;
}

std::span<const std::byte> bytesOf(std::string_view text) {
    return std::as_bytes(std::span(text));
}

class SharedThumbnails : public testing::Test {
  protected:
    std::vector<std::string> files() const {
        std::vector<std::string> names;
        for (const auto& entry : std::filesystem::recursive_directory_iterator(folder_.path()))
            if (entry.is_regular_file())
                names.push_back(entry.path().lexically_relative(folder_.path()));
        return names;
    }

    TemporaryFolder folder_;
    const ThumbnailCache cache_{folder_.path("thumbnails")};
    // The checksum of this URI is the one that the convention itself gives as its example.
    const ThumbnailSubject subject_{"file:///home/jens/photos/me.png", 1'000'000'000, 12345};
    const std::string name_ = "c6ee772d9e49320e97ec29a7eb5b1697.png";
};

}  // namespace

TEST_F(SharedThumbnails, AreFoundAsTheyWereStored) {
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(256, 144));
    const auto found = cache_.find(subject_, ThumbnailSize::large);
    ASSERT_TRUE(found);
    EXPECT_EQ(found->width, 256);
    EXPECT_EQ(found->height, 144);
    EXPECT_EQ(found->pixels, plainBitmap(256, 144).pixels);
}

TEST_F(SharedThumbnails, LieWhereOtherProgramsLookForThem) {
    cache_.store(subject_, ThumbnailSize::normal, plainBitmap(128, 72));
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(256, 144));
    cache_.store(subject_, ThumbnailSize::xLarge, plainBitmap(512, 288));
    cache_.store(subject_, ThumbnailSize::xxLarge, plainBitmap(1024, 576));
    cache_.storeFailure(subject_);
    EXPECT_THAT(files(),
                testing::UnorderedElementsAre("thumbnails/normal/" + name_, "thumbnails/large/" + name_,
                                              "thumbnails/x-large/" + name_, "thumbnails/xx-large/" + name_,
                                              "thumbnails/fail/vexo-" VEXO_VERSION "/" + name_));
}

TEST_F(SharedThumbnails, AreForTheUserAlone) {
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(2, 2));
    cache_.storeFailure(subject_);
    for (const char* folder : {"thumbnails", "thumbnails/large", "thumbnails/fail"})
        EXPECT_EQ(modeOf(folder_.path(folder)), 0700u) << folder;
    for (const std::string& file : files())
        EXPECT_EQ(modeOf(folder_.path(file)), 0600u) << file;
}

TEST_F(SharedThumbnails, AreValidByTheRulesOfAnotherProgram) {
    const std::string movie = folder_.writeFile("my clip, 100% \xc3\xbcml.mov", "content");
    setModificationTime(movie, 1'000'000'000);
    const ThumbnailSubject subject{platform::URL::fileURLWithPath(movie).absoluteString(), 1'000'000'000, 7};
    const auto told = [&] {
        return runProgram("env",
                          {"XDG_CACHE_HOME=" + folder_.path(), "gio", "info", "-a", "thumbnail::*", movie})
            .output;
    };
    EXPECT_THAT(told(), Not(HasSubstr("thumbnail::path")));

    cache_.store(subject, ThumbnailSize::large, plainBitmap(256, 144));
    EXPECT_THAT(told(), HasSubstr("thumbnails/large/"));
    EXPECT_THAT(told(), HasSubstr("thumbnail::is-valid: TRUE"));

    setModificationTime(movie, 1'000'000'001);
    EXPECT_THAT(told(), HasSubstr("thumbnail::is-valid: FALSE"));
}

TEST_F(SharedThumbnails, CountForOneStateOfOneFile) {
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(2, 2));
    ThumbnailSubject changed = subject_;
    changed.modificationTime += 1;
    EXPECT_FALSE(cache_.find(changed, ThumbnailSize::large));

    // Another file's thumbnail under this one's name: two URIs may share a checksum.
    const std::string path = folder_.path("thumbnails/large/" + name_);
    ThumbnailSubject other = subject_;
    other.uri += "x";
    const auto png = encodedThumbnail(other, plainBitmap(2, 2));
    std::ofstream(path).write(reinterpret_cast<const char*>(png.data()), std::ssize(png));
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::large));
}

TEST_F(SharedThumbnails, ALargerOneServesAsWell) {
    cache_.store(subject_, ThumbnailSize::xLarge, plainBitmap(512, 288));
    cache_.store(subject_, ThumbnailSize::xxLarge, plainBitmap(1024, 576));
    EXPECT_EQ(cache_.find(subject_, ThumbnailSize::normal)->width, 512);
    EXPECT_EQ(cache_.find(subject_, ThumbnailSize::xxLarge)->width, 1024);
}

TEST_F(SharedThumbnails, ASmallerOneDoesNot) {
    cache_.store(subject_, ThumbnailSize::normal, plainBitmap(128, 72));
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::large));
}

TEST_F(SharedThumbnails, OneThatIsLargerThanItsFolderAllowsIsNone) {
    cache_.store(subject_, ThumbnailSize::normal, plainBitmap(129, 72));
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::normal));
}

TEST_F(SharedThumbnails, ANewOneReplacesTheOld) {
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(2, 2, opaqueRed));
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(2, 2, opaqueBlue));
    EXPECT_EQ(cache_.find(subject_, ThumbnailSize::large)->pixels, plainBitmap(2, 2, opaqueBlue).pixels);
    EXPECT_EQ(files().size(), 1u);
}

TEST_F(SharedThumbnails, FailuresAreRememberedForOneStateOfTheFile) {
    EXPECT_FALSE(cache_.isKnownToFail(subject_));
    cache_.storeFailure(subject_);
    EXPECT_TRUE(cache_.isKnownToFail(subject_));
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::normal));
    ThumbnailSubject changed = subject_;
    changed.modificationTime += 1;
    EXPECT_FALSE(cache_.isKnownToFail(changed));
}

TEST_F(SharedThumbnails, AreNotKeptOfAFileThatMayStillChangeInItsSecond) {
    const std::string now = folder_.writeFile("now");
    struct stat status {};
    for (int attempt = 0; attempt < 3 && !cache_.find(subject_, ThumbnailSize::large); ++attempt) {
        stat(folder_.writeFile("now", std::to_string(attempt)).c_str(), &status);
        ThumbnailSubject fresh = subject_;
        fresh.modificationTime = status.st_mtim.tv_sec;
        cache_.store(fresh, ThumbnailSize::large, plainBitmap(2, 2));
        struct stat after {};
        stat(folder_.writeFile("now", "after").c_str(), &after);
        if (after.st_mtim.tv_sec != fresh.modificationTime)
            continue;  // the second ended meanwhile
        EXPECT_FALSE(cache_.find(fresh, ThumbnailSize::large));
        return;
    }
    FAIL() << "no second was long enough";
}

TEST_F(SharedThumbnails, DamagedOnesAreNone) {
    const auto png = encodedThumbnail(subject_, plainBitmap(40, 30));
    const std::string whole(reinterpret_cast<const char*>(png.data()), png.size());
    ASSERT_TRUE(decodedThumbnail(bytesOf(whole), subject_, 256));
    for (std::size_t length = 0; length < whole.size(); ++length)
        EXPECT_FALSE(decodedThumbnail(bytesOf(whole.substr(0, length)), subject_, 256)) << length;
    std::string flipped = whole;
    flipped[flipped.size() - 20] ^= 1;  // among the pixels
    EXPECT_FALSE(decodedThumbnail(bytesOf(flipped), subject_, 256));
    EXPECT_FALSE(decodedThumbnail(bytesOf("<svg xmlns='http://www.w3.org/2000/svg' width='1' height='1'/>"),
                                  subject_, 256));
}

TEST_F(SharedThumbnails, WhatIsNoPlainFileIsNone) {
    folder_.makeFifo("thumbnails/large/" + name_);
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::large));
}

TEST_F(SharedThumbnails, TimesWithAFractionCount) {
    const auto png = encodedThumbnail(subject_, plainBitmap(4, 4));
    std::string text(reinterpret_cast<const char*>(png.data()), png.size());
    // Longer by two characters: the length of the chunk and its checksum have to follow, so Python writes it.
    const std::string path = folder_.path("fraction.png");
    std::ofstream(folder_.path("whole.png"), std::ios::binary) << text;
    const std::string script =
        "import struct, zlib, sys\n"
        "data = open(sys.argv[1], 'rb').read()\n"
        "at = data.index(b'Thumb::MTime') - 4\n"
        "size = struct.unpack('>I', data[at-4:at])[0]\n"
        "chunk = data[at:at+4+size] + b'.5'\n"
        "new = struct.pack('>I', size + 2) + chunk + struct.pack('>I', zlib.crc32(chunk))\n"
        "open(sys.argv[2], 'wb').write(data[:at-4] + new + data[at+4+size+4:])\n";
    ASSERT_EQ(runProgram("python3", {"-c", script, folder_.path("whole.png"), path}).status, 0);
    std::ifstream file(path, std::ios::binary);
    const std::string changed{std::istreambuf_iterator<char>(file), {}};
    EXPECT_EQ(changed.size(), text.size() + 2);
    EXPECT_TRUE(decodedThumbnail(bytesOf(changed), subject_, 256));
}

TEST_F(SharedThumbnails, TransparencySurvives) {
    const Bitmap faint = plainBitmap(2, 2, 0x80400000);
    cache_.store(subject_, ThumbnailSize::large, faint);
    const auto found = cache_.find(subject_, ThumbnailSize::large);
    ASSERT_TRUE(found);
    EXPECT_EQ(found->pixels, faint.pixels);
}

TEST_F(SharedThumbnails, WithoutAFolderNothingIsKept) {
    const ThumbnailCache none{std::nullopt};
    none.store(subject_, ThumbnailSize::large, plainBitmap(2, 2));
    none.storeFailure(subject_);
    EXPECT_FALSE(none.find(subject_, ThumbnailSize::large));
    EXPECT_FALSE(none.isKnownToFail(subject_));
}

TEST_F(SharedThumbnails, AFolderThatCannotBeMadeIsDoneWithout) {
    folder_.writeFile("thumbnails");
    cache_.store(subject_, ThumbnailSize::large, plainBitmap(2, 2));
    EXPECT_FALSE(cache_.find(subject_, ThumbnailSize::large));
    EXPECT_THAT(files(), testing::ElementsAre("thumbnails"));
}

TEST(ThumbnailSizes, AreTheSmallestThatDo) {
    EXPECT_EQ(thumbnailSizeFor(0), ThumbnailSize::normal);
    EXPECT_EQ(thumbnailSizeFor(128), ThumbnailSize::normal);
    EXPECT_EQ(thumbnailSizeFor(129), ThumbnailSize::large);
    EXPECT_EQ(thumbnailSizeFor(257), ThumbnailSize::xLarge);
    EXPECT_EQ(thumbnailSizeFor(1024), ThumbnailSize::xxLarge);
    EXPECT_EQ(thumbnailSizeFor(5000), ThumbnailSize::xxLarge);
}

TEST(ThumbnailFolder, LiesInTheUsersCacheFolder) {
    {
        const ScopedEnvironment cache("XDG_CACHE_HOME", "/a/cache");
        EXPECT_EQ(ThumbnailCache::defaultFolder(), "/a/cache/thumbnails");
    }
    const ScopedEnvironment cache("XDG_CACHE_HOME", nullptr);
    const ScopedEnvironment home("HOME", "/home/user");
    EXPECT_EQ(ThumbnailCache::defaultFolder(), "/home/user/.cache/thumbnails");
}
