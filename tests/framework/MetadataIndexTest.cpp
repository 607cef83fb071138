#include "framework/metadata/MetadataIndex.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <thread>

#include "tests/support/TemporaryFolder.h"

using namespace testing_support;
using namespace vexo;

namespace {

const FileKey key{1, 2, 3, 4};
const MediaReaderAnswer movie = MediaProperties{{"Video"}, 1920, 1080, 2.5, {"h264"}, 86400.25};
const MediaReaderAnswer failure = MediaFailure{"no movie or sound"};

class MetadataIndexFile : public testing::Test {
  protected:
    bool exists(const std::string& name) const {
        return std::filesystem::exists(folder_.path("cache/" + name));
    }
    void runSql(const char* sql) const {
        sqlite3* database = nullptr;
        ASSERT_EQ(sqlite3_open(path_.c_str(), &database), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(database, sql, nullptr, nullptr, nullptr), SQLITE_OK)
            << sqlite3_errmsg(database);
        sqlite3_close(database);
    }
    // An index of many pages, closed.
    void fill(int files) const {
        MetadataIndex index(path_);
        for (int i = 0; i < files; ++i)
            index.store({1, static_cast<std::uint64_t>(i), 3, 4}, movie);
    }
    void overwrite(std::streamoff from, std::size_t size) const {
        std::fstream file(path_, std::ios::binary | std::ios::in | std::ios::out);
        file.seekp(from);
        file << std::string(size, '\x5a');
    }

    TemporaryFolder folder_;
    const std::string path_ = folder_.path("cache/metadata.sqlite");
};

}  // namespace

TEST_F(MetadataIndexFile, KeepsAnswersFromOneHandleToTheNext) {
    MetadataIndex(path_).store(key, movie);
    MetadataIndex index(path_);
    EXPECT_EQ(index.path(), path_);
    EXPECT_EQ(index.find(key), movie);
}

TEST_F(MetadataIndexFile, KeepsFailuresOfFiles) {
    MetadataIndex(path_).store(key, failure);
    EXPECT_EQ(MetadataIndex(path_).find(key), failure);
}

TEST_F(MetadataIndexFile, DoesNotKeepFailuresThatLieElsewhere) {
    MetadataIndex index(path_);
    index.store(key, MediaFailure{"no reader", FailureCause::elsewhere});
    EXPECT_EQ(index.find(key), std::nullopt);
}

TEST_F(MetadataIndexFile, AnyChangeOfTheKeyIsAnotherFile) {
    MetadataIndex index(path_);
    index.store(key, movie);
    for (const FileKey& other :
         {FileKey{9, 2, 3, 4}, FileKey{1, 9, 3, 4}, FileKey{1, 2, 9, 4}, FileKey{1, 2, 3, 9}})
        EXPECT_EQ(index.find(other), std::nullopt);
}

TEST_F(MetadataIndexFile, TheLatestStateOfAFileReplacesTheOneBefore) {
    MetadataIndex index(path_);
    index.store(key, failure);
    index.store({1, 2, 30, 40}, movie);
    EXPECT_EQ(index.find({1, 2, 30, 40}), movie);
    EXPECT_EQ(index.find(key), std::nullopt);
}

TEST_F(MetadataIndexFile, TakesTheWholeRangeOfKeys) {
    const FileKey extreme{~0ull, ~0ull, ~0ull, std::numeric_limits<std::int64_t>::min()};
    MetadataIndex index(path_);
    index.store(extreme, movie);
    EXPECT_EQ(index.find(extreme), movie);
}

TEST_F(MetadataIndexFile, TwoHandlesSeeEachOthersAnswers) {
    MetadataIndex one(path_), other(path_);
    one.store(key, movie);
    EXPECT_EQ(other.find(key), movie);
    other.store({5, 6, 7, 8}, failure);
    EXPECT_EQ(one.find({5, 6, 7, 8}), failure);
}

TEST_F(MetadataIndexFile, ProcessesThatBeginItAtOnceShareIt) {
    constexpr int processes = 6;
    std::vector<pid_t> children;
    for (int i = 0; i < processes; ++i) {
        const pid_t child = fork();
        if (child == 0) {
            MetadataIndex(path_).store({1, static_cast<std::uint64_t>(i), 3, 4}, movie);
            _exit(0);
        }
        children.push_back(child);
    }
    for (const pid_t child : children)
        waitpid(child, nullptr, 0);
    MetadataIndex index(path_);
    for (int i = 0; i < processes; ++i)
        EXPECT_EQ(index.find({1, static_cast<std::uint64_t>(i), 3, 4}), movie) << "process " << i;
}

TEST_F(MetadataIndexFile, ThreadsShareAHandle) {
    MetadataIndex index(path_);
    std::vector<std::thread> threads;
    for (std::uint64_t i = 0; i < 4; ++i)
        threads.emplace_back([&index, i] {
            for (std::uint64_t j = 0; j < 25; ++j) {
                index.store({i, j, 3, 4}, movie);
                EXPECT_EQ(index.find({i, j, 3, 4}), movie);
            }
        });
    for (std::thread& thread : threads)
        thread.join();
}

