// Each single call to the system fails once, with each error that a disk, a server or a limit may answer:
// what the call was about may be missing, everything else is there, somebody hears of it, and the next time
// all is.
#include <gmock/gmock.h>

#include <array>
#include <cerrno>

#include "tests/faults/FaultsTest.h"
#include "tests/faults/SystemCalls.h"

namespace testing_support {
namespace {

using testing::Contains;
using testing::HasSubstr;

class FailedSystemCall : public FaultsTest {
  protected:
    FailedSystemCall() : FaultsTest(Documents::allWell) {}

    // The tree of a first load whose call of that number fails; nil when there are fewer calls.
    std::optional<TreeEntries> treeWithFailureAt(std::size_t index, int error) {
        dropPlugin();
        clearProcessCaches();
        plugin();
        logged = environment.log.lines().size();
        SystemCalls calls(home().path());
        calls.failAt(index, error);
        TreeEntries tree = loadTree();
        if (calls.calls().size() <= index)
            return std::nullopt;
        failed = calls.calls()[index];
        return tree;
    }
    // Whether a library is in the plain or the localized folder is looked up once for each plug-in.
    bool decidesWhereTheLibraryIs() const { return failed.path == projects(); }
    bool isOfAHiddenFile() const { return failed.path.ends_with("/.hidden"); }

    // What the load logged, and the warnings there are, each of which is told once.
    std::vector<std::string> told() const {
        auto lines = environment.log.lines();
        lines.erase(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(logged));
        const auto warnings = environment.diagnostics.warnings();
        lines.insert(lines.end(), warnings.begin(), warnings.end());
        return lines;
    }
    std::string description(std::size_t index) const {
        return std::to_string(index) + ": " + failed.function + " of " + failed.path;
    }

    SystemCall failed;
    std::size_t logged = 0;
};

TEST_F(FailedSystemCall, HidesNothingElseAndIsToldWithItsPath) {
    const TreeEntries whole = loadTreeAnew();
    const std::string wholeText = tree();
    std::size_t index = 0;
    while (const auto entries = treeWithFailureAt(index, EIO)) {
        SCOPED_TRACE(description(index++));
        expectHealthyRest(*entries, whole, failed.path);
        if (tree() != wholeText && !isOfAHiddenFile()) {
            EXPECT_THAT(told(), Contains(HasSubstr(failed.path)));
        }
        if (!decidesWhereTheLibraryIs()) {
            EXPECT_EQ(loadTree(), whole);
        }
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100u);
}

// Every call is met by some error, and every error by calls of all kinds.
TEST_F(FailedSystemCall, HidesNothingElseWhateverTheError) {
    constexpr std::array errors{EACCES, ENOENT, ELOOP, ENAMETOOLONG, EMFILE, ENOMEM, ESTALE};
    const TreeEntries whole = loadTreeAnew();
    std::size_t index = 0;
    while (const auto tree = treeWithFailureAt(index, errors[index % errors.size()])) {
        SCOPED_TRACE(description(index++));
        expectHealthyRest(*tree, whole, failed.path);
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_EQ(loadTreeAnew(), whole);
}

TEST_F(FailedSystemCall, ThatWasInterruptedIsMadeAgain) {
    const TreeEntries whole = loadTreeAnew();
    std::size_t index = 0;
    while (const auto tree = treeWithFailureAt(index, EINTR)) {
        SCOPED_TRACE(description(index++));
        EXPECT_EQ(*tree, whole);
    }
}

}  // namespace
}  // namespace testing_support
