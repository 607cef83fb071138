// Reloads that end while a load is about to install its tree, and loads that do so while a reload is about to
// publish its own.
#include <functional>

#include "tests/core/SmallLibrary.h"

namespace testing_support {
namespace {

using testing::HasSubstr;
using vexo::VXMediaGroupRef;

// The plug-in, which does something else at a chosen point of its work.
class InterruptedPlugin final : public ExposedPlugin {
  public:
    using ExposedPlugin::ExposedPlugin;

    // Once, when a load has its tree and the host has not installed it yet.
    std::function<void()> beforeInstalling;
    // Once, after so many questions whether a cancel is pending.
    std::function<void()> atQuestion;
    mutable int questions = 0;
    int interruptedQuestion = 0;

    VXMediaGroupRef performLoadData() override {
        VXMediaGroupRef root = ExposedPlugin::performLoadData();
        if (const auto interruption = std::exchange(beforeInstalling, nullptr))
            interruption();
        return root;
    }
    bool isCancelLoadRequestPending() const override {
        if (++questions == interruptedQuestion)
            atQuestion();
        return ExposedPlugin::isCancelLoadRequestPending();
    }
};

class ReloadsAmidLoadsTest : public SmallLibraryTest {
  protected:
    ReloadsAmidLoadsTest() {
        makeProject("Wedding");
        makeEvent("Beach", 2008);
        plugin_->init();
        load();
    }

    void load() {
        plugin_->loadData();
        environment.dispatcher.runDueBlocks();
    }
    void waitForReloads() { environment.dispatcher.advance(std::chrono::seconds(5)); }
    std::string tree() { return treeText(plugin_->rootMediaGroup(), home().path()); }

    const std::shared_ptr<InterruptedPlugin> plugin_ =
        std::make_shared<InterruptedPlugin>(environment.bundle);
};

TEST_F(ReloadsAmidLoadsTest, WhatAReloadFoundAfterALoadHadLookedIsNotLost) {
    plugin_->beforeInstalling = [&] {
        makeEvent("Late", 2009);
        makeProject("Late");
        plugin_->_reloadReelixEvents();
        plugin_->_reloadReelixProjects();
    };
    load();
    waitForReloads();
    EXPECT_THAT(tree(), HasSubstr("Event home/Movies/Reelix Events/Late"));
    EXPECT_THAT(tree(), HasSubstr("home/Movies/Reelix Projects/Late.qnproject"));
}

TEST_F(ReloadsAmidLoadsTest, WhatALoadFoundWhileAReloadPublishedItsBranchIsNotLost) {
    plugin_->questions = 0;
    plugin_->_reloadReelixEvents();
    plugin_->interruptedQuestion =
        plugin_->questions;  // the last one, when the branch goes into the old root
    plugin_->questions = 0;
    plugin_->atQuestion = [&] {
        makeProject("Late");
        load();
    };
    plugin_->_reloadReelixEvents();
    waitForReloads();
    EXPECT_THAT(tree(), HasSubstr("home/Movies/Reelix Projects/Late.qnproject"));
}

TEST_F(ReloadsAmidLoadsTest, AReloadWithoutALoadLeadsToNoOther) {
    plugin_->_reloadReelixEvents();
    plugin_->_reloadReelixProjects();
    EXPECT_EQ(environment.dispatcher.pendingCount(), 0u);
}

}  // namespace
}  // namespace testing_support
