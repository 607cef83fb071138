#include "platform/Notification.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <stdexcept>
#include <thread>

namespace platform {
namespace {

using testing::ElementsAre;

class NotificationCenterTest : public testing::Test {
  protected:
    using Observer = std::shared_ptr<int>;

    static Observer makeObserver() { return std::make_shared<int>(0); }
    // Notes `label` whenever `name` is posted.
    void observe(const Observer& observer, std::string_view name, std::string label) {
        center_.addObserver(observer, name, [this, label](const Notification&) { heard_.push_back(label); });
    }

    NotificationCenter center_;
    std::vector<std::string> heard_;
};

TEST_F(NotificationCenterTest, ObserversHearTheirNameInTheOrderTheyCame) {
    const Observer observer = makeObserver();
    observe(observer, "mount", "first");
    observe(observer, "query", "other");
    observe(observer, "mount", "second");
    center_.post({.name = "mount"});
    center_.post({.name = "nobody"});
    EXPECT_THAT(heard_, ElementsAre("first", "second"));
}

TEST_F(NotificationCenterTest, ObserversGetTheNotification) {
    const Observer observer = makeObserver();
    const int sender = 0;
    int calls = 0;
    center_.addObserver(observer, NSWorkspaceDidMountNotification, [&](const Notification& notification) {
        ++calls;
        EXPECT_EQ(notification.name, "NSWorkspaceDidMountNotification");
        EXPECT_EQ(notification.object, &sender);
        ASSERT_EQ(notification.userInfo.count("NSDevicePath"), 1u);
        EXPECT_EQ(*notification.userInfo.at("NSDevicePath").string(), "/Volumes/Card");
    });
    center_.post({.name = std::string(NSWorkspaceDidMountNotification),
                  .object = &sender,
                  .userInfo = {{"NSDevicePath", Value("/Volumes/Card")}}});
    EXPECT_EQ(calls, 1);
}

TEST_F(NotificationCenterTest, AnObserverThatIsGoneHearsNothing) {
    Observer gone = makeObserver();
    const Observer stays = makeObserver();
    observe(gone, "mount", "gone");
    observe(stays, "mount", "stays");
    gone.reset();
    center_.post({.name = "mount"});
    EXPECT_THAT(heard_, ElementsAre("stays"));
}

TEST_F(NotificationCenterTest, AnObserverThatGoesDuringThePostIsNotCalled) {
    const Observer first = makeObserver();
    Observer second = makeObserver();
    center_.addObserver(first, "mount", [&](const Notification&) { second.reset(); });
    observe(second, "mount", "second");
    center_.post({.name = "mount"});
    EXPECT_THAT(heard_, ElementsAre());
}

TEST_F(NotificationCenterTest, AnObserverLivesWhileItIsCalled) {
    Observer observer = makeObserver();
    const std::weak_ptr<int> watch = observer;
    bool livedOn = false;
    center_.addObserver(observer, "mount", [&](const Notification&) {
        observer.reset();
        livedOn = !watch.expired();
    });
    center_.post({.name = "mount"});
    EXPECT_TRUE(livedOn);
    EXPECT_TRUE(watch.expired());
}

TEST_F(NotificationCenterTest, WhatAHandlerHoldsIsFreedOnceItsObserverIsGone) {
    for (const bool byPost : {true, false}) {
        Observer observer = makeObserver();
        auto held = std::make_shared<int>(1);
        const std::weak_ptr<int> watch = held;
        center_.addObserver(observer, "mount", [held = std::move(held)](const Notification&) {});
        observer.reset();
        EXPECT_FALSE(watch.expired());
        if (byPost)
            center_.post({.name = "other"});
        else
            center_.addObserver(makeObserver(), "other", [](const Notification&) {});
        EXPECT_TRUE(watch.expired());
    }
}

// Posts when it goes.
struct PostingOnDestruction {
    explicit PostingOnDestruction(NotificationCenter& center) : center_(center) {}
    ~PostingOnDestruction() { center_.post({.name = "farewell"}); }
    PostingOnDestruction(const PostingOnDestruction&) = delete;
    PostingOnDestruction& operator=(const PostingOnDestruction&) = delete;

  private:
    NotificationCenter& center_;
};

TEST_F(NotificationCenterTest, WhatAHandlerHoldsMayPostWhenItIsFreed) {
    const Observer stays = makeObserver();
    observe(stays, "farewell", "farewell");
    for (const bool byPost : {true, false}) {
        center_.addObserver(makeObserver(), "mount",
                            [held = std::make_shared<PostingOnDestruction>(center_)](const Notification&) {});
        if (byPost)
            center_.post({.name = "other"});
        else
            observe(stays, "other", "other");
    }
    EXPECT_THAT(heard_, ElementsAre("farewell", "farewell"));
}

TEST_F(NotificationCenterTest, AnObserverAddedDuringAPostHearsTheNextOne) {
    const Observer observer = makeObserver();
    bool added = false;
    center_.addObserver(observer, "mount", [&](const Notification&) {
        if (!std::exchange(added, true))
            observe(observer, "mount", "late");
    });
    center_.post({.name = "mount"});
    EXPECT_THAT(heard_, ElementsAre());
    center_.post({.name = "mount"});
    EXPECT_THAT(heard_, ElementsAre("late"));
}

TEST_F(NotificationCenterTest, AHandlerMayPost) {
    const Observer observer = makeObserver();
    center_.addObserver(observer, "outer", [&](const Notification&) {
        center_.post({.name = "inner"});
        heard_.push_back("outer");
    });
    observe(observer, "inner", "inner");
    center_.post({.name = "outer"});
    EXPECT_THAT(heard_, ElementsAre("inner", "outer"));
}

TEST_F(NotificationCenterTest, TheCentreOutlivesAHandlersFailure) {
    const Observer observer = makeObserver();
    center_.addObserver(observer, "mount", [](const Notification&) { throw std::runtime_error("broken"); });
    observe(observer, "other", "other");
    EXPECT_THROW(center_.post({.name = "mount"}), std::runtime_error);
    center_.post({.name = "other"});
    EXPECT_THAT(heard_, ElementsAre("other"));
}

TEST_F(NotificationCenterTest, ThreadsMayPostAndObserveAtOnce) {
    constexpr int rounds = 500;
    std::atomic<int> calls{0};
    const Observer stays = makeObserver();
    center_.addObserver(stays, "mount", [&](const Notification&) { ++calls; });
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 3; ++thread) {
        threads.emplace_back([&] {
            for (int i = 0; i < rounds; ++i) {
                const Observer passing = makeObserver();
                center_.addObserver(passing, "other", [](const Notification&) {});
                center_.post({.name = "mount"});
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(calls, 3 * rounds);
}

}  // namespace
}  // namespace platform
