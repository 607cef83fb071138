// What is reported when a watched path itself comes, goes, or begins to lead elsewhere.
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "tests/pathwatcher/WatcherTest.h"
#include "tests/support/OrdinaryUser.h"

using namespace testing_support;
using testing::ElementsAre;

namespace fs = std::filesystem;

namespace {

using PathsOnDisk = WatcherTest;

}  // namespace

TEST_F(PathsOnDisk, APathThatAppearsWithAllAboveItIsFound) {
    const std::string path = folder.path("a/b/Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies/deep"); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies/deep/x"); }), Paths{path + "/deep"});
}

TEST_F(PathsOnDisk, APathThatAppearsStepByStepIsFound) {
    const std::string path = folder.path("a/b/Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a"); }), Paths{});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b"); }), Paths{});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies"); }), Paths{path});
}

TEST_F(PathsOnDisk, AFolderThatVanishesAndComesBackIsReportedBothTimes) {
    const std::string path = folder.makeFolder("Movies");
    folder.makeFolder("Movies/sub");
    watch(path);
    EXPECT_THAT(reportsOf([&] { fs::remove_all(path); }), testing::Contains(path));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Movies/sub"); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Movies/sub/x"); }), Paths{path + "/sub"});
}

TEST_F(PathsOnDisk, AFolderThatIsReplacedAtOnceIsReported) {
    const std::string path = folder.makeFolder("Movies");
    folder.makeFolder("other/inOther");
    watch(path);
    EXPECT_EQ(reportsOf([&] {
                  fs::rename(path, folder.path("old"));
                  fs::rename(folder.path("other"), path);
              }),
              Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Movies/inOther/x"); }), Paths{path + "/inOther"});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("old/x"); }), Paths{});
}

TEST_F(PathsOnDisk, AParentThatIsRenamedAwayAndBackTakesThePathAlong) {
    const std::string path = folder.makeFolder("a/b/Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] { fs::rename(folder.path("a"), folder.path("away")); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("away/b/Movies/meanwhile"); }), Paths{});
    EXPECT_EQ(reportsOf([&] { fs::rename(folder.path("away"), folder.path("a")); }), Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies/meanwhile/x"); }), Paths{path + "/meanwhile"});
}

TEST_F(PathsOnDisk, WhatHappensWhileAParentIsAwayForAMomentIsReported) {
    const std::string path = folder.makeFolder("a/b/Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] {
                  fs::rename(folder.path("a"), folder.path("away"));
                  folder.makeFolder("away/b/Movies/meanwhile");
                  fs::rename(folder.path("away"), folder.path("a"));
              }),
              Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies/meanwhile/x"); }), Paths{path + "/meanwhile"});
}

TEST_F(PathsOnDisk, AParentThatIsDeletedTakesThePathAlong) {
    const std::string path = folder.makeFolder("a/b/Movies");
    watch(path);
    EXPECT_THAT(reportsOf([&] { fs::remove_all(folder.path("a")); }), testing::Contains(path));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("a/b/Movies"); }), Paths{path});
}

TEST_F(PathsOnDisk, ReportsBelowALinkAreNamedByTheLink) {
    const std::string target = folder.makeFolder("target/sub");
    const std::string link = folder.makeLink("Movies", folder.path("target"));
    watch(link);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("target/sub/x"); }), Paths{link + "/sub"});
}

TEST_F(PathsOnDisk, ALinkThatIsSetToAnotherFolderIsFollowedThere) {
    folder.makeFolder("one");
    folder.makeFolder("two/sub");
    const std::string link = folder.makeLink("Movies", "one");
    watch(link);
    EXPECT_EQ(reportsOf([&] {
                  const std::string replacement = folder.makeLink("replacement", "two");
                  fs::rename(replacement, link);
              }),
              Paths{link});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("one/x"); }), Paths{});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("two/sub/x"); }), Paths{link + "/sub"});
}

TEST_F(PathsOnDisk, ALinkOnTheWayThatIsSetElsewhereIsFollowed) {
    folder.makeFolder("one/Movies");
    folder.makeFolder("two/Movies/sub");
    const std::string link =
        folder.makeLink("library", "./../" + fs::path(folder.path()).filename().string() + "/one");
    const std::string path = link + "/Movies";
    watch(path);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("one/Movies/x"); }), Paths{path});
    EXPECT_EQ(reportsOf([&] {
                  fs::remove(link);
                  folder.makeLink("library", folder.path("two"));
              }),
              Paths{path});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("two/Movies/sub/x"); }), Paths{path + "/sub"});
}

TEST_F(PathsOnDisk, ALinkToNowhereIsFoundToLeadSomewhereOnceItDoes) {
    const std::string link = folder.makeLink("Movies", folder.path("later/target"));
    watch(link);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("later/target"); }), Paths{link});
}

TEST_F(PathsOnDisk, LinksInACircleLeadNowhere) {
    const std::string link = folder.makeLink("one", "two");
    folder.makeLink("two", "one");
    watch(link);
    EXPECT_EQ(reportsOf([&] { fs::remove(folder.path("two")); }), Paths{});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("two"); }), Paths{link});
}

