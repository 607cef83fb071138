// Which files are read, which are answered from the index, and why a file has no answer.
#include "framework/metadata/MetadataCache.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <future>
#include <thread>

#include "tests/support/OrdinaryUser.h"
#include "tests/support/TemporaryFolder.h"

using namespace std::chrono_literals;
using namespace testing_support;
using namespace vexo;

namespace {

const MediaReaderAnswer sameMovie = MediaProperties{{"Video"}, 1920, 1080, 2.5, {"h264"}, 86400.25};

// Takes every file for the same movie, and does what it is told to while it reads.
class CountingReader final : public MediaReader {
  public:
    MediaReaderAnswer read(int) override {
        ++reads;
        whileReading();
        return sameMovie;
    }
    MediaFrameAnswer frame(int, int) override { return MediaFailure{"no picture"}; }

    std::atomic<int> reads{0};
    std::function<void()> whileReading = [] {};
};

class MetadataCacheOfFiles : public testing::Test {
  protected:
    void rename(const std::string& from, const std::string& to) const {
        ASSERT_EQ(std::rename(from.c_str(), to.c_str()), 0);
    }
    MediaFailure failureFor(const std::string& path) {
        const MediaReaderAnswer answer = cache_.answerForFile(path);
        const auto* failure = std::get_if<MediaFailure>(&answer);
        EXPECT_TRUE(failure) << path << " was read";
        return failure ? *failure : MediaFailure{};
    }
    void expectNoAnswer(const std::string& path, const std::string& reason) {
        EXPECT_EQ(failureFor(path), (MediaFailure{reason, FailureCause::elsewhere})) << path;
    }

    TemporaryFolder folder_;
    const std::shared_ptr<CountingReader> reader_ = std::make_shared<CountingReader>();
    MetadataCache cache_{folder_.path("cache/metadata.sqlite"), reader_};
};

// How many descriptors this process has on a file.
int descriptorsOn(const std::string& path) {
    int count = 0;
    for (const auto& descriptor : std::filesystem::directory_iterator("/proc/self/fd")) {
        std::error_code closedMeanwhile;
        count += std::filesystem::read_symlink(descriptor.path(), closedMeanwhile) == path;
    }
    return count;
}

void append(const std::string& path, std::string_view content) {
    std::ofstream(path, std::ios::binary | std::ios::app) << content;
}

}  // namespace

// --- What is read, and what is not

TEST_F(MetadataCacheOfFiles, AFileIsReadOnceAndThenKnown) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataCacheOfFiles, RenamingMovingAndLinkingCostNoRead) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    cache_.answerForFile(path);
    const std::string renamed = folder_.path("renamed.mov");
    rename(path, renamed);
    EXPECT_EQ(cache_.answerForFile(renamed), sameMovie);
    const std::string moved = folder_.makeFolder("other") + "/moved.mov";
    rename(renamed, moved);
    EXPECT_EQ(cache_.answerForFile(moved), sameMovie);
    const std::string linked = folder_.path("linked.mov");
    ASSERT_EQ(link(moved.c_str(), linked.c_str()), 0);
    EXPECT_EQ(cache_.answerForFile(linked), sameMovie);
    EXPECT_EQ(cache_.answerForFile(folder_.makeLink("symbolic.mov", moved)), sameMovie);
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataCacheOfFiles, AnotherFileUnderTheSameNameIsRead) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    cache_.answerForFile(path);
    rename(folder_.writeFile("other.mov", "CONTENT"), path);
    cache_.answerForFile(path);
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataCacheOfFiles, AFileThatGrowsWhileItIsReadIsReadAgain) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    reader_->whileReading = [&] { append(path, "more"); };
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    reader_->whileReading = [] {};
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(reader_->reads, 2);
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataCacheOfFiles, WhatAFileSaidWhileItGrewIsNotTakenForWhatItSaidBefore) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    setModificationTime(path, 1e9);
    reader_->whileReading = [&] { append(path, "more"); };
    cache_.answerForFile(path);
    reader_->whileReading = [] {};
    ASSERT_EQ(truncate(path.c_str(), 7), 0);
    setModificationTime(path, 1e9);
    cache_.answerForFile(path);
    EXPECT_EQ(reader_->reads, 2);
}

