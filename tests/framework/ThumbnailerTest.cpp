// Images that fill themselves in.
#include "framework/thumbnails/Thumbnailer.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <future>
#include <set>

#include "framework/HostServices.h"
#include "host/VXMediaObject.h"
#include "platform/linux/LinuxDispatcher.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/Pixels.h"
#include "tests/support/SampleMovie.h"

using namespace testing_support;
using namespace vexo;
using platform::Bitmap;
using platform::Size;
using testing::ElementsAre;

namespace {

std::uint32_t middleOf(const std::optional<Bitmap>& bitmap) {
    return bitmap ? bitmap->pixels.at(std::size_t(bitmap->height / 2 * bitmap->width + bitmap->width / 2))
                  : 0;
}

// A stand-in that is green, and thumbnails as a test makes them.
class ThumbnailPictures : public testing::Test {
  protected:
    std::shared_ptr<ThumbnailPicture> picture(const std::string& path = "/clip.mov") {
        return std::make_shared<ThumbnailPicture>(
            path, platform::pictureWithBitmap(plainBitmap(8, 8, opaqueGreen)), queue_);
    }

    HostEnvironment host_;
    std::vector<std::string> made_;  // "path side"
    std::function<std::optional<Bitmap>(const std::string&, int)> make_ = [](const std::string&, int side) {
        return plainBitmap(side, side / 2, opaqueRed);
    };
    const std::shared_ptr<ThumbnailQueue> queue_ = newQueue(ThumbnailQueue::mostBytes);

    std::shared_ptr<ThumbnailQueue> newQueue(std::size_t mostBytes) {
        return std::make_shared<ThumbnailQueue>(
            [this](const std::string& path, int side) {
                made_.push_back(path + " " + std::to_string(side));
                return make_(path, side);
            },
            mostBytes);
    }
};

}  // namespace

TEST_F(ThumbnailPictures, NothingIsMadeBeforeAPictureIsDrawn) {
    const auto image = picture();
    EXPECT_EQ(image->naturalSize(), (Size{128, 128}));
    EXPECT_TRUE(image->isDrawable());
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre());
    EXPECT_TRUE(host_.dispatcher.requests().empty());
}

TEST_F(ThumbnailPictures, ShowAStandInUntilTheThumbnailIsThere) {
    const auto image = picture();
    int told = 0;
    const auto owner = std::make_shared<int>();
    image->addObserver(owner, [&] { ++told; });

    EXPECT_EQ(middleOf(image->draw(100, 50)), opaqueGreen);
    EXPECT_EQ(told, 0);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(told, 1);
    EXPECT_EQ(middleOf(image->draw(100, 50)), opaqueRed);
    EXPECT_EQ(image->naturalSize(), (Size{128, 64}));
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre("/clip.mov 100"));
}

TEST_F(ThumbnailPictures, TheStandInKeepsItsProportions) {
    const auto drawn = picture()->draw(30, 10);
    ASSERT_TRUE(drawn);
    EXPECT_EQ(drawn->width, 30);
    EXPECT_EQ(drawn->height, 10);
    EXPECT_EQ(drawn->pixels.at(5 * 30 + 9), 0u);
    EXPECT_EQ(drawn->pixels.at(5 * 30 + 10), opaqueGreen);
    EXPECT_EQ(drawn->pixels.at(5 * 30 + 19), opaqueGreen);
    EXPECT_EQ(drawn->pixels.at(5 * 30 + 20), 0u);
    EXPECT_FALSE(picture()->draw(0, 10));
}

TEST_F(ThumbnailPictures, ALargerDrawingAsksForMorePixels) {
    const auto image = picture();
    image->draw(100, 50);
    host_.dispatcher.runDueBlocks();
    image->draw(80, 40);
    EXPECT_EQ(middleOf(image->draw(300, 150)), opaqueRed);  // the small one, while the larger one is made
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre("/clip.mov 100", "/clip.mov 300"));
}

TEST_F(ThumbnailPictures, AMovieWithoutAThumbnailKeepsTheStandInAndIsNotTriedAgain) {
    make_ = [](const std::string&, int) { return std::nullopt; };
    const auto image = picture();
    image->draw(10, 10);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(middleOf(image->draw(10, 10)), opaqueGreen);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(made_.size(), 1u);
}

