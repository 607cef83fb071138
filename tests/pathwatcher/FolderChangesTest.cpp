// What is reported of changes below a watched folder, with the kernel's own events.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <climits>
#include <filesystem>
#include <fstream>
#include <thread>

#include "framework/pathwatcher/WatchLimits.h"
#include "platform/linux/FileDescriptor.h"
#include "tests/pathwatcher/WatcherTest.h"
#include "tests/support/LoopImage.h"

using namespace testing_support;
using testing::ElementsAre;

namespace fs = std::filesystem;

namespace {

using FolderChanges = WatcherTest;

void appendTo(const std::string& path) {
    std::ofstream(path, std::ios::app) << "more";
}

void renameAt(const std::string& from, const std::string& to) {
    ASSERT_EQ(rename(from.c_str(), to.c_str()), 0) << from << " to " << to;
}

}  // namespace

TEST_F(FolderChanges, AFileThatAppearsIsAChangeOfItsFolderAndOfItsContent) {
    const std::string sub = folder.makeFolder("sub");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { folder.writeFile("sub/new.txt", "text"); }),
              (Paths{sub, folder.path("sub/new.txt")}));
}

TEST_F(FolderChanges, AFileThatVanishesIsAChangeOfItsFolder) {
    const std::string file = folder.writeFile("sub/old.txt");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { fs::remove(file); }), Paths{folder.path("sub")});
}

TEST_F(FolderChanges, AFileThatIsRenamedIsAChangeOfBothFolders) {
    const std::string file = folder.writeFile("from/a.txt");
    folder.makeFolder("to");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { renameAt(file, folder.path("to/b.txt")); }),
              (Paths{folder.path("from"), folder.path("to")}));
}

TEST_F(FolderChanges, AttributesAreAChangeOfTheFolderAroundThem) {
    const std::string file = folder.writeFile("sub/a.txt");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { chmod(file.c_str(), 0600); }), Paths{folder.path("sub")});
    EXPECT_EQ(reportsOf([&] { setExtendedAttribute(file, "user.date", "2008"); }), Paths{folder.path("sub")});
    EXPECT_EQ(reportsOf([&] { setExtendedAttribute(folder.path("sub"), "user.date", "2008"); }),
              Paths{folder.path()});
}

TEST_F(FolderChanges, ContentIsAChangeOfTheFile) {
    const std::string file = folder.writeFile("sub/clip.mov", "a"), text = folder.writeFile("sub/a.txt");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { appendTo(file); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { appendTo(text); }), Paths{text});
}

TEST_F(FolderChanges, AFileThatIsWrittenAgainAndAgainIsReportedOnceInEachBurst) {
    const std::string file = folder.writeFile("one/a.mov"), namesake = folder.writeFile("two/a.mov");
    watch(folder.path());
    for (int burst = 0; burst < 3; ++burst) {
        EXPECT_EQ(reportsOf([&] {
                      appendTo(file);
                      appendTo(file);
                  }),
                  Paths{file});
    }
    EXPECT_EQ(reportsOf([&] {
                  appendTo(file);
                  appendTo(namesake);
                  appendTo(file);
              }),
              (Paths{file, namesake}));
}

TEST_F(FolderChanges, ContentThatTellsOfOtherFilesIsAChangeOfTheFolder) {
    const std::string hidden = folder.writeFile("sub/.hidden", "a.mov\n");
    const std::string attributes = folder.writeFile("other/._a.mov", "dates");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { appendTo(hidden); }), Paths{folder.path("sub")});
    EXPECT_EQ(reportsOf([&] { appendTo(attributes); }), Paths{folder.path("other")});
}

TEST_F(FolderChanges, AFileThatReplacesAnotherIsAChangeOfTheFolder) {
    const std::string file = folder.writeFile("sub/clip.mov", "a");
    const std::string replacement = folder.writeFile("sub/.clip.mov.tmp", "b");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { renameAt(replacement, file); }), Paths{folder.path("sub")});
}