TEST_F(MetadataCacheOfFiles, AFileThatIsMovedWhileItIsReadIsKnownAfterwards) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    const std::string moved = folder_.path("moved.mov");
    reader_->whileReading = [&] { rename(path, moved); };
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(cache_.answerForFile(moved), sameMovie);
    EXPECT_EQ(reader_->reads, 1);
}

TEST_F(MetadataCacheOfFiles, AFileWhoseAnswerIsDamagedIsReadAgainOnce) {
    const std::string path = folder_.writeFile("clip.mov", "content");
    cache_.answerForFile(path);
    sqlite3* database = nullptr;
    ASSERT_EQ(sqlite3_open(cache_.indexPath().c_str(), &database), SQLITE_OK);
    EXPECT_EQ(sqlite3_exec(database, "UPDATE files SET pixelWidth = -1", nullptr, nullptr, nullptr),
              SQLITE_OK);
    sqlite3_close(database);
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
    EXPECT_EQ(reader_->reads, 2);
}

// --- Who waits for whom

TEST_F(MetadataCacheOfFiles, AKnownFileIsAnsweredWhileAnotherIsRead) {
    const std::string known = folder_.writeFile("known.mov", "content");
    const std::string slow = folder_.writeFile("slow.mov", "content");
    cache_.answerForFile(known);
    std::future<MediaReaderAnswer> answer;
    std::future_status status{};
    reader_->whileReading = [&] {
        answer = std::async(std::launch::async, [&] { return cache_.answerForFile(known); });
        status = answer.wait_for(30s);
    };
    cache_.answerForFile(slow);
    EXPECT_EQ(status, std::future_status::ready);
    EXPECT_EQ(answer.get(), sameMovie);
}

TEST_F(MetadataCacheOfFiles, AFileThatCannotBeReadIsAnsweredWhileAnotherIsRead) {
    std::future<MediaReaderAnswer> answer;
    std::future_status status{};
    reader_->whileReading = [&] {
        answer =
            std::async(std::launch::async, [&] { return cache_.answerForFile(folder_.path("missing")); });
        status = answer.wait_for(30s);
    };
    cache_.answerForFile(folder_.writeFile("slow.mov", "content"));
    EXPECT_EQ(status, std::future_status::ready);
}

TEST_F(MetadataCacheOfFiles, ThreadsThatAskWhileAFileIsReadWaitForItsAnswer) {
    constexpr int threadCount = 6;
    const std::string path = folder_.writeFile("clip.mov", "content");
    // The others have found the file to be unknown by the time they have opened it.
    reader_->whileReading = [&] {
        const auto end = std::chrono::steady_clock::now() + 30s;
        while (reader_->reads == 1 && descriptorsOn(path) < threadCount &&
               std::chrono::steady_clock::now() < end)
            std::this_thread::yield();
    };
    std::vector<std::thread> threads;
    for (int i = 0; i < threadCount; ++i)
        threads.emplace_back([&] { EXPECT_EQ(cache_.answerForFile(path), sameMovie); });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(reader_->reads, 1);
}

// --- Why there is no answer

TEST_F(MetadataCacheOfFiles, WhatIsNoFileWithAContentHasAReason) {
    expectNoAnswer(folder_.path("missing.mov"), "No such file or directory");
    expectNoAnswer(folder_.makeLink("circle.mov", folder_.path("circle.mov")),
                   "Too many levels of symbolic links");
    expectNoAnswer(folder_.writeFile("file.mov", "content") + "/clip.mov", "Not a directory");
    expectNoAnswer(folder_.path(std::string(300, 'x')), "File name too long");
    expectNoAnswer(folder_.writeFile("empty.mov"), "it is empty");
    expectNoAnswer(folder_.makeFolder("folder.mov"), "it is a folder");
    expectNoAnswer(folder_.makeFifo("fifo.mov"), "it is no plain file");
    expectNoAnswer(folder_.makeLink("device.mov", "/dev/zero"), "it is no plain file");
    EXPECT_EQ(reader_->reads, 0);
}

TEST_F(MetadataCacheOfFiles, AFileThatMayNotBeReadHasAReasonUntilItMay) {
    const OrdinaryUser user(folder_.path());
    const std::string path = folder_.writeFile("clip.mov", "content");
    ASSERT_EQ(chmod(path.c_str(), 0), 0);
    expectNoAnswer(path, "Permission denied");
    ASSERT_EQ(chmod(path.c_str(), 0400), 0);
    EXPECT_EQ(cache_.answerForFile(path), sameMovie);
}
