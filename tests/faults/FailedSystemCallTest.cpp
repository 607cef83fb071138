// Each single call to the system fails once, with each error that a disk, a server or a limit may answer,
// during a load and during a reload: what the call was about may be missing, everything else is there,
// somebody hears of it, and the next time all is.
#include <gmock/gmock.h>

#include <array>
#include <cerrno>

#include "tests/faults/FaultsTest.h"
#include "tests/faults/SystemCalls.h"

namespace testing_support {
namespace {

using testing::Contains;
using testing::HasSubstr;

class FailedSystemCall : public ReadingFaultsTest {
  protected:
    // The tree when the call of that number fails; nil when there are fewer calls.
    std::optional<TreeEntries> treeWithFailureAt(std::size_t index, int error) {
        begin();
        logged = environment.log.lines().size();
        SystemCalls calls(home().path());
        calls.failAt(index, error);
        TreeEntries tree = nextTree();
        if (calls.calls().size() <= index)
            return std::nullopt;
        failed = calls.calls()[index];
        return tree;
    }
    bool isOfAHiddenFile() const { return failed.path.ends_with("/.hidden"); }

    // What was logged meanwhile, and the warnings there are, each of which is told once.
    std::vector<std::string> told() const {
        auto lines = environment.log.lines();
        lines.erase(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(logged));
        const auto warnings = environment.diagnostics.warnings();
        lines.insert(lines.end(), warnings.begin(), warnings.end());
        return lines;
    }
    std::string description(std::size_t index, int error) const {
        return std::to_string(index) + ": " + failed.function + " of " + failed.path + " with " +
               std::to_string(error);
    }

    SystemCall failed;
    std::size_t logged = 0;
};

TEST_P(FailedSystemCall, HidesNothingElseAndIsToldWithItsPath) {
    const TreeEntries whole = loadTreeAnew();
    const std::string wholeText = tree();
    std::size_t index = 0;
    while (const auto entries = treeWithFailureAt(index, EIO)) {
        SCOPED_TRACE(description(index++, EIO));
        expectHealthyRest(*entries, whole, failed.path);
        if (tree() != wholeText && !isOfAHiddenFile()) {
            EXPECT_THAT(told(), Contains(HasSubstr(failed.path)));
        }
        if (!decidesWhereTheLibraryIs(failed.path)) {
            EXPECT_EQ(nextTree(), whole);
        }
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100u);
}

TEST_P(FailedSystemCall, HidesNothingElseWhateverTheError) {
    const TreeEntries whole = loadTreeAnew();
    constexpr std::array errors{EACCES, ENOENT, ELOOP, ENAMETOOLONG, EMFILE, ENOMEM, ESTALE};
    for (std::size_t i = 0; i < errors.size(); ++i) {
        const int error = errors[i];
        std::size_t index = firstIndex(i);
        for (; const auto tree = treeWithFailureAt(index, error); index += indexStep(errors.size())) {
            SCOPED_TRACE(description(index, error));
            expectHealthyRest(*tree, whole, failed.path);
            if (!decidesWhereTheLibraryIs(failed.path)) {
                EXPECT_EQ(nextTree(), whole);
            }
            ASSERT_FALSE(HasFailure());
        }
        EXPECT_GT(index, 100u);
    }
}

TEST_P(FailedSystemCall, ThatWasInterruptedIsMadeAgain) {
    const TreeEntries whole = loadTreeAnew();
    std::size_t index = 0;
    while (const auto tree = treeWithFailureAt(index, EINTR)) {
        SCOPED_TRACE(description(index++, EINTR));
        EXPECT_EQ(*tree, whole);
    }
    EXPECT_GT(index, 100u);
}

INSTANTIATE_TEST_SUITE_P(Readings, FailedSystemCall, testing::Values(Reading::load, Reading::reload),
                         nameOfReading);

}  // namespace
}  // namespace testing_support