TEST_F(FolderChanges, AnythingInAPackageIsAChangeOfTheOutermostPackage) {
    const std::string package = folder.path("Library/Holiday.qnproject");
    const std::string document = folder.writeFile("Library/Holiday.qnproject/Contents/document", "a");
    folder.makeFolder("Library/Holiday.qnproject/Inner.qnproject/deep");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { appendTo(document); }), Paths{package});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Library/Holiday.qnproject/Contents/new/newer"); }),
              Paths{package});
    EXPECT_EQ(reportsOf([&] { folder.writeFile("Library/Holiday.qnproject/Inner.qnproject/deep/x"); }),
              Paths{package});
    EXPECT_EQ(reportsOf([&] { chmod(document.c_str(), 0600); }), Paths{package});
}

TEST_F(FolderChanges, TheContentOfAMovieInAPackageIsAChangeOfTheMovie) {
    const std::string movie = folder.writeFile("Holiday.qnproject/Movies/large.mov", "a");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { appendTo(movie); }), Paths{movie});
    EXPECT_EQ(reportsOf([&] { fs::remove(movie); }), Paths{folder.path("Holiday.qnproject")});
}

TEST_F(FolderChanges, APackageThatComesOrGoesIsAChangeOfTheFolderAroundIt) {
    folder.makeFolder("Library");
    watch(folder.path());
    const std::string package = folder.path("Library/Holiday.qnproject");
    EXPECT_EQ(reportsOf([&] { fs::create_directory(package); }), Paths{folder.path("Library")});
    EXPECT_EQ(reportsOf([&] { fs::remove(package); }), Paths{folder.path("Library")});
}

TEST_F(FolderChanges, TheWatchedFolderItselfIsNoPackage) {
    const std::string package = folder.makeFolder("Holiday.qnproject");
    folder.makeFolder("Holiday.qnproject/sub");
    watch(package);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Holiday.qnproject/sub/x"); }), Paths{package + "/sub"});
}

TEST_F(FolderChanges, AFolderThatIsRenamedToAPackageIsOne) {
    const std::string sub = folder.makeFolder("sub");
    folder.makeFolder("sub/deep");
    watch(folder.path());
    renameAt(sub, folder.path("sub.qnproject"));
    settle();
    EXPECT_EQ(reportsOf([&] { folder.writeFile("sub.qnproject/deep/x"); }),
              Paths{folder.path("sub.qnproject")});
}

TEST_F(FolderChanges, ATreeThatIsMadeAtOnceIsSeenToItsBottom) {
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { folder.writeFile("a/b/c/d/e/f/g/bottom.mov"); }),
              (Paths{folder.path(), folder.path("a"), folder.path("a/b"), folder.path("a/b/c"),
                     folder.path("a/b/c/d"), folder.path("a/b/c/d/e"), folder.path("a/b/c/d/e/f"),
                     folder.path("a/b/c/d/e/f/g")}));
    EXPECT_EQ(reportsOf([&] { appendTo(folder.path("a/b/c/d/e/f/g/bottom.mov")); }),
              Paths{folder.path("a/b/c/d/e/f/g/bottom.mov")});
}

TEST_F(FolderChanges, AFolderIsFollowedToWhereItIsMoved) {
    folder.makeFolder("from/moved/deep");
    folder.makeFolder("to");
    watch(folder.path());
    EXPECT_THAT(reportsOf([&] { renameAt(folder.path("from/moved"), folder.path("to/moved")); }),
                testing::IsSupersetOf({folder.path("from"), folder.path("to")}));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("to/moved/deep/x"); }), Paths{folder.path("to/moved/deep")});
    EXPECT_THAT(follower().watchedFolders(),
                testing::UnorderedElementsAre(folder.path(), folder.path("from"), folder.path("to"),
                                              folder.path("to/moved"), folder.path("to/moved/deep"),
                                              folder.path("to/moved/deep/x")));
}

