// A folder that is read some items at a time can fail at each of the readings: it's never taken for a smaller
// one.
#include <gmock/gmock.h>

#include <cerrno>

#include "platform/linux/LinuxFileManager.h"
#include "tests/faults/SystemCalls.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using testing::ElementsAre;

class LargeFolderTest : public testing::Test {
  protected:
    LargeFolderTest() {
        for (int i = 0; i < 1000; ++i)
            home_.writeFile("folder/a name that takes its room " + std::to_string(i));
    }

    using Read = bool(const platform::FileManager& files, const std::string& folder);

    // How many readings of the folder there were, each of which has failed once.
    int failedReadings(Read* read) const {
        const std::string folder = home_.path("folder");
        FakeMountTable mounts;
        int failed = 0;
        for (std::size_t index = 0;; ++index) {
            CollectedLog log;
            const platform::LinuxFileManager files(home_.path(), mounts, log,
                                                   [](std::string_view) { return false; });
            SystemCalls calls(home_.path());
            calls.failAt(index, EIO);
            const bool isRead = read(files, folder);
            if (calls.calls().size() <= index) {
                EXPECT_TRUE(isRead);
                return failed;
            }
            if (calls.calls()[index].function != "getdents64")
                continue;
            ++failed;
            EXPECT_FALSE(isRead) << index;
            EXPECT_THAT(log.lines(), ElementsAre("cannot list " + folder + ": Input/output error")) << index;
        }
    }

    const TemporaryFolder home_;
};

TEST_F(LargeFolderTest, IsNotGoneThroughInPart) {
    const int readings = failedReadings([](const platform::FileManager& files, const std::string& folder) {
        const auto opened = files.openFolderAtPath(folder);
        return opened && opened->allItems();
    });
    EXPECT_GT(readings, 3);
}

TEST_F(LargeFolderTest, IsNotListedInPart) {
    const int readings = failedReadings([](const platform::FileManager& files, const std::string& folder) {
        return files.contentsOfDirectoryAtPath(folder).has_value();
    });
    EXPECT_GT(readings, 3);
}

}  // namespace
}  // namespace testing_support
