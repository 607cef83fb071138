#include "framework/pathwatcher/PolledTree.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "tests/support/TemporaryFolder.h"

using namespace testing_support;
using namespace vexo;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

namespace fs = std::filesystem;

namespace {

class PolledTreeTest : public testing::Test {
  protected:
    PolledPlace place(PolledPlace::Depth depth = PolledPlace::Depth::tree) const {
        PolledPlace place;
        place.path = folder_.path("place");
        place.depth = depth;
        place.reportedPath = "/Movies";
        return place;
    }
    PolledTree polled(PolledPlace::Depth depth = PolledPlace::Depth::tree) const {
        return PolledTree(place(depth));
    }
    // The folder is called /Movies in reports.
    std::vector<std::string> changes(PolledTree& tree) { return tree.look(stopped_); }

    std::string write(const std::string& name, const std::string& content = "") {
        return folder_.writeFile("place/" + name, content);
    }

    const TemporaryFolder folder_;
    std::atomic<bool> stopped_ = false;
};

}  // namespace

TEST_F(PolledTreeTest, TheFirstLookReportsThePlaceAndTheNextNothing) {
    write("a/b/c");
    PolledTree tree = polled();
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
    EXPECT_THAT(changes(tree), ElementsAre());
}

TEST_F(PolledTreeTest, APlaceThatWasAwayIsReportedThoughNothingInItChanged) {
    using namespace std::chrono_literals;
    write("file");
    std::chrono::steady_clock::time_point now;
    auto away = 0s;
    PolledTree tree(place(), [&] { return now += away; });
    changes(tree);
    away = 9s;
    EXPECT_THAT(changes(tree), ElementsAre());
    away = 10s;
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
    away = 0s;
    EXPECT_THAT(changes(tree), ElementsAre());
}

TEST_F(PolledTreeTest, AChangeIsReportedForItsFolderAlone) {
    const std::string file = write("a/b/file", "x");
    write("a/c/file");
    PolledTree tree = polled();
    changes(tree);
    write("a/b/new");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a/b"));
    std::ofstream(file, std::ios::app) << "more";
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a/b"));
    chmod(file.c_str(), 0600);
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a/b"));
    fs::rename(file, folder_.path("place/a/c/moved"));
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a/b", "/Movies/a/c"));
    fs::remove_all(folder_.path("place/a/c"));
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a"));
}

TEST_F(PolledTreeTest, NewFoldersAreReportedDownToTheirBottom) {
    write("a");
    PolledTree tree = polled();
    changes(tree);
    write("new/newer/file");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies", "/Movies/new", "/Movies/new/newer"));
    folder_.makeFolder("place/empty");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
}

TEST_F(PolledTreeTest, AChangeInAPackageIsReportedForTheOutermostOne) {
    write("a/Holiday.qnproject/Contents/Inner.qnproject/document");
    PolledTree tree = polled();
    changes(tree);
    write("a/Holiday.qnproject/Contents/Inner.qnproject/new");
    write("a/Holiday.qnproject/Contents/new");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a/Holiday.qnproject"));
}

TEST_F(PolledTreeTest, APlaceThatComesAndGoesIsReportedItself) {
    PolledTree tree = polled();
    changes(tree);
    write("a/file");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
    fs::remove_all(folder_.path("place"));
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
    EXPECT_THAT(changes(tree), ElementsAre());
}

TEST_F(PolledTreeTest, AFileIsReportedItself) {
    const std::string file = folder_.writeFile("place", "x");
    PolledTree tree = polled();
    changes(tree);
    std::ofstream(file, std::ios::app) << "more";
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
}

TEST_F(PolledTreeTest, APlaceThatIsLookedAtByItselfIsNotEntered) {
    write("a/file");
    PolledTree tree = polled(PolledPlace::Depth::itself);
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
    write("a/new");
    EXPECT_THAT(changes(tree), ElementsAre());
    fs::rename(folder_.path("place"), folder_.path("old"));
    folder_.makeFolder("place");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies"));
}

TEST_F(PolledTreeTest, LinksBelowThePlaceAreNotEntered) {
    write("a/file");
    folder_.makeLink("place/loop", folder_.path("place"));
    PolledTree tree = polled();
    changes(tree);
    write("a/new");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/a"));
}

TEST_F(PolledTreeTest, ExcludedFoldersAreLeftOut) {
    write("mounted/file");
    PolledPlace place;
    place.path = folder_.path("place");
    place.reportedPath = "/Movies";
    place.excluded = {folder_.path("place/mounted")};
    PolledTree tree(place);
    changes(tree);
    write("mounted/new");
    EXPECT_THAT(changes(tree), ElementsAre());
}

TEST_F(PolledTreeTest, EverythingInAPlaceInAPackageIsAChangeOfThePackage) {
    write("a/file");
    PolledPlace place;
    place.path = folder_.path("place");
    place.reportedPath = "/Movies/Holiday.qnproject/Contents";
    place.package = "/Movies/Holiday.qnproject";
    PolledTree tree(place);
    changes(tree);
    write("a/new");
    EXPECT_THAT(changes(tree), ElementsAre("/Movies/Holiday.qnproject"));
}

TEST_F(PolledTreeTest, ALookThatIsStoppedKeepsWhatWasKnown) {
    write("a/file");
    PolledTree tree = polled();
    changes(tree);
    stopped_ = true;
    EXPECT_THAT(changes(tree), ElementsAre());
    stopped_ = false;
    EXPECT_THAT(changes(tree), ElementsAre());
}
