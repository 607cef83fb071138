// What the tests of faults share: a small library, and loads and reloads of it as a host does them, on this
// thread and without anything happening by chance.
#pragma once

#include <chrono>
#include <string>

#include "framework/GuardedWork.h"
#include "tests/faults/SmallLibrary.h"
#include "tests/support/PluginTest.h"

namespace testing_support {

class FaultsTest : public PluginTest {
  protected:
    explicit FaultsTest(Documents documents = Documents::oneIsBroken) {
        environment.dispatcher.setFailureHandler(
            [](const platform::Dispatcher::Block& block, std::exception_ptr failure) {
                vexo::recoverFrom(failure, block);
            });
        makeSmallLibrary(environment, documents);
    }

    std::string projects() const { return home().path("Movies/Reelix Projects"); }
    std::string events() const { return home().path("Movies/Reelix Events"); }

    TreeEntries loadTree() {
        plugin().loadData();
        environment.dispatcher.runDueBlocks();
        return currentTree();
    }
    // Both branches, as after reports of changes in them.
    TreeEntries reloadTree() {
        plugin().watchedPathChanged(projects(), 0);
        plugin().watchedPathChanged(events(), 0);
        environment.dispatcher.advance(std::chrono::seconds(10));
        return currentTree();
    }
    TreeEntries loadTreeAnew() {
        dropPlugin();
        clearProcessCaches();
        return loadTree();
    }
    TreeEntries currentTree() { return entriesOf(plugin().rootMediaGroup()); }

    // Nothing is missing but what has to do with the path, and nothing is there that wasn't. Where it can't
    // be known what a folder hides, it hides nothing.
    static void expectHealthyRest(const TreeEntries& tree, const TreeEntries& whole,
                                  const std::string& path) {
        for (const TreeEntry& entry : whole)
            EXPECT_TRUE(tree.contains(entry) || isAbout(entry, path)) << "missing: " << entry;
        if (path.ends_with("/.hidden"))
            return;
        for (const TreeEntry& entry : tree)
            EXPECT_TRUE(whole.contains(entry) || standsForPartOf(entry, whole)) << "made up: " << entry;
    }

  private:
    // Whether it is the next best movie of a project: one that stands for the project in the place of
    // another.
    static bool standsForPartOf(const TreeEntry& entry, const TreeEntries& whole) {
        return std::ranges::any_of(whole, [&](const TreeEntry& known) { return known.item == entry.item; });
    }
};

}  // namespace testing_support
