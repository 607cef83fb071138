#include "framework/metadata/MetadataIndex.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <signal.h>
#include <sqlite3.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <new>
#include <random>
#include <thread>

#include "platform/linux/LinuxFileManager.h"
#include "tests/support/OrdinaryUser.h"
#include "tests/support/TemporaryFolder.h"

using namespace testing_support;
using namespace vexo;

namespace {

const FileKey key{1, 2, 3, 4};
const MediaReaderAnswer movie = MediaProperties{{"Video"}, 1920, 1080, 2.5, {"h264"}, 86400.25};
const MediaReaderAnswer failure = MediaFailure{"no movie or sound"};

FileKey keyOf(std::uint64_t inode) {
    return {1, inode, 3, 4};
}

DayClock on(DayNumber day) {
    return [day] { return day; };
}

// Runs `work` in a child process, which succeeds when `work` answers true.
template <typename Work>
pid_t startChild(Work work) {
    const pid_t child = fork();
    if (child == 0)
        _exit(work() ? 0 : 1);
    return child;
}

bool succeeds(pid_t child) {
    int status = -1;
    return waitpid(child, &status, 0) == child && status == 0;
}

bool isRunning(pid_t child) {
    return waitpid(child, nullptr, WNOHANG) == 0;
}

// A number that child processes share with their parent.
class SharedNumber {
  public:
    SharedNumber() : number_(new (memory()) std::atomic<std::uint64_t>(0)) {}
    ~SharedNumber() { munmap(number_, sizeof *number_); }
    SharedNumber(const SharedNumber&) = delete;
    SharedNumber& operator=(const SharedNumber&) = delete;

    std::atomic<std::uint64_t>& operator*() { return *number_; }

  private:
    static void* memory() {
        void* page = mmap(nullptr, sizeof(std::atomic<std::uint64_t>), PROT_READ | PROT_WRITE,
                          MAP_SHARED | MAP_ANONYMOUS, -1, 0);
        if (page == MAP_FAILED)
            throw std::bad_alloc();
        return page;
    }

    std::atomic<std::uint64_t>* const number_;
};

// No file takes more bytes for the length of a scope.
class FullDisk {
  public:
    FullDisk() : handler_(signal(SIGXFSZ, SIG_IGN)) {
        getrlimit(RLIMIT_FSIZE, &before_);
        const rlimit none{1, before_.rlim_max};
        setrlimit(RLIMIT_FSIZE, &none);
    }
    ~FullDisk() {
        setrlimit(RLIMIT_FSIZE, &before_);
        signal(SIGXFSZ, handler_);
    }
    FullDisk(const FullDisk&) = delete;
    FullDisk& operator=(const FullDisk&) = delete;

