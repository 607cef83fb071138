// A watcher against chance: after any row of changes, however they fall between its own steps, it has
// reported what differs and watches what exists.
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <thread>

#include "framework/pathwatcher/PackageName.h"
#include "framework/pathwatcher/WatchedPaths.h"
#include "platform/Path.h"
#include "tests/pathwatcher/ExpectedReports.h"
#include "tests/pathwatcher/FakeDisk.h"
#include "tests/pathwatcher/FakeMounts.h"
#include "tests/pathwatcher/FakePolling.h"
#include "tests/pathwatcher/RandomSource.h"
#include "tests/pathwatcher/WatcherTest.h"

using namespace testing_support;
using namespace vexo;

namespace fs = std::filesystem;
namespace path = platform::path;

namespace {

// Few names, so that they meet often.
std::string randomPathBelow(const std::string& folder, RandomSource& random) {
    static const std::vector<std::string> names{"a", "b", "c", "d.qnproject", "e.mov"};
    std::string path = folder;
    for (std::size_t depth = 1 + random.below(5); depth > 0; --depth)
        path = path::appending(path, random.among(names));
    return path;
}

std::set<std::string> relativeTo(const std::string& folder, const std::set<std::string>& paths) {
    std::set<std::string> relative;
    for (const std::string& path : paths)
        relative.insert(path == folder ? "" : path.substr(folder.size() + 1));
    return relative;
}

std::set<std::string> foldersOf(const Picture& picture) {
    std::set<std::string> folders;
    for (const auto& [folder, entries] : picture)
        folders.insert(folder);
    return folders;
}

void expectReports(const Picture& before, const Picture& after, const std::set<std::string>& reports) {
    for (const std::string& folder : foldersToReport(before, after))
        EXPECT_TRUE(reports.contains(folder)) << "folder '" << folder << "' was not reported";
    for (const std::string& file : filesToReport(before, after))
        EXPECT_TRUE(coversFile(reports, file)) << "file '" << file << "' was not reported";
}

// A disk in memory, whose changes also fall between the calls that the watcher makes.
class WalkOnFakeDisk {
  public:
    WalkOnFakeDisk() : paths_(seams()) {
        disk_.makeFolder("/home");
        disk_.makeFolder("/home/Movies");
        disk_.makeFolder("/tmp");
        paths_.add("/home/Movies");
        disk_.afterLook = [this] {
            if (isWalking_ && random.oneIn(3))
                change();
        };
    }

    // Some changes while the watcher takes in events now and then, and at last all.
    void walk() {
        isWalking_ = true;
        before_ = disk_.picture("/home/Movies");
        rootBefore_ = disk_.identityOf("/home/Movies");
        rootWasTouched_ = false;
        for (std::size_t i = random.below(60); i > 0; --i) {
            change();
            if (random.oneIn(4))
                paths_.takeEvents();
        }
        isWalking_ = false;
        while (disk_.queueLength() > 0)
            paths_.takeEvents();
    }

    void check() {
        const Picture after = disk_.picture("/home/Movies");
        const auto watched = paths_.watchedFolders();
        EXPECT_EQ(relativeTo("/home/Movies", {watched.begin(), watched.end()}), foldersOf(after));
        EXPECT_EQ(watched.size(), after.size()) << "a folder is watched twice";
        EXPECT_EQ(paths_.watchCount(), disk_.watchCount());
        std::set<std::string> reports;
        for (const auto& [watchedPath, changed] : paths_.burst().take())
            reports.insert(changed.begin(), changed.end());
        if (rootWasTouched_ && reports.contains("/home/Movies"))
            return;
        EXPECT_EQ(rootBefore_, disk_.identityOf("/home/Movies"));
        expectReports(before_, after, relativeTo("/home/Movies", reports));
    }

    RandomSource random;

  private:
    WatchSeams seams() {
        WatchSeams seams;
        seams.events = disk_.events();
        seams.folders = disk_.access();
        seams.mounts = std::make_unique<FakeMounts>(mounts_);
        seams.polling = std::make_unique<FakePolling>(looks_);
        seams.resolvedPath = [](const std::string& path) { return std::optional(path); };
        return seams;
    }

