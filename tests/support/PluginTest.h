// What the tests of the plug-in share: the plug-in with its fields within reach, in an environment of its
// own.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <climits>
#include <memory>

#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/TreeText.h"

namespace testing_support {

// The plug-in, whose cancel request can be raised at a chosen question.
class ExposedPlugin : public reelix::VXReelixPlugin {
  public:
    using VXReelixPlugin::VXReelixPlugin;

    using VXReelixPlugin::_appIcon;
    using VXReelixPlugin::_appIconLock;
    using VXReelixPlugin::_flatEventGroupsList;
    using VXReelixPlugin::_flatProjectGroupsList;
    using VXReelixPlugin::_missingReelixDefaultPath;
    using VXReelixPlugin::_monitor;
    using VXReelixPlugin::_mostRecentEventFirst;
    using VXReelixPlugin::_poolingEventsReload;
    using VXReelixPlugin::_poolingProjectsReload;
    using VXReelixPlugin::_ReelixAppVersionString;
    using VXReelixPlugin::_ReelixEventsSearchPaths;
    using VXReelixPlugin::_ReelixSearchPaths;
    using VXReelixPlugin::_updatePreferencesLock;
    using VXReelixPlugin::cachedIcons;

    // Answers NO to the next `questions` questions whether a cancel is pending, YES from then on.
    void cancelAfter(int questions) { questionsUntilCancel_ = questions; }
    void neverCancel() { questionsUntilCancel_ = INT_MAX; }
    bool isCancelLoadRequestPending() const override { return questionsUntilCancel_-- <= 0; }

  private:
    mutable std::atomic<int> questionsUntilCancel_ = INT_MAX;
};

// The caches are the process's: a test begins and ends with empty ones.
inline void clearProcessCaches() {
    reelix::defaultPathCache().defaultPath2.clear();  // the one slot that outlives the plug-in
}

class PluginTest : public testing::Test {
  protected:
    PluginTest() { clearProcessCaches(); }
    ~PluginTest() override {
        plugin_.reset();
        clearProcessCaches();
    }

    // The plug-in of the test, made at the first call, so that a test can set its world up before.
    ExposedPlugin& plugin() {
        if (!plugin_)
            plugin_ = newPlugin();
        return *plugin_;
    }
    std::shared_ptr<ExposedPlugin> newPlugin() {
        auto made = std::make_shared<ExposedPlugin>(environment.bundle);
        return made->init() ? made : nullptr;
    }
    void dropPlugin() { plugin_.reset(); }

    // A load as the host does it: builds the tree and installs it.
    vexo::VXMediaGroupRef load() {
        const vexo::VXMediaGroupRef root = plugin().performLoadData();
        plugin().setRootMediaGroup(root);
        return root;
    }
    std::string tree() { return treeText(plugin().rootMediaGroup(), home().path()); }

    const TemporaryFolder& home() const { return environment.home; }

    HostEnvironment environment;

  private:
    std::shared_ptr<ExposedPlugin> plugin_;
};

}  // namespace testing_support