TEST_F(FolderChanges, AFolderThatIsMovedOutIsLeftAlone) {
    const TemporaryFolder elsewhere;
    folder.makeFolder("moved/deep");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { renameAt(folder.path("moved"), elsewhere.path("moved")); }),
              Paths{folder.path()});
    EXPECT_EQ(reportsOf([&] { elsewhere.writeFile("moved/deep/x"); }), Paths{});
    EXPECT_THAT(follower().watchedFolders(), ElementsAre(folder.path()));
}

TEST_F(FolderChanges, AFolderThatIsMovedInIsWatchedWithAllInIt) {
    const TemporaryFolder elsewhere;
    elsewhere.makeFolder("moved/deep");
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { renameAt(elsewhere.path("moved"), folder.path("moved")); }),
              (Paths{folder.path(), folder.path("moved")}));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("moved/deep/x"); }), Paths{folder.path("moved/deep")});
}

TEST_F(FolderChanges, FoldersThatTradePlacesAreBothWatched) {
    folder.makeFolder("a/inA");
    folder.makeFolder("b/inB");
    watch(folder.path());
    ASSERT_EQ(
        renameat2(AT_FDCWD, folder.path("a").c_str(), AT_FDCWD, folder.path("b").c_str(), RENAME_EXCHANGE),
        0);
    settle();
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/inB/x"); }), Paths{folder.path("a/inB")});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("b/inA/x"); }), Paths{folder.path("b/inA")});
}

TEST_F(FolderChanges, LinksAreNotEntered) {
    const TemporaryFolder elsewhere;
    folder.makeLink("elsewhere", elsewhere.path());
    folder.makeFolder("sub");
    folder.makeLink("sub/loop", folder.path());
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { elsewhere.writeFile("x"); }), Paths{});
    EXPECT_EQ(reportsOf([&] { folder.makeLink("sub/another", folder.path()); }), Paths{folder.path("sub")});
    EXPECT_THAT(follower().watchedFolders(),
                testing::UnorderedElementsAre(folder.path(), folder.path("sub")));
}

TEST_F(FolderChanges, NamesMayHoldAnyBytes) {
    const std::string name = "odd \xff\x01\n\"name";
    folder.makeFolder(name);
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] { folder.makeFolder(name + "/x"); }), Paths{folder.path(name)});
}

TEST_F(FolderChanges, AThousandFilesInAFolderAreOneReportOfIt) {
    const std::string sub = folder.makeFolder("sub");
    for (int i = 0; i < 1000; ++i)
        folder.writeFile("sub/" + std::to_string(i));
    watch(folder.path());
    for (int i = 0; i < 1000; ++i)
        fs::remove(sub + "/" + std::to_string(i));
    settle();
    EXPECT_THAT(observer->calls, ElementsAre(sub));
}

TEST_F(FolderChanges, WhatEndsAtTheSameTimeAsItBeginsIsReported) {
    watch(folder.path());
    EXPECT_EQ(reportsOf([&] {
                  folder.makeFolder("short/lived");
                  fs::remove_all(folder.path("short"));
              }),
              Paths{folder.path()});
    EXPECT_THAT(follower().watchedFolders(), ElementsAre(folder.path()));
}

TEST_F(FolderChanges, AFolderThatIsFilledWhileItIsRenamedIsWatchedWhole) {
    std::string name = folder.makeFolder("0");
    watch(folder.path());
    const platform::FileDescriptor filled(open(name.c_str(), O_RDONLY | O_DIRECTORY));
    std::atomic<bool> isFull = false;
    std::thread filler([&] {
        for (int i = 0; i < 100; ++i) {
            const std::string sub = std::to_string(i);
            mkdirat(filled.number(), sub.c_str(), 0700);
            mkdirat(filled.number(), (sub + "/deep").c_str(), 0700);
        }
        isFull = true;
    });
    for (int i = 1; !isFull; ++i) {
        const std::string next = folder.path(std::to_string(i));
        renameAt(name, next);
        name = next;
        step(std::chrono::milliseconds(0));
    }
    filler.join();
    settle();
    EXPECT_EQ(follower().watchedFolders().size(), 202u);
    EXPECT_EQ(reportsOf([&] { fs::create_directory(name + "/99/deep/x"); }), Paths{name + "/99/deep"});
}