    void change() {
        if (random.oneIn(40))
            return changeRoot();
        const std::string place = randomPathBelow("/home/Movies", random);
        switch (random.below(8)) {
            case 0:
            case 1:
            case 2:
                disk_.makeFolder(place);
                break;
            case 3:
                disk_.makeFile(place);
                break;
            case 4:
                disk_.write(place);
                break;
            case 5:
                disk_.removeWithAllInIt(place);
                break;
            case 6:
                disk_.rename(place, randomPathBelow(random.oneIn(4) ? "/tmp" : "/home/Movies", random));
                break;
            default:
                disk_.rename(randomPathBelow("/tmp", random), place);
        }
    }
    void changeRoot() {
        static const std::vector<std::string> places{"/home", "/home/Movies", "/tmp/home", "/tmp/Movies"};
        const std::string from = random.among(places), to = random.among(places);
        const bool touches = disk_.rename(from, to) || disk_.makeFolder(random.among(places));
        rootWasTouched_ = rootWasTouched_ || touches;
    }

    FakeDisk disk_;
    FakeMounts::Table mounts_;
    FakePolling::Looks looks_;
    WatchedPaths paths_;
    bool isWalking_ = false;
    bool rootWasTouched_ = false;
    Picture before_;
    std::uint64_t rootBefore_ = 0;
};

}  // namespace

TEST(RandomWalk, OnAFakeDiskEveryChangeIsReportedAndEveryFolderWatched) {
    WalkOnFakeDisk walker;
    SCOPED_TRACE("VEXO_TEST_SEED=" + std::to_string(walker.random.seed()));
    for (int i = 0; i < 2000 && !testing::Test::HasFailure(); ++i) {
        SCOPED_TRACE("walk " + std::to_string(i));
        walker.walk();
        walker.check();
    }
}

namespace {

Picture pictureOfDisk(const std::string& folder) {
    Picture picture;
    std::vector<std::string> open{""};
    while (!open.empty()) {
        const std::string next = open.back();
        open.pop_back();
        auto& entries = picture[next];
        for (const auto& entry : fs::directory_iterator(path::appending(folder, next))) {
            struct stat status {};
            if (lstat(entry.path().c_str(), &status) != 0)
                continue;
            const bool isFolder = S_ISDIR(status.st_mode);
            const std::string name = entry.path().filename();
            entries[name] = {status.st_ino, static_cast<std::uint64_t>(status.st_size), isFolder};
            if (isFolder)
                open.push_back(path::appending(next, name));
        }
    }
    return picture;
}

// One change; impossible ones do nothing.
void changeDisk(const std::string& folder, const std::string& outside, RandomSource& random) {
    std::error_code impossible;
    const std::string place = randomPathBelow(folder, random);
    switch (random.below(8)) {
        case 0:
        case 1:
            fs::create_directories(place, impossible);
            break;
        case 2:
            fs::create_directory(place, impossible);
            break;
        case 3:
        case 4:
            if (!fs::is_directory(place, impossible))
                std::ofstream(place, std::ios::app) << "more";
            break;
        case 5:
            fs::remove_all(place, impossible);
            break;
        case 6:
            fs::rename(place, randomPathBelow(random.oneIn(4) ? outside : folder, random), impossible);
            break;
        default:
            fs::rename(randomPathBelow(outside, random), place, impossible);
    }
}

class RandomWalkOnDisk : public WatcherTest {
  protected:
    // Changes on a thread of their own, while this one takes the watcher's steps.
    void walk(std::size_t changes) {
        std::atomic<bool> isOver = false;
        std::thread walker([&] {
            for (std::size_t i = 0; i < changes; ++i)
                changeDisk(movies, outside.path(), random);
            isOver = true;
        });
        while (!isOver)
            step(std::chrono::milliseconds(1));
        walker.join();
        settle();
    }

    void check(const Picture& before) {
        const Picture after = pictureOfDisk(movies);
        const auto watched = follower().watchedFolders();
        EXPECT_EQ(relativeTo(movies, {watched.begin(), watched.end()}), foldersOf(after));
        EXPECT_EQ(watched.size(), after.size()) << "a folder is watched twice";
        expectReports(before, after, relativeTo(movies, observer->paths()));
    }

    RandomSource random;
    const TemporaryFolder outside;
    const std::string movies = folder.makeFolder("Movies");
};

}  // namespace

TEST_F(RandomWalkOnDisk, EveryChangeIsReportedAndEveryFolderWatched) {
    SCOPED_TRACE("VEXO_TEST_SEED=" + std::to_string(random.seed()));
    watch(movies);
    for (int i = 0; i < 20 && !HasFailure(); ++i) {
        SCOPED_TRACE("walk " + std::to_string(i));
        const Picture before = pictureOfDisk(movies);
        observer->calls.clear();
        walk(random.below(400));
        check(before);
    }
}
