// Events that a second thread scans while a load reads the projects are those that the load would have found.
#include <stdexcept>

#include "tests/events/EventsTest.h"

namespace testing_support {
namespace {

using testing::ElementsAre;

class EventScansAheadTest : public EventsTest {
  protected:
    EventScansAheadTest() {
        home().makeFolder("Movies/Reelix Projects");
        addClip("Trip/clip-2009-07-01 08;30;00.mov");
        addClip("Trip/clip-2009-07-02 08;30;00.mov");
        addClip("Party/clip-2010-01-01 00;00;10.mov");
    }
    // The second thread gets its turn, until it ends, when the projects are listed.
    void scanEventsBeforeProjects() {
        files.beforeListing = [this](const std::string& path) {
            listed_.push_back(path);
            if (path == home().path("Movies/Reelix Projects"))
                environment.dispatcher.runDueBlocks();
        };
    }
    long timesListed(const std::string& path) const { return std::ranges::count(listed_, path); }
    long scanThreads() const {
        return std::ranges::count(environment.dispatcher.requests(), "vexo-scan",
                                  &VirtualDispatcher::Request::name);
    }

    std::vector<std::string> listed_;
};

TEST_F(EventScansAheadTest, TheTreeIsThatOfOneThread) {
    load();
    const std::string byOneThread = tree();
    scanEventsBeforeProjects();
    load();
    EXPECT_EQ(tree(), byOneThread);
    EXPECT_EQ(timesListed(library()), 1);
    EXPECT_EQ(timesListed(home().path(inLibrary("Trip"))), 1);
}

TEST_F(EventScansAheadTest, ALoadBeginsOneThreadWithItsOwnPriority) {
    plugin().setLoadThreadPriority(0.25);
    load();
    ASSERT_EQ(scanThreads(), 1);
    const auto requests = environment.dispatcher.requests();
    EXPECT_EQ(std::ranges::find(requests, "vexo-scan", &VirtualDispatcher::Request::name)->priority, 0.25);
}

TEST_F(EventScansAheadTest, AReloadBeginsNone) {
    load();
    plugin()._reloadReelixEvents();
    EXPECT_EQ(scanThreads(), 1);
}

TEST_F(EventScansAheadTest, ALateThreadFindsNothingToDo) {
    load();
    scanEventsBeforeProjects();
    environment.dispatcher.runDueBlocks();
    EXPECT_THAT(listed_, testing::IsEmpty());
}

TEST_F(EventScansAheadTest, AThreadThatComesAfterALoadThatFailedFindsNothingToDo) {
    files.beforeListing = [this](const std::string& path) {
        if (path == home().path("Movies/Reelix Projects"))
            throw std::runtime_error("the projects can't be listed");
        listed_.push_back(path);
    };
    EXPECT_THROW(plugin().performLoadData(), std::runtime_error);
    environment.dispatcher.runDueBlocks();
    EXPECT_THAT(listed_, testing::IsEmpty());
}

// The same folder twice among the search paths is two libraries, each with items of its own.
TEST_F(EventScansAheadTest, EachSearchPathHasItsOwnScan) {
    load();
    {
        platform::Locked monitor(plugin()._monitor);
        plugin()._ReelixEventsSearchPaths->append(library());
    }
    scanEventsBeforeProjects();
    load();
    EXPECT_EQ(timesListed(library()), 2);
    platform::Locked monitor(plugin()._monitor);
    EXPECT_EQ(plugin()._flatEventGroupsList->size(), 4u);
}

}  // namespace
}  // namespace testing_support
