// A path watcher on the real file system whose steps the test takes itself, so that nothing happens behind
// its back: what has been reported when a step ends is all there is.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "framework/pathwatcher/PathWatcher.h"
#include "framework/pathwatcher/SystemSeams.h"
#include "tests/support/HostEnvironment.h"

namespace testing_support {

using Paths = std::set<std::string>;

class RecordingObserver final : public vexo::VXPathObserver {
  public:
    void watchedPathChanged(const std::string& path, std::uint64_t) override {
        calls.push_back(path);
        if (whenCalled)
            whenCalled(path);
    }
    void watchedQueryChanged(const platform::Notification&, const vexo::VXPathListRef&) override {}

    Paths paths() const { return {calls.begin(), calls.end()}; }

    std::vector<std::string> calls;
    std::function<void(const std::string& path)> whenCalled;
};

class WatcherTest : public testing::Test {
  protected:
    // Watches a path for the test's observer and drops what that alone may have caused.
    void watch(const std::string& path) {
        watcher().watchPath(path, observer);
        settle();
        observer->calls.clear();
    }

    // With a watcher that has watched nothing yet.
    void startAnew() {
        follower_.reset();
        watcher_.reset();
    }
    vexo::PathWatcher& watcher() {
        if (!watcher_) {
            watcher_ = std::make_unique<vexo::PathWatcher>(seamMaker);
            watcher_->setWarningHandler([this](const std::string& warning) { warnings.push_back(warning); });
            follower_ = watcher_->startByHand();
        }
        return *watcher_;
    }
    vexo::ChangeFollower& follower() {
        watcher();
        return *follower_;
    }

    // Steps until everything that happened so far is told. The kernel queues its events before the call that
    // causes them returns, so one look at the queue finds them all.
    void settle() {
        step(std::chrono::milliseconds(0));
        while (follower().keepsChanges())
            step(vexo::ChangeBurst::length);
    }
    void step(std::chrono::milliseconds atMost) {
        follower().step(atMost);
        environment.dispatcher.runDueBlocks();
    }
    // Steps until the condition holds; false when that takes half a minute.
    bool settleUntil(const std::function<bool()>& condition) {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
        while (!condition() && std::chrono::steady_clock::now() < deadline)
            step(std::chrono::milliseconds(100));
        return condition();
    }

    // What is reported of whatever `change` does.
    Paths reportsOf(const std::function<void()>& change) {
        observer->calls.clear();
        change();
        settle();
        return observer->paths();
    }

    // How and why the path is watched as it is: "events: ...", "polling: ..." or "none: ...".
    std::string stateOf(const std::string& path) {
        using How = vexo::WatchState::How;
        const vexo::WatchState state = watcher().watchStateOf(path);
        return (state.how == How::events    ? "events: "
                : state.how == How::polling ? "polling: "
                                            : "none: ") +
               state.why;
    }

    HostEnvironment environment;
    TemporaryFolder folder;
    std::shared_ptr<RecordingObserver> observer = std::make_shared<RecordingObserver>();
    std::vector<std::string> warnings;
    vexo::PathWatcher::SeamMaker seamMaker = [](const auto& wake) {
        return vexo::systemSeams(wake, std::chrono::milliseconds(20));
    };

  private:
    std::unique_ptr<vexo::PathWatcher> watcher_;
    std::shared_ptr<vexo::ChangeFollower> follower_;
};

}  // namespace testing_support