TEST_F(PathsOnDisk, AWatchedFileIsReportedForAllThatHappensToIt) {
    const std::string file = folder.writeFile("preferences/suite.plist", "a");
    const std::string other = folder.writeFile("preferences/other.plist", "a");
    watch(file);
    EXPECT_EQ(reportsOf([&] { std::ofstream(file, std::ios::app) << "more"; }), Paths{file});
    EXPECT_EQ(reportsOf([&] { chmod(file.c_str(), 0600); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { fs::rename(folder.writeFile("preferences/.new", "b"), file); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { fs::remove(file); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { folder.writeFile("preferences/suite.plist", "c"); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { std::ofstream(other, std::ios::app) << "more"; }), Paths{});
}

TEST_F(PathsOnDisk, AWatchedFileIsFoundWhenItsFolderAppears) {
    const std::string file = folder.path("config/suite.plist");
    watch(file);
    EXPECT_EQ(reportsOf([&] { folder.writeFile("config/suite.plist", "a"); }), Paths{file});
    EXPECT_EQ(reportsOf([&] { std::ofstream(file, std::ios::app) << "more"; }), Paths{file});
}

TEST_F(PathsOnDisk, TheTargetOfALinkToAFileIsTheFile) {
    const std::string target = folder.writeFile("real/suite.plist", "a");
    const std::string link = folder.makeLink("suite.plist", target);
    watch(link);
    EXPECT_EQ(reportsOf([&] { std::ofstream(target, std::ios::app) << "more"; }), Paths{link});
}

TEST_F(PathsOnDisk, AFolderThatBecomesAFileIsReportedAndThenWatchedAsOne) {
    const std::string path = folder.makeFolder("Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] {
                  fs::remove(path);
                  folder.writeFile("Movies", "a");
              }),
              Paths{path});
    EXPECT_EQ(reportsOf([&] { std::ofstream(path, std::ios::app) << "more"; }), Paths{path});
}

TEST_F(PathsOnDisk, TheAttributesOfTheFolderAreItsOwnChange) {
    const std::string path = folder.makeFolder("Movies");
    watch(path);
    EXPECT_EQ(reportsOf([&] { chmod(path.c_str(), 0700); }), Paths{path});
}

TEST_F(PathsOnDisk, AFolderThatMayNotBeReadIsWatchedOnceItMay) {
    const std::string path = folder.makeFolder("Movies/sub");
    const OrdinaryUser user(folder.path());
    const std::string own = folder.makeFolder("Own/sub");
    chmod(folder.path("Own").c_str(), 0000);
    watch(folder.path("Own"));
    EXPECT_THAT(stateOf(folder.path("Own")),
                "none: " + folder.path("Own") + " cannot be watched: Permission denied");
    EXPECT_EQ(reportsOf([&] { chmod(folder.path("Own").c_str(), 0700); }), Paths{folder.path("Own")});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Own/sub/x"); }), Paths{own});
}

TEST_F(PathsOnDisk, AFolderBelowThatMayNotBeReadIsWatchedOnceItMay) {
    const OrdinaryUser user(folder.path());
    const std::string sub = folder.makeFolder("sub/deep");
    chmod(folder.path("sub").c_str(), 0000);
    watch(folder.path());
    EXPECT_THAT(reportsOf([&] { chmod(folder.path("sub").c_str(), 0700); }),
                testing::Contains(folder.path()));
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("sub/deep/x"); }), Paths{sub});
}

TEST_F(PathsOnDisk, APathBelowAFolderThatMayNotBeReadIsPolled) {
    const OrdinaryUser user(folder.path());
    folder.makeFolder("dark");
    chmod(folder.path("dark").c_str(), 0300);
    const std::string path = folder.path("dark/Movies");
    watch(path);
    EXPECT_EQ(stateOf(path), "polling: does not exist; looked at every 0 s");
    fs::create_directories(path + "/sub");
    EXPECT_TRUE(settleUntil([&] { return observer->paths() == Paths{path}; }));
    EXPECT_EQ(reportsOf([&] { fs::create_directory(path + "/sub/x"); }), Paths{path + "/sub"});
}

TEST_F(PathsOnDisk, TwoPathsToOneFolderAreBothReported) {
    const std::string path = folder.makeFolder("Movies");
    const std::string link = folder.makeLink("link", "Movies");
    watch(path);
    watch(link);
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Movies/x"); }), (Paths{path, link}));
    EXPECT_EQ(reportsOf([&] { fs::remove(link); }), Paths{link});
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("Movies/y"); }), Paths{path});
}

TEST_F(PathsOnDisk, WhatSeveralRegistrationsCoverIsReportedOnce) {
    const std::string path = folder.makeFolder("Movies/sub");
    watch(folder.path());
    watch(folder.path("Movies"));
    watch(path);
    folder.makeFolder("Movies/sub/x");
    settle();
    EXPECT_THAT(observer->calls, ElementsAre(path));
}

TEST_F(PathsOnDisk, PathsThatAreNotAbsoluteAreLeftAlone) {
    watch("XXX");
    watch("");
    EXPECT_EQ(stateOf("XXX"), "none: it is no absolute path");
}

TEST_F(PathsOnDisk, TheStateOfAPathSaysHowItIsWatched) {
    const std::string path = folder.makeFolder("Movies/sub");
    const std::string missing = folder.path("later/Movies"), file = folder.writeFile("suite.plist");
    watch(folder.path("Movies"));
    watch(missing);
    watch(file);
    EXPECT_EQ(stateOf(path), "events: watched through " + folder.path("Movies"));
    EXPECT_EQ(stateOf(missing), "events: does not exist; " + folder.path() + " is watched for it");
    EXPECT_EQ(stateOf(missing + "/x"),
              "events: " + missing + " does not exist; " + folder.path() + " is watched for it");
    EXPECT_EQ(stateOf(file), "events: watched through " + folder.path());
    EXPECT_EQ(stateOf(folder.path("other")), "none: nobody watches it");
}

TEST_F(PathsOnDisk, APathThatNobodyWantsAnyMoreIsGivenUp) {
    const std::string path = folder.makeFolder("Movies");
    watch(path);
    EXPECT_THAT(follower().watchedFolders(), ElementsAre(path));
    observer = std::make_shared<RecordingObserver>();
    folder.makeFolder("Movies/x");
    settle();
    EXPECT_THAT(follower().watchedFolders(), ElementsAre());
}
