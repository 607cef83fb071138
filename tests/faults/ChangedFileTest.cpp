// Files that go, or turn into something else, between any two calls to the system.
#include <sys/stat.h>

#include <array>
#include <filesystem>
#include <fstream>

#include "tests/faults/FaultsTest.h"
#include "tests/faults/SystemCalls.h"

namespace testing_support {
namespace {

namespace fs = std::filesystem;

// What takes the place of a file or folder that was moved away.
using Change = void (*)(const std::string& path);

void leaveNothing(const std::string&) {}

void makeFifo(const std::string& path) {
    EXPECT_EQ(mkfifo(path.c_str(), 0600), 0);
}

void makeLinkToItself(const std::string& path) {
    fs::create_symlink(path, path);
}

void makeFile(const std::string& path) {
    std::ofstream(path) << "another one, and longer than any movie of the library";
}

void makeFolder(const std::string& path) {
    fs::create_directory(path);
}

constexpr std::array<Change, 5> changes{leaveNothing, makeFifo, makeLinkToItself, makeFile, makeFolder};

class ChangedFile : public FaultsTest {
  protected:
    ChangedFile() : FaultsTest(Documents::allWell) {}

    // The tree of a first load that finds another file from the call of that number on; nil when there are
    // fewer calls.
    std::optional<TreeEntries> treeWithChangeAt(std::size_t index, Change change) {
        dropPlugin();
        clearProcessCaches();
        plugin();
        changedPath.clear();
        SystemCalls calls(home().path());
        calls.beforeCall = [&](const SystemCall& call) {
            if (calls.calls().size() == index)
                replace(call.path, change);
        };
        TreeEntries tree = loadTree();
        return changedPath.empty() ? std::nullopt : std::optional(tree);
    }

    void replace(const std::string& path, Change change) {
        changedPath = path;
        std::error_code wasMissing;
        fs::rename(path, movedAway(), wasMissing);
        change(path);
    }
    void putBack() const {
        fs::remove_all(changedPath);
        if (fs::exists(fs::symlink_status(movedAway())))
            fs::rename(movedAway(), changedPath);
    }

    std::string changedPath;

  private:
    std::string movedAway() const { return home().path("away"); }
};

TEST_F(ChangedFile, LeavesEverythingElseInTheTree) {
    const TreeEntries whole = loadTreeAnew();
    std::size_t index = 0;
    for (;; ++index) {
        const auto tree = treeWithChangeAt(index, changes[index % changes.size()]);
        if (!tree)
            break;
        SCOPED_TRACE(std::to_string(index) + ": " + changedPath);
        for (const TreeEntry& entry : whole)
            EXPECT_TRUE(tree->contains(entry) || isAbout(entry, changedPath)) << "missing: " << entry;
        putBack();
        if (changedPath != projects()) {
            EXPECT_EQ(loadTree(), whole);
        }
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100u);
}

}  // namespace
}  // namespace testing_support
