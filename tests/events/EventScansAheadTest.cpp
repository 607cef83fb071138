// Events that a second thread scans while a load reads the projects are those that the load would have found.
#include <chrono>
#include <functional>
#include <semaphore>
#include <stdexcept>
#include <thread>

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

// The second thread of a load is a real one here, and busy with opening the first event, "Party", from when
// the projects are listed until the load has come to the second, "Trip".
class SlowFolderTest : public EventScansAheadTest {
  protected:
    SlowFolderTest() {
        files.beforeListing = [this](const std::string& path) {
            if (path == home().path("Movies/Reelix Projects")) {
                secondThread_ = std::thread([this] { environment.dispatcher.runDueBlocks(); });
                waitFor(firstEventBegun_);
            } else if (path == home().path(inLibrary("Party"))) {
                firstEventBegun_.release();
                waitFor(secondEventBegun_);
                openFirstEvent();
            } else if (path == home().path(inLibrary("Trip"))) {
                secondEventBegun_.release();
            }
        };
    }
    ~SlowFolderTest() override {
        if (secondThread_.joinable())
            secondThread_.join();
    }

    std::function<void()> openFirstEvent = [] {};

  private:
    static void waitFor(std::binary_semaphore& semaphore) {
        EXPECT_TRUE(semaphore.try_acquire_for(std::chrono::seconds(30)));
    }

    std::binary_semaphore firstEventBegun_{0};
    std::binary_semaphore secondEventBegun_{0};
    std::thread secondThread_;
};

TEST_F(SlowFolderTest, TheLoadGoesOnWithTheOthers) {
    load();
    EXPECT_THAT(clipNames(plugin().rootMediaGroup()),
                ElementsAre("Jan 1, 2010, 00:00:10", "Jul 1, 2009, 08:30:00", "Jul 2, 2009, 08:30:00"));
}

TEST_F(SlowFolderTest, TheLoadFailsWhenOpeningItRaises) {
    openFirstEvent = [] { throw std::runtime_error("the event can't be opened"); };
    EXPECT_THROW(plugin().performLoadData(), std::runtime_error);
}

// The second thread of a load is a real one here, and reads a large event, "Large", on only when the load has
// begun with the clips of what was read first.
class LargeFolderTest : public EventScansAheadTest {
  protected:
    LargeFolderTest() {
        for (std::size_t i = 0; i < 3 * PathFolder::itemsATime; ++i)
            addClip("Large/" + std::to_string(1000 + i) + ".mov");
        files.beforeListing = [this](const std::string& path) {
            if (path == home().path("Movies/Reelix Projects"))
                secondThread_ = std::thread([this] { environment.dispatcher.runDueBlocks(); });
        };
        files.beforeReading = [this](const std::string& path, std::size_t itemsTold) {
            if (path != home().path(inLibrary("Large")) || itemsTold == 0)
                return true;
            if (itemsTold == PathFolder::itemsATime) {
                EXPECT_TRUE(clipBegun_.try_acquire_for(std::chrono::seconds(30)));
            }
            return beforeReadingOn();
        };
        files.beforeAttributeRead = [this](const std::string& path) {
            if (path == home().path(inLibrary("Large/1000.mov")))
                clipBegun_.release();
        };
    }
    ~LargeFolderTest() override {
        if (secondThread_.joinable())
            secondThread_.join();
    }
    std::vector<std::string> eventNames() {
        platform::Locked monitor(plugin()._monitor);
        return names(*plugin()._flatEventGroupsList);
    }

    std::function<bool()> beforeReadingOn = [] { return true; };

  private:
    std::binary_semaphore clipBegun_{0};
    std::thread secondThread_;
};

TEST_F(LargeFolderTest, HasItsClipsInOrder) {
    load();
    std::vector<std::string> expected;
    for (std::size_t i = 0; i < 3 * PathFolder::itemsATime; ++i)
        expected.push_back(std::to_string(1000 + i));
    platform::Locked monitor(plugin()._monitor);
    EXPECT_EQ(clipNames(plugin()._flatEventGroupsList->front()), expected);
}

TEST_F(LargeFolderTest, IsMissingAloneWhenItCantBeReadOn) {
    beforeReadingOn = [] { return false; };
    load();
    EXPECT_THAT(eventNames(), ElementsAre("Party", "Trip"));
}

TEST_F(LargeFolderTest, TheLoadFailsWhenReadingOnRaises) {
    beforeReadingOn = []() -> bool { throw std::runtime_error("the event can't be read on"); };
    EXPECT_THROW(plugin().performLoadData(), std::runtime_error);
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
