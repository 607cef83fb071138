// Each single operation on the file system fails once, during a load or a reload: what it was about may be
// missing, everything else is there, and the next time all is.
#include <optional>

#include "tests/faults/FaultsTest.h"
#include "tests/faults/FaultyFiles.h"
#include "tests/support/ForwardingFiles.h"

namespace testing_support {
namespace {

class FailedOperation : public FaultsTest {
  protected:
    // Lets the `index`th operation from now on fail.
    void failAt(int index) {
        failedPath.reset();
        files.beforeOperation = [this, left = index](const std::string& path) mutable {
            if (left-- != 0)
                return true;
            failedPath = path;
            return false;
        };
    }
    void failNoMore() { files.beforeOperation = nullptr; }

    FaultyFiles files{environment};
    std::optional<std::string> failedPath;  // nil until one failed

  private:
    platform::ServicesScope scope_{servicesWith(files, environment)};
};

// Whether a library is in the plain or the localized folder is looked up once for each plug-in.
TEST_F(FailedOperation, DuringALoadHidesNothingElse) {
    const TreeEntries whole = loadTreeAnew();
    int index = 0;
    for (;; ++index) {
        SCOPED_TRACE("operation " + std::to_string(index));
        dropPlugin();
        clearProcessCaches();
        plugin();
        failAt(index);
        const TreeEntries tree = loadTree();
        failNoMore();
        if (!failedPath)
            break;
        SCOPED_TRACE(*failedPath);
        expectHealthyRest(tree, whole, *failedPath);
        if (failedPath != projects()) {
            EXPECT_EQ(loadTree(), whole);
        }
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100);
    EXPECT_EQ(loadTreeAnew(), whole);
}

TEST_F(FailedOperation, DuringAReloadHidesNothingElse) {
    const TreeEntries whole = loadTree();
    EXPECT_EQ(reloadTree(), whole);
    int index = 0;
    for (;; ++index) {
        SCOPED_TRACE("operation " + std::to_string(index));
        failAt(index);
        const TreeEntries tree = reloadTree();
        failNoMore();
        if (!failedPath)
            break;
        SCOPED_TRACE(*failedPath);
        expectHealthyRest(tree, whole, *failedPath);
        EXPECT_EQ(reloadTree(), whole);
        ASSERT_FALSE(HasFailure());
    }
    EXPECT_GT(index, 100);
}

}  // namespace
}  // namespace testing_support