TEST_F(FolderChanges, WhenTheQueueRunsOverTheWatchedFolderIsReportedAndWatchedAnew) {
    const auto limit = vexo::readWatchLimits().maxQueuedEvents;
    if (!limit || *limit > 100'000)
        GTEST_SKIP() << "the queue is too long to fill";
    const std::string one = folder.writeFile("sub/1"), other = folder.path("sub/2");
    watch(folder.path());
    for (std::int64_t i = 0; i < *limit; ++i)
        ASSERT_EQ(i % 2 == 0 ? rename(one.c_str(), other.c_str()) : rename(other.c_str(), one.c_str()), 0);
    folder.makeFolder("unseen/deep");
    settle();
    EXPECT_THAT(observer->paths(), testing::Contains(folder.path()));
    EXPECT_THAT(warnings, ElementsAre(testing::HasSubstr("faster than they could be taken in")));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("unseen/deep/x"); }), Paths{folder.path("unseen/deep")});
}

// Giving up each of its folders is an event of its own, and together they are more than the queue holds. In
// memory, because some disks take minutes to remove that many.
TEST_F(FolderChanges, WhatWaitsBehindAHugeFolderThatGoesIsNotLost) {
    constexpr int folders = 17'000, renames = 4'500;
    const vexo::WatchLimits limits = vexo::readWatchLimits();
    if (limits.maxUserWatches < 2 * folders || limits.maxQueuedEvents < 3 * renames)
        GTEST_SKIP() << "too little may be watched";
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const ScopedMount memory = ScopedMount::memory(folder.makeFolder("memory"));
    const std::string movies = folder.makeFolder("memory/Movies"),
                      huge = folder.makeFolder("memory/Movies/huge");
    for (int i = 0; i < folders; ++i)
        ASSERT_EQ(mkdir((huge + "/" + std::to_string(i)).c_str(), 0700), 0);
    const std::string one = folder.writeFile("memory/Movies/1"), other = movies + "/2",
                      late = movies + "/late";
    watch(movies);
    renameAt(huge, folder.path("memory/huge"));
    for (int i = 0; i < renames; ++i)  // more than is read at once
        ASSERT_EQ(i % 2 == 0 ? rename(one.c_str(), other.c_str()) : rename(other.c_str(), one.c_str()), 0);
    fs::create_directory(late);
    settle();
    EXPECT_THAT(follower().watchedFolders(), testing::UnorderedElementsAre(movies, late));
    EXPECT_EQ(reportsOf([&] { fs::create_directory(late + "/x"); }), Paths{late});
    EXPECT_THAT(warnings, ElementsAre());
}

TEST_F(FolderChanges, FoldersDeeperThanAPathCanBeHarmNobody) {
    const std::string name(200, 'x');
    watch(folder.path());
    platform::FileDescriptor deepest(open(folder.path().c_str(), O_RDONLY | O_DIRECTORY));
    for (int i = 0; i < 30; ++i) {
        ASSERT_EQ(mkdirat(deepest.number(), name.c_str(), 0700), 0);
        deepest = platform::FileDescriptor(openat(deepest.number(), name.c_str(), O_RDONLY | O_DIRECTORY));
    }
    settle();
    EXPECT_EQ(follower().watchedFolders().size(),
              1 + (PATH_MAX - 1 - folder.path().size()) / (name.size() + 1));
    EXPECT_EQ(reportsOf([&] { fs::rename(folder.path(name), folder.path("moved")); }).count(folder.path()),
              1u);
    fs::remove_all(folder.path("moved"));
    settle();
    EXPECT_THAT(follower().watchedFolders(), ElementsAre(folder.path()));
}