TEST_F(ThumbnailPictures, ARefreshTellsObserversAndLooksAnewAtTheNextDrawing) {
    const auto image = picture();
    int told = 0;
    const auto owner = std::make_shared<int>();
    image->addObserver(owner, [&] { ++told; });
    image->draw(10, 10);
    host_.dispatcher.runDueBlocks();

    make_ = [](const std::string&, int side) { return plainBitmap(side, side, opaqueGreen); };
    image->refresh();
    EXPECT_EQ(told, 2);
    EXPECT_EQ(middleOf(image->draw(10, 10)), opaqueRed);  // until it is known better
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(told, 3);
    EXPECT_EQ(middleOf(image->draw(10, 10)), opaqueGreen);
}

TEST_F(ThumbnailPictures, WhatWasMadeBeforeARefreshDoesNotCountAfterIt) {
    const auto image = picture();
    make_ = [&](const std::string&, int side) {
        image->refresh();  // the file changes while its thumbnail is made
        return plainBitmap(side, side, opaqueRed);
    };
    image->draw(10, 10);
    host_.dispatcher.runDueBlocks();
    make_ = [](const std::string&, int side) { return plainBitmap(side, side, opaqueGreen); };
    image->draw(10, 10);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(middleOf(image->draw(10, 10)), opaqueGreen);
}

TEST_F(ThumbnailPictures, TheLastOneDrawnComesFirst) {
    const auto first = picture("/first"), second = picture("/second"), third = picture("/third");
    first->draw(1, 1);
    second->draw(2, 2);
    third->draw(3, 3);
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre("/third 3", "/second 2", "/first 1"));
}

TEST_F(ThumbnailPictures, OneThatIsGoneIsPassedOver) {
    picture("/gone")->draw(1, 1);
    const auto kept = picture("/kept");
    kept->draw(1, 1);
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre("/kept 1"));
}

TEST_F(ThumbnailPictures, OneThreadServesAllThatWaitAndEndsAfterThem) {
    const auto first = picture("/first"), second = picture("/second");
    first->draw(1, 1);
    second->draw(1, 1);
    EXPECT_EQ(host_.dispatcher.pendingCount(), 1u);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(host_.dispatcher.pendingCount(), 0u);
    first->draw(2, 2);
    EXPECT_EQ(host_.dispatcher.pendingCount(), 1u);
}

TEST_F(ThumbnailPictures, AMakerThatRaisesCostsOneThumbnailAlone) {
    make_ = [](const std::string& path, int side) -> std::optional<Bitmap> {
        if (path == "/bad")
            throw std::bad_alloc();
        return plainBitmap(side, side, opaqueRed);
    };
    const auto good = picture("/good"), bad = picture("/bad");
    good->draw(1, 1);
    bad->draw(1, 1);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(middleOf(good->draw(1, 1)), opaqueRed);
    EXPECT_EQ(middleOf(bad->draw(1, 1)), opaqueGreen);
}

TEST_F(ThumbnailPictures, TheOldestPixelsAreGivenBackWhenThereAreTooMany) {
    const auto queue = newQueue(3 * 10 * 5 * 4);
    const auto newPicture = [&](const std::string& path) {
        return std::make_shared<ThumbnailPicture>(
            path, platform::pictureWithBitmap(plainBitmap(8, 8, opaqueGreen)), queue);
    };
    std::vector<std::shared_ptr<ThumbnailPicture>> pictures;
    for (const char* path : {"/1", "/2", "/3", "/4"}) {
        pictures.push_back(newPicture(path));
        pictures.back()->draw(10, 5);
        host_.dispatcher.runDueBlocks();
    }
    EXPECT_EQ(middleOf(pictures[1]->draw(10, 5)), opaqueRed);
    EXPECT_EQ(middleOf(pictures[3]->draw(10, 5)), opaqueRed);
    EXPECT_EQ(middleOf(pictures[0]->draw(10, 5)), opaqueGreen);  // and asks for them again
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(middleOf(pictures[0]->draw(10, 5)), opaqueRed);
    EXPECT_EQ(middleOf(pictures[1]->draw(10, 5)), opaqueGreen);
}

TEST_F(ThumbnailPictures, AfterClosingNothingIsMade) {
    const auto waiting = picture("/waiting"), later = picture("/later");
    waiting->draw(1, 1);
    queue_->close();
    later->draw(1, 1);
    host_.dispatcher.runDueBlocks();
    EXPECT_THAT(made_, ElementsAre());
    EXPECT_EQ(host_.dispatcher.pendingCount(), 0u);
}