TEST_F(MetadataIndexFile, ItsFolderIsForTheUserAlone) {
    const MetadataIndex index(path_);
    struct stat status;
    ASSERT_EQ(stat(folder_.path("cache").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 0700u);
}

TEST_F(MetadataIndexFile, AFileThatIsNoDatabaseIsSetAside) {
    folder_.writeFile("cache/metadata.sqlite", std::string(5000, 'x'));
    MetadataIndex index(path_);
    EXPECT_EQ(index.path(), path_);
    EXPECT_TRUE(exists("metadata.sqlite.set-aside"));
    index.store(key, movie);
    EXPECT_EQ(MetadataIndex(path_).find(key), movie);
}

TEST_F(MetadataIndexFile, ADatabaseOfANewerVersionIsSetAside) {
    MetadataIndex(path_).store(key, movie);
    runSql("PRAGMA user_version = 99");
    MetadataIndex index(path_);
    EXPECT_EQ(index.find(key), std::nullopt);
    EXPECT_EQ(index.path(), path_);
    EXPECT_TRUE(exists("metadata.sqlite.set-aside"));
}

TEST_F(MetadataIndexFile, ADatabaseWithAnotherTableIsSetAside) {
    MetadataIndex(path_).store(key, movie);
    runSql("DROP TABLE files; CREATE TABLE files (something)");
    MetadataIndex index(path_);
    EXPECT_EQ(index.path(), path_);
    EXPECT_TRUE(exists("metadata.sqlite.set-aside"));
}

TEST_F(MetadataIndexFile, DamageThatShowsLaterBeginsTheIndexAnew) {
    fill(1000);
    overwrite(4096, 60000);
    MetadataIndex index(path_);
    EXPECT_EQ(index.find(key), std::nullopt);
    EXPECT_TRUE(exists("metadata.sqlite.set-aside"));
    index.store(key, movie);
    EXPECT_EQ(MetadataIndex(path_).find(key), movie);
}

TEST_F(MetadataIndexFile, AnAnswerThatMakesNoSenseCountsAsNone) {
    MetadataIndex(path_).store(key, movie);
    runSql("UPDATE files SET answer = '{\"mediaTypes\": 7}'");
    EXPECT_EQ(MetadataIndex(path_).find(key), std::nullopt);
    runSql("UPDATE files SET answer = zeroblob(50000000)");
    EXPECT_EQ(MetadataIndex(path_).find(key), std::nullopt);
}

TEST_F(MetadataIndexFile, ADamagedFileThatAnotherProcessReplacesIsLeftToIt) {
    folder_.writeFile("cache/metadata.sqlite", std::string(5000, 'x'));
    const int lock = open((path_ + ".lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    ASSERT_EQ(flock(lock, LOCK_EX), 0);
    MetadataIndex index(path_);
    EXPECT_EQ(index.path(), "");
    EXPECT_FALSE(exists("metadata.sqlite.set-aside"));
    close(lock);
}

TEST_F(MetadataIndexFile, LivesInMemoryWhereTheFolderCannotBeMade) {
    folder_.writeFile("file");
    MetadataIndex index(folder_.path("file/cache/metadata.sqlite"));
    EXPECT_EQ(index.path(), "");
    index.store(key, movie);
    EXPECT_EQ(index.find(key), movie);
}

TEST_F(MetadataIndexFile, LivesInMemoryWhereTheFileIsNone) {
    folder_.makeFolder("cache/metadata.sqlite");
    EXPECT_EQ(MetadataIndex(path_).path(), "");
    folder_.remove("cache/metadata.sqlite");
    folder_.makeFifo("cache/metadata.sqlite");
    EXPECT_EQ(MetadataIndex(path_).path(), "");
}

TEST(MetadataIndex, WithoutAPathLivesInMemory) {
    MetadataIndex index(std::nullopt);
    EXPECT_EQ(index.path(), "");
    index.store(key, movie);
    EXPECT_EQ(index.find(key), movie);
}

TEST(MetadataIndex, LiesInTheUsersCacheFolder) {
    const ScopedEnvironment home("HOME", "/home/kim");
    {
        const ScopedEnvironment cache("XDG_CACHE_HOME", "/var/kim");
        EXPECT_EQ(MetadataIndex::defaultPath(), "/var/kim/vexo/metadata.sqlite");
    }
    {
        const ScopedEnvironment cache("XDG_CACHE_HOME", "relative");
        EXPECT_EQ(MetadataIndex::defaultPath(), "/home/kim/.cache/vexo/metadata.sqlite");
    }
    const ScopedEnvironment cache("XDG_CACHE_HOME", nullptr);
    EXPECT_EQ(MetadataIndex::defaultPath(), "/home/kim/.cache/vexo/metadata.sqlite");
    const ScopedEnvironment noHome("HOME", nullptr);
    EXPECT_EQ(MetadataIndex::defaultPath(), std::nullopt);
}
