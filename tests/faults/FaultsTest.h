// What the tests of faults share: a small library, and loads and reloads of it as a host does them, on this
// thread and without anything happening by chance.
#pragma once

#include <chrono>
#include <string>

#include "framework/GuardedWork.h"
#include "tests/faults/SmallLibrary.h"
#include "tests/support/OpenDescriptors.h"
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

    // Of several things that go wrong, each does at each index. With a sanitizer, which takes its time, each
    // of them does at some indexes, and at each index one of them.
    static std::size_t firstIndex(std::size_t number) { return VEXO_SANITIZED ? number : 0; }
    static std::size_t indexStep(std::size_t count) { return VEXO_SANITIZED ? count : 1; }

  private:
    // Whether it is the next best movie of a project: one that stands for the project in the place of
    // another.
    static bool standsForPartOf(const TreeEntry& entry, const TreeEntries& whole) {
        return std::ranges::any_of(whole, [&](const TreeEntry& known) { return known.item == entry.item; });
    }
};

// What is read while something goes wrong.
enum class Reading { load, reload };

// Of either reading, of a library with no fault of its own. Whatever goes wrong, no descriptor stays open.
class ReadingFaultsTest : public FaultsTest, public testing::WithParamInterface<Reading> {
  protected:
    ReadingFaultsTest() : FaultsTest(Documents::allWell) {}

    void TearDown() override { EXPECT_EQ(openDescriptors(), openBefore_); }

    // A load begins from nothing.
    void begin() {
        if (openBefore_ == 0)
            openBefore_ = openDescriptors();
        if (GetParam() == Reading::load) {
            dropPlugin();
            clearProcessCaches();
        }
        plugin();
    }
    TreeEntries nextTree() { return GetParam() == Reading::load ? loadTree() : reloadTree(); }
    // Whether a library is in the plain or the localized folder is looked up once for each plug-in.
    bool decidesWhereTheLibraryIs(const std::string& path) const {
        return GetParam() == Reading::load && path == projects();
    }

  private:
    std::ptrdiff_t openBefore_ = 0;
};

inline std::string nameOfReading(const testing::TestParamInfo<Reading>& info) {
    return info.param == Reading::load ? "Load" : "Reload";
}

}  // namespace testing_support
