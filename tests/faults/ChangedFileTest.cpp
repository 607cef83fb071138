// Files that go, appear, or turn into something else, between any two calls to the system.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <functional>

#include "platform/Path.h"
#include "tests/faults/FaultsTest.h"
#include "tests/faults/SystemCalls.h"

namespace testing_support {
namespace {

namespace fs = std::filesystem;
namespace path = platform::path;
using testing::IsSupersetOf;

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

class ChangedFile : public ReadingFaultsTest {
  protected:
    // The tree when there is another file from the call of that number on; nil when there are fewer calls.
    std::optional<TreeEntries> treeWithChangeAt(std::size_t index, Change change) {
        return treeWithEventAt(index, [=, this](const std::string& path) { replace(path, change); });
    }
    std::optional<TreeEntries> treeWithNewFilesAt(std::size_t index) {
        return treeWithEventAt(index, [this](const std::string&) {
            home().writeFile(newClip);
            home().writeFile(newProject + "/Movies/new.mov", "new");
        });
    }
    void removeNewFiles() const {
        home().remove(path::withoutLastComponent(newClip));
        home().remove(newProject);
    }
    std::vector<TreeEntry> newEntries() const {
        return {{path::withoutLastComponent(home().path(newClip)), home().path(newClip)},
                {home().path(newProject), ""}};
    }

    void putBack() const {
        fs::remove_all(changedPath);
        if (fs::exists(fs::symlink_status(movedAway())))
            fs::rename(movedAway(), changedPath);
    }

    std::string changedPath;

  private:
    std::optional<TreeEntries> treeWithEventAt(std::size_t index,
                                               const std::function<void(const std::string& path)>& event) {
        begin();
        changedPath.clear();
        SystemCalls calls(home().path());
        calls.beforeCall = [&](const SystemCall& call) {
            if (calls.calls().size() != index)
                return;
            changedPath = call.path;
            event(call.path);
        };
        TreeEntries tree = nextTree();
        return changedPath.empty() ? std::nullopt : std::optional(tree);
    }
    void replace(const std::string& path, Change change) const {
        std::error_code wasMissing;
        fs::rename(path, movedAway(), wasMissing);
        fs::create_directories(path::withoutLastComponent(path));
        change(path);
    }
    std::string movedAway() const { return home().path("away"); }

    const std::string newClip = "Movies/Reelix Events/New/new.mov";
    const std::string newProject = "Movies/Reelix Projects/New.qnproject";
};

TEST_P(ChangedFile, LeavesEverythingElseInTheTree) {
    const TreeEntries whole = loadTreeAnew();
    for (std::size_t i = 0; i < changes.size(); ++i) {
        std::size_t index = firstIndex(i);
        for (; const auto tree = treeWithChangeAt(index, changes[i]); index += indexStep(changes.size())) {
            SCOPED_TRACE(std::to_string(index) + ": " + changedPath + ", change " + std::to_string(i));
            for (const TreeEntry& entry : whole)
                EXPECT_TRUE(tree->contains(entry) || isAbout(entry, changedPath)) << "missing: " << entry;
            putBack();
            if (!decidesWhereTheLibraryIs(changedPath)) {
                EXPECT_EQ(nextTree(), whole);
            }
            ASSERT_FALSE(HasFailure());
        }
        EXPECT_GT(index, 100u);
    }
}

// In a folder that is being listed, or was, or will be.
TEST_P(ChangedFile, ThatAppearsHidesNothingAndIsThereTheNextTime) {
    const TreeEntries whole = loadTreeAnew();
    std::size_t index = 0;
    for (; const auto tree = treeWithNewFilesAt(index); ++index) {
        SCOPED_TRACE(std::to_string(index) + ": " + changedPath);
        for (const TreeEntry& entry : whole)
            EXPECT_TRUE(tree->contains(entry)) << "missing: " << entry;
        EXPECT_THAT(nextTree(), IsSupersetOf(newEntries()));
        removeNewFiles();
        EXPECT_EQ(nextTree(), whole);
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100u);
}

INSTANTIATE_TEST_SUITE_P(Readings, ChangedFile, testing::Values(Reading::load, Reading::reload),
                         nameOfReading);

}  // namespace
}  // namespace testing_support