  private:
    const sighandler_t handler_;
    rlimit before_{};
};

class MetadataIndexFile : public testing::Test {
  protected:
    bool exists(const std::string& name) const {
        return std::filesystem::exists(folder_.path("cache/" + name));
    }
    // The first value that the statements answer; empty for none.
    std::string runSql(const std::string& sql) const {
        sqlite3* database = nullptr;
        std::string answer;
        const auto keep = [](void* kept, int, char** values, char**) {
            static_cast<std::string*>(kept)->assign(values[0] ? values[0] : "");
            return 0;
        };
        EXPECT_EQ(sqlite3_open(path_.c_str(), &database), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(database, sql.c_str(), keep, &answer, nullptr), SQLITE_OK)
            << sqlite3_errmsg(database);
        sqlite3_close(database);
        return answer;
    }
    void expectSound() const {
        EXPECT_EQ(runSql("PRAGMA integrity_check"), "ok");
        EXPECT_FALSE(exists("metadata.sqlite.set-aside"));
    }
    // The inodes of what the index holds.
    std::string entries() const {
        return runSql("SELECT group_concat(inode, ' ') FROM (SELECT inode FROM files ORDER BY inode)");
    }
    std::string dayOf(std::uint64_t inode) const {
        return runSql("SELECT day FROM files WHERE inode = " + std::to_string(inode));
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
    for (int i = 0; i < processes; ++i)
        children.push_back(startChild([&] {
            MetadataIndex(path_).store({1, static_cast<std::uint64_t>(i), 3, 4}, movie);
            return true;
        }));
    for (const pid_t child : children)
        EXPECT_TRUE(succeeds(child));
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

TEST_F(MetadataIndexFile, ADatabaseOfAnOlderVersionIsEmptiedInPlace) {
    folder_.makeFolder("cache");
    runSql(
        "CREATE TABLE files (device INTEGER NOT NULL, inode INTEGER NOT NULL, size INTEGER NOT NULL,"
        " modified INTEGER NOT NULL, answer TEXT NOT NULL, PRIMARY KEY (device, inode)) WITHOUT ROWID;"
        "INSERT INTO files VALUES (1, 2, 3, 4, '{\"mediaTypes\":[\"Video\"]}'); PRAGMA user_version = 1");
    {
        MetadataIndex index(path_);
        EXPECT_EQ(index.path(), path_);
        EXPECT_EQ(index.find(key), std::nullopt);
        index.store(key, movie);
    }
    EXPECT_EQ(MetadataIndex(path_).find(key), movie);
    expectSound();
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
    for (const char* damage :
         {"mediaTypes = NULL", "mediaTypes = ''", "pixelWidth = -1", "pixelHeight = 'many'",
          "totalBitRate = 9e99", "durationSeconds = 'long'", "title = zeroblob(50000)",
          "title = CAST(x'ff' AS TEXT)", "failure = zeroblob(901)"}) {
        MetadataIndex(path_).store(key, movie);
        runSql(std::string("UPDATE files SET ") + damage);
        EXPECT_EQ(MetadataIndex(path_).find(key), std::nullopt) << damage;
    }
}

TEST_F(MetadataIndexFile, EveryPropertyReadsAsItWasWritten) {
    const MediaProperties all{{"Video", "Sound"},
                              1920,
                              1080,
                              12.5,
                              {"h264", "aac"},
                              -1230767999.5,
                              23.976,
                              2,
                              48000,
                              18'000'000,
                              "R\u00e4der \"am\" Flu\u00df",
                              "Camera",
                              "CW 100"};
    MetadataIndex(path_).store(key, all);
    EXPECT_EQ(MetadataIndex(path_).find(key), MediaReaderAnswer(all));
}

TEST_F(MetadataIndexFile, FilesThatWereMadeTogetherAreReadTogether) {
    fill(200);
    MetadataIndex index(path_);
    for (std::uint64_t i = 0; i < 200; ++i)
        EXPECT_EQ(index.find({1, i, 3, 4}), movie) << i;
    EXPECT_EQ(index.find({2, 7, 3, 4}), std::nullopt) << "on another device";
    EXPECT_EQ(index.find({1, 7, 3, 5}), std::nullopt) << "changed since";
}

TEST_F(MetadataIndexFile, WhatIsStoredBesideWhatWasReadIsFound) {
    fill(3);
    MetadataIndex index(path_);
    EXPECT_EQ(index.find({1, 0, 3, 4}), movie);
    MetadataIndex(path_).store({1, 5, 3, 4}, movie);
    EXPECT_EQ(index.find({1, 5, 3, 4}), movie) << "by another process";
    index.store({1, 0, 3, 4}, failure);
    EXPECT_EQ(index.find({1, 0, 3, 4}), failure) << "in place of what was read";
}

TEST_F(MetadataIndexFile, DamageAmongTheDaysIsFoundByPruning) {
    fill(3);
    runSql(
        "PRAGMA writable_schema = ON;"
        "UPDATE sqlite_schema SET rootpage = (SELECT rootpage FROM sqlite_schema WHERE name = 'files')"
        " WHERE name = 'pruning'");
    MetadataIndex index(path_);
    EXPECT_EQ(index.path(), path_);
    EXPECT_TRUE(exists("metadata.sqlite.set-aside"));
}

TEST_F(MetadataIndexFile, AHandleOnADamagedFileTakesUpTheOneThatReplacedIt) {
    fill(1000);
    MetadataIndex late(path_);
    for (const char* part : {"", "-wal", "-shm"})
        std::filesystem::rename(path_ + part, folder_.path("damaged") + part);
    MetadataIndex(path_).store(key, movie);
    std::fstream(folder_.path("damaged"), std::ios::in | std::ios::out) << std::string(60000, 'x');
    EXPECT_EQ(late.find(keyOf(500)), std::nullopt);
    EXPECT_EQ(late.find(key), movie);
    EXPECT_FALSE(exists("metadata.sqlite.set-aside"));
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

// --- How entries age

TEST_F(MetadataIndexFile, WhatIsNotUsedForLongGoes) {
    MetadataIndex(path_, on(0)).store(keyOf(1), movie);
    MetadataIndex(path_, on(10)).store(keyOf(2), movie);
    MetadataIndex(path_, on(IndexLimits().unusedDays));
    EXPECT_EQ(entries(), "1 2");
    MetadataIndex(path_, on(IndexLimits().unusedDays + 1));
    EXPECT_EQ(entries(), "2");
}

TEST_F(MetadataIndexFile, WhatIsUsedStays) {
    {
        MetadataIndex index(path_, on(0));
        index.store(keyOf(1), movie);
        index.store(keyOf(2), movie);
    }
    EXPECT_EQ(MetadataIndex(path_, on(300)).find(keyOf(2)), movie);
    MetadataIndex(path_, on(IndexLimits().unusedDays + 300));
    EXPECT_EQ(entries(), "2");
}

TEST_F(MetadataIndexFile, AnEntryIsNotedAsUsedOnceAWeek) {
    MetadataIndex(path_, on(100)).store(key, movie);
    MetadataIndex(path_, on(106)).find(key);
    EXPECT_EQ(dayOf(2), "100");
    MetadataIndex(path_, on(107)).find(key);
    EXPECT_EQ(dayOf(2), "107");
}

TEST_F(MetadataIndexFile, AnEntryOfAWrongClockIsPutRight) {
    MetadataIndex(path_, on(40000)).store(key, movie);
    MetadataIndex(path_, on(100)).find(key);
    EXPECT_EQ(dayOf(2), "100");
}

TEST_F(MetadataIndexFile, ManyUsesAreNotedBeforeTheIndexIsClosed) {
    {
        MetadataIndex index(path_, on(0));
        for (std::uint64_t i = 0; i < 1000; ++i)
            index.store(keyOf(i), movie);
    }
    MetadataIndex index(path_, on(100));
    index.find(keyOf(0));
    EXPECT_EQ(dayOf(0), "0");
    for (std::uint64_t i = 1; i < 1000; ++i)
        index.find(keyOf(i));
    EXPECT_EQ(dayOf(0), "100");
}

TEST_F(MetadataIndexFile, AnEntryThatIsFoundOverAndOverIsNotedOnce) {
    MetadataIndex(path_, on(0)).store(key, movie);
    {
        MetadataIndex index(path_, on(100));
        for (int i = 0; i < 1000; ++i)
            EXPECT_EQ(index.find(key), movie);
        EXPECT_EQ(dayOf(2), "0");
    }
    EXPECT_EQ(dayOf(2), "100");
}

TEST_F(MetadataIndexFile, AUseOfAnEarlierStateOfAFileIsNotTheFiles) {
    MetadataIndex(path_, on(0)).store(key, movie);
    std::unique_ptr<IndexTable> table;
    ASSERT_EQ(IndexTable::open(path_, table), IndexTable::Outcome::done);
    EXPECT_EQ(table->noteUse({{1, 2, 3, 99}, {1, 99, 3, 4}}, 50), IndexTable::Outcome::done);
    EXPECT_EQ(dayOf(2), "0");
    EXPECT_EQ(table->noteUse({key}, 50), IndexTable::Outcome::done);
    EXPECT_EQ(dayOf(2), "50");
}

TEST_F(MetadataIndexFile, IsPrunedOnceADay) {
    constexpr DayNumber late = 1000;
    MetadataIndex(path_, on(late)).store(key, movie);
    runSql("UPDATE files SET day = 1");
    { const MetadataIndex index(path_, on(late)); }
    EXPECT_EQ(entries(), "2");
    { const MetadataIndex index(path_, on(late + 1)); }
    EXPECT_EQ(entries(), "");
}

TEST_F(MetadataIndexFile, MuchThatCanGoGoesByAndBy) {
    std::unique_ptr<IndexTable> table;
    { const MetadataIndex index(path_, on(0)); }
    ASSERT_EQ(IndexTable::open(path_, table), IndexTable::Outcome::done);
    for (std::uint64_t i = 1; i <= 5; ++i)
        ASSERT_EQ(table->store(keyOf(i), movie, static_cast<DayNumber>(10 - i)), IndexTable::Outcome::done);
    const IndexLimits limits{.unusedDays = 10, .droppedAtOnce = 2};
    for (const char* left : {"1 2 3", "1", "", ""}) {
        ASSERT_EQ(table->prune(100, limits), IndexTable::Outcome::done);
        EXPECT_EQ(entries(), left);
    }
}

TEST_F(MetadataIndexFile, BeyondTheNumberOfEntriesTheLongestUnusedGo) {
    std::unique_ptr<IndexTable> table;
    { const MetadataIndex index(path_, on(0)); }
    ASSERT_EQ(IndexTable::open(path_, table), IndexTable::Outcome::done);
    for (std::uint64_t i = 1; i <= 6; ++i)
        ASSERT_EQ(table->store(keyOf(i), movie, i % 2 ? 50 : 60), IndexTable::Outcome::done);
    ASSERT_EQ(table->prune(60, {.entries = 3}), IndexTable::Outcome::done);
    EXPECT_EQ(entries(), "2 4 6");
}

TEST_F(MetadataIndexFile, HoldsNoMoreThanItsLimit) {
    { const MetadataIndex index(path_, on(0)); }
    const std::string limit = std::to_string(IndexLimits().entries);
    runSql("WITH RECURSIVE numbers (i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM numbers WHERE i < 10 + " +
           limit +
           ") INSERT INTO files (device, inode, size, modified, day) SELECT 1, i, 3, 4, 0 FROM "
           "numbers");
    { const MetadataIndex index(path_, on(1)); }
    EXPECT_EQ(runSql("SELECT COUNT(*) FROM files"), limit);
}

TEST_F(MetadataIndexFile, TidyingUpIsPutOffWhileAnotherProcessWrites) {
    MetadataIndex(path_, on(0)).store(key, movie);
    std::unique_ptr<IndexTable> table;
    ASSERT_EQ(IndexTable::open(path_, table), IndexTable::Outcome::done);
    sqlite3* other = nullptr;
    ASSERT_EQ(sqlite3_open(path_.c_str(), &other), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(other, "BEGIN IMMEDIATE", nullptr, nullptr, nullptr), SQLITE_OK);
    EXPECT_EQ(table->noteUse({key}, 50), IndexTable::Outcome::unavailable);
    EXPECT_EQ(table->prune(50, {}), IndexTable::Outcome::unavailable);
    sqlite3_close(other);
    EXPECT_EQ(table->prune(50, {}), IndexTable::Outcome::done);
}

// --- What befalls the file and the processes

TEST_F(MetadataIndexFile, AProcessThatIsKilledWhileItStoresLosesNothingItHadStored) {
    const auto seed = std::random_device{}();
    RecordProperty("seed", std::to_string(seed));
    SCOPED_TRACE("seed " + std::to_string(seed));
    std::mt19937 random(seed);
    SharedNumber stored;
    for (int kills = 0; kills < 40; ++kills) {
        const pid_t child = startChild([&] {
            MetadataIndex index(path_);
            for (;; ++*stored)
                index.store(keyOf(*stored), movie);
            return false;
        });
        // Now and then before the index is open.
        const std::uint64_t enough = *stored + random() % 8 * 100;
        while (*stored < enough && isRunning(child))
            sched_yield();
        for (unsigned turns = random() % 100'000; turns > 0; --turns)
            std::atomic_signal_fence(std::memory_order_seq_cst);
        kill(child, SIGKILL);
        waitpid(child, nullptr, 0);

        MetadataIndex index(path_);
        ASSERT_EQ(index.path(), path_);
        ASSERT_TRUE(*stored == 0 || index.find(keyOf(*stored - 1)) == movie) << *stored;
        expectSound();
    }
    MetadataIndex index(path_);
    for (std::uint64_t i = 0; i < *stored; ++i)
        ASSERT_EQ(index.find(keyOf(i)), movie) << i;
    EXPECT_GT(*stored, 0u);
}

TEST_F(MetadataIndexFile, ProcessesStoreFindAndPruneAtOnce) {
    constexpr std::uint64_t processes = 4, rounds = 10, files = 20;
    {
        MetadataIndex index(path_, on(0));
        for (std::uint64_t i = 0; i < 300; ++i)
            index.store({99, i, 3, 4}, movie);
    }
    const auto storeAndFind = [&](std::uint64_t process, std::uint64_t round) {
        MetadataIndex index(path_, on(static_cast<DayNumber>(1000 + 10 * round)));
        for (std::uint64_t file = 0; file < files; ++file) {
            index.store({process, round * files + file, 3, 4}, movie);
            if (index.find({process, file, 3, 4}) != movie)
                return false;
        }
        return true;
    };
    std::vector<pid_t> children;
    for (std::uint64_t process = 0; process < processes; ++process)
        children.push_back(startChild([&] {
            bool good = true;
            for (std::uint64_t round = 0; round < rounds && good; ++round)
                good = storeAndFind(process, round);
            return good;
        }));
    for (const pid_t child : children)
        EXPECT_TRUE(succeeds(child));
    { const MetadataIndex index(path_, on(1100)); }
    EXPECT_EQ(runSql("SELECT COUNT(*) FROM files WHERE device < 99"),
              std::to_string(processes * rounds * files));
    EXPECT_EQ(runSql("SELECT COUNT(*) FROM files WHERE device = 99"), "0");
    expectSound();
}

TEST_F(MetadataIndexFile, OnAFullDiskWhatIsKnownIsFound) {
    MetadataIndex index(path_);
    index.store(key, movie);
    std::optional<MediaReaderAnswer> found, stored;
    {
        const FullDisk full;
        index.store(keyOf(7), movie);
        stored = index.find(keyOf(7));
        found = index.find(key);
    }
    EXPECT_EQ(found, movie);
    EXPECT_EQ(stored, std::nullopt);
    EXPECT_EQ(index.path(), path_);
    index.store(keyOf(7), movie);
    EXPECT_EQ(MetadataIndex(path_).find(keyOf(7)), movie);
    expectSound();
}

TEST_F(MetadataIndexFile, LivesInMemoryWhereTheDiskIsFullFromTheBeginning) {
    folder_.makeFolder("cache");
    std::optional<MediaReaderAnswer> found;
    {
        const FullDisk full;
        MetadataIndex index(path_);
        index.store(key, movie);
        found = index.find(key);
        EXPECT_EQ(index.path(), "");
    }
    EXPECT_EQ(found, movie);
    EXPECT_EQ(MetadataIndex(path_).path(), path_);
    expectSound();
}

TEST_F(MetadataIndexFile, AFolderThatTurnsReadOnlyIsNoHindranceToWhoHasItOpen) {
    const OrdinaryUser user(folder_.path());
    {
        MetadataIndex index(path_);
        index.store(key, movie);
        ASSERT_EQ(chmod(folder_.path("cache").c_str(), 0500), 0);
        EXPECT_EQ(index.find(key), movie);
        index.store(keyOf(7), movie);
        EXPECT_EQ(index.find(keyOf(7)), movie);
    }
    ASSERT_EQ(chmod(folder_.path("cache").c_str(), 0700), 0);
    EXPECT_EQ(MetadataIndex(path_).find(keyOf(7)), movie);
    expectSound();
}

TEST_F(MetadataIndexFile, LivesInMemoryWhereTheFolderIsReadOnly) {
    const OrdinaryUser user(folder_.path());
    MetadataIndex(path_).store(key, movie);
    ASSERT_EQ(chmod(folder_.path("cache").c_str(), 0500), 0);
    {
        MetadataIndex index(path_);
        EXPECT_EQ(index.path(), "");
        index.store(keyOf(7), movie);
        EXPECT_EQ(index.find(keyOf(7)), movie);
    }
    ASSERT_EQ(chmod(folder_.path("cache").c_str(), 0700), 0);
    EXPECT_EQ(MetadataIndex(path_).find(key), movie);
    EXPECT_EQ(entries(), "2");
}

TEST_F(MetadataIndexFile, AFileThatMayOnlyBeReadIsFoundIn) {
    const OrdinaryUser user(folder_.path());
    MetadataIndex(path_, on(0)).store(key, movie);
    ASSERT_EQ(chmod(path_.c_str(), 0400), 0);
    {
        MetadataIndex index(path_, on(100));
        EXPECT_EQ(index.find(key), movie);
        index.store(keyOf(7), movie);
        EXPECT_EQ(index.find(keyOf(7)), std::nullopt);
    }
    ASSERT_EQ(chmod(path_.c_str(), 0600), 0);
    EXPECT_EQ(dayOf(2), "0");
    expectSound();
}

TEST_F(MetadataIndexFile, AFileDeletedWhileItIsOpenIsBegunAnewByTheNextAnswer) {
    MetadataIndex index(path_);
    index.store(key, movie);
    folder_.remove("cache");
    EXPECT_EQ(index.find(key), movie);
    index.store(keyOf(7), movie);
    EXPECT_EQ(MetadataIndex(path_).find(keyOf(7)), movie);
    EXPECT_EQ(index.path(), path_);
    EXPECT_EQ(entries(), "7");
    expectSound();
}

TEST_F(MetadataIndexFile, HandlesMeetAgainInAFileThatWasDeletedWhileBothHadItOpen) {
    MetadataIndex one(path_), other(path_);
    for (std::uint64_t i = 0; i < 50; ++i)
        one.store(keyOf(i), movie);
    folder_.remove("cache/metadata.sqlite");
    one.store(keyOf(100), movie);
    other.store(keyOf(101), movie);
    one.store(keyOf(102), movie);
    EXPECT_EQ(one.find(keyOf(101)), movie);
    EXPECT_EQ(other.find(keyOf(102)), movie);
    EXPECT_EQ(MetadataIndex(path_).find(keyOf(100)), movie);
    expectSound();
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
    // Then the home is that of the password database, as it is for libraries.
    for (const char* const noHome : {static_cast<const char*>(nullptr), "", "relative"}) {
        const ScopedEnvironment unusable("HOME", noHome);
        const auto known = platform::LinuxFileManager::userHomeDirectory();
        EXPECT_EQ(MetadataIndex::defaultPath(),
                  known ? std::optional(*known + "/.cache/vexo/metadata.sqlite") : std::nullopt);
    }
}