namespace {

// Answers with a opaqueRed picture, or the failure that a test sets, and counts.
class ScriptedFrames final : public MediaReader {
  public:
    MediaReaderAnswer read(int) override { return MediaFailure{"not asked for here"}; }
    MediaFrameAnswer frame(int, int longestSide) override {
        ++frames;
        if (whileReading)
            whileReading();
        if (failure)
            return *failure;
        return plainBitmap(longestSide, longestSide / 2, opaqueRed);
    }

    std::optional<MediaFailure> failure;
    std::function<void()> whileReading;
    int frames = 0;
};

class MovieThumbnails : public testing::Test {
  protected:
    ThumbnailMaker newMaker() const { return {ThumbnailCache(cacheFolder_), reader_}; }
    std::string writeMovie(std::string_view name = "Clip.mov") {
        const std::string path = host_.home.writeFile(name, "movie");
        setModificationTime(path, 1'000'000'000);
        return path;
    }

    HostEnvironment host_;
    const std::string cacheFolder_ = host_.home.path("cache/thumbnails");
    const std::shared_ptr<ScriptedFrames> reader_ = std::make_shared<ScriptedFrames>();
};

}  // namespace

TEST_F(MovieThumbnails, AreMadeOnceAndSharedByTheirSize) {
    const std::string path = writeMovie();
    EXPECT_EQ(newMaker().thumbnailOf(path, 200)->width, 256);
    EXPECT_EQ(newMaker().thumbnailOf(path, 200)->width, 256);
    EXPECT_EQ(newMaker().thumbnailOf(path, 100)->width, 256);
    EXPECT_EQ(reader_->frames, 1);
    EXPECT_EQ(newMaker().thumbnailOf(path, 300)->width, 512);
    EXPECT_EQ(reader_->frames, 2);
    EXPECT_TRUE(std::filesystem::exists(cacheFolder_ + "/large"));
    EXPECT_TRUE(std::filesystem::exists(cacheFolder_ + "/x-large"));
}

TEST_F(MovieThumbnails, AreMadeAnewWhenTheMovieChanges) {
    const std::string path = writeMovie();
    newMaker().thumbnailOf(path, 200);
    setModificationTime(path, 1'000'000'001);
    newMaker().thumbnailOf(path, 200);
    EXPECT_EQ(reader_->frames, 2);
}

TEST_F(MovieThumbnails, AFailureIsSharedUntilTheMovieChanges) {
    const std::string path = writeMovie();
    reader_->failure = MediaFailure{"no picture in it"};
    EXPECT_FALSE(newMaker().thumbnailOf(path, 200));
    EXPECT_FALSE(newMaker().thumbnailOf(path, 200));
    EXPECT_EQ(reader_->frames, 1);
    setModificationTime(path, 1'000'000'001);
    EXPECT_FALSE(newMaker().thumbnailOf(path, 200));
    EXPECT_EQ(reader_->frames, 2);
}

TEST_F(MovieThumbnails, AFailureThatIsNotTheMoviesIsNotKept) {
    const std::string path = writeMovie();
    reader_->failure = MediaFailure{"no reader", FailureCause::elsewhere};
    EXPECT_FALSE(newMaker().thumbnailOf(path, 200));
    reader_->failure.reset();
    EXPECT_TRUE(newMaker().thumbnailOf(path, 200));
}

TEST_F(MovieThumbnails, OfAMovieThatChangesMeanwhileIsShownAndNotShared) {
    const std::string path = writeMovie();
    reader_->whileReading = [&] { setModificationTime(path, 1'000'000'007); };
    EXPECT_TRUE(newMaker().thumbnailOf(path, 200));
    EXPECT_FALSE(std::filesystem::exists(cacheFolder_));
}

TEST_F(MovieThumbnails, OnlyPlainFilesWithAContentAreRead) {
    host_.home.makeFolder("folder.mov");
    host_.home.makeFifo("pipe.mov");
    host_.home.writeFile("empty.mov");
    for (const char* name : {"folder.mov", "pipe.mov", "empty.mov", "missing.mov"})
        EXPECT_FALSE(newMaker().thumbnailOf(host_.home.path(name), 200)) << name;
    EXPECT_EQ(reader_->frames, 0);
}

TEST_F(MovieThumbnails, AreKnownByTheRealPathOfAVolume) {
    host_.mounts.list = {{host_.home.path(), "/dev/x", "ext4", "Stick", true}};
    writeMovie();
    EXPECT_TRUE(newMaker().thumbnailOf("/Volumes/Stick/Clip.mov", 200));
    EXPECT_TRUE(newMaker().thumbnailOf(host_.home.path("Clip.mov"), 200));
    EXPECT_EQ(reader_->frames, 1);
}

TEST_F(MovieThumbnails, NothingIsWrittenBesideTheMovie) {
    writeMovie("Movies/Clip.mov");
    newMaker().thumbnailOf(host_.home.path("Movies/Clip.mov"), 200);
    const auto begin = std::filesystem::directory_iterator(host_.home.path("Movies"));
    EXPECT_EQ(std::distance(begin, std::filesystem::directory_iterator()), 1);
}

// --- An item's own thumbnail -------------------------------------------------------------------------------

namespace {

class ItemThumbnails : public MovieThumbnails {
  protected:
    ItemThumbnails() {
        const HostServices& services = hostServices();
        scope_.emplace(HostServices{services.pathWatcher, services.imageManager, services.metadata,
                                    thumbnailer_, services.diagnostics});
    }

    Thumbnailer thumbnailer_{newMaker()};
    std::optional<HostServicesScope> scope_;
};

}  // namespace

TEST_F(ItemThumbnails, AreTheSameImageEachTimeAndNoneWithoutAPath) {
    VXMediaObject item(3, "Clip", "id");
    EXPECT_EQ(item.thumbnailImage(), nullptr);
    item.setPath(writeMovie());
    const platform::ImageRef image = item.thumbnailImage();
    ASSERT_NE(image, nullptr);
    EXPECT_EQ(item.thumbnailImage(), image);
    EXPECT_EQ(image->name(), "");
    EXPECT_EQ(image->size(), (Size{128, 128}));
    EXPECT_EQ(reader_->frames, 0);
}

TEST_F(ItemThumbnails, ShowTheMovieOnceDrawn) {
    VXMediaObject item(3, "Clip", "id");
    item.setPath(writeMovie());
    const auto image = item.thumbnailImage();
    const auto picture = image->picture();
    const auto standIn = picture->draw(64, 64);
    ASSERT_TRUE(standIn);
    EXPECT_NE(middleOf(standIn), opaqueRed);
    host_.dispatcher.runDueBlocks();
    EXPECT_EQ(middleOf(picture->draw(64, 32)), opaqueRed);
    EXPECT_EQ(image->size(), (Size{128, 128}));
}

TEST_F(ItemThumbnails, SettingItsOwnAgainMakesTheHostRedrawIt) {
    VXMediaObject item(3, "Clip", "id");
    item.setPath(writeMovie());
    const platform::ImageRef image = item.thumbnailImage();
    int told = 0;
    const auto owner = std::make_shared<int>();
    image->picture()->addObserver(owner, [&] { ++told; });
    item.setThumbnailImage(item.thumbnailImage());
    EXPECT_EQ(told, 1);

    const auto other =
        std::make_shared<platform::Image>(platform::pictureWithBitmap(plainBitmap(1, 1, opaqueRed)));
    item.setThumbnailImage(other);
    EXPECT_EQ(item.thumbnailImage(), other);
    EXPECT_EQ(told, 1);
}

TEST(RealThumbnails, AreFramesOfTheMovie) {
    HostEnvironment host;
    platform::LinuxDispatcher dispatcher(host.log);
    const platform::ServicesScope scope(
        {host.files(), host.workspace, host.userDefaults, dispatcher, host.notifications, host.log});
    const std::string path = host.home.path("Clip.mov");
    makeSampleMovie(path, {.size = "320x180", .seconds = 2});
    setModificationTime(path, 1'000'000'000);
    const std::string cacheFolder = host.home.path("cache/thumbnails");
    Thumbnailer thumbnailer(
        {ThumbnailCache(cacheFolder), std::make_shared<ProcessMediaReader>(
                                          ProcessMediaReader::Settings{VEXO_BIN_DIR "/vexo-media-reader"})});

    const platform::ImageRef image = thumbnailer.thumbnailOfFile(path);
    std::promise<void> filled;
    const auto owner = std::make_shared<int>();
    image->picture()->addObserver(owner, [&] { filled.set_value(); });
    image->picture()->draw(256, 256);
    ASSERT_EQ(filled.get_future().wait_for(std::chrono::seconds(60)), std::future_status::ready);

    EXPECT_EQ(image->picture()->naturalSize(), (Size{128, 72}));
    const auto drawn = image->picture()->draw(256, 144);
    ASSERT_TRUE(drawn);
    const std::set<std::uint32_t> colours(drawn->pixels.begin(), drawn->pixels.end());
    EXPECT_GT(colours.size(), 8u);
    EXPECT_TRUE(std::filesystem::exists(cacheFolder + "/large"));
}
