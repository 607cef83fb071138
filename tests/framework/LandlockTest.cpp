// The wall that the reader program puts up against files, alone: without the filter of system calls, which
// would refuse the same things before it.
#include "apps/media-reader/Landlock.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <cerrno>
#include <functional>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using platform::FileDescriptor;

// 0 for what was done.
int errorOf(long result) {
    return result < 0 ? errno : 0;
}

class LandlockTest : public testing::Test {
  protected:
    // The wall holds for the thread that puts it up, and for good.
    void behindTheWall(const std::function<void()>& work) {
        bool stands = false;
        std::thread([&] {
            prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
            stands = reader::denyFilesAndNetwork();
            if (stands)
                work();
        }).join();
        if (!stands)
            GTEST_SKIP() << "this kernel has no Landlock";
    }
    int errorOfOpening(const std::string& path, int flags) const {
        const FileDescriptor opened(open(path.c_str(), flags | O_CLOEXEC, 0600));
        return errorOf(opened.number());
    }

    const testing_support::TemporaryFolder folder;
    const std::string file = folder.writeFile("file", "content");
};

TEST_F(LandlockTest, NoFileIsOpenedOrMade) {
    ASSERT_EQ(errorOfOpening(file, O_RDONLY), 0);
    behindTheWall([&] {
        EXPECT_EQ(errorOfOpening(file, O_RDONLY), EACCES);
        EXPECT_EQ(errorOfOpening(file, O_WRONLY), EACCES);
        EXPECT_EQ(errorOfOpening(folder.path(), O_RDONLY | O_DIRECTORY), EACCES);
        EXPECT_EQ(errorOfOpening(folder.path("new"), O_WRONLY | O_CREAT), EACCES);
        EXPECT_EQ(errorOfOpening("/etc/passwd", O_RDONLY), EACCES);
    });
    EXPECT_EQ(errorOfOpening(file, O_RDONLY), 0);
}

TEST_F(LandlockTest, NothingIsRemovedOrRenamed) {
    behindTheWall([&] {
        EXPECT_EQ(errorOf(unlink(file.c_str())), EACCES);
        EXPECT_NE(errorOf(rename(file.c_str(), folder.path("other").c_str())), 0);
        EXPECT_EQ(errorOf(mkdir(folder.path("new").c_str(), 0700)), EACCES);
    });
    EXPECT_EQ(errorOfOpening(file, O_RDONLY), 0);
}

TEST_F(LandlockTest, AFileThatWasOpenBeforeIsRead) {
    const FileDescriptor opened(open(file.c_str(), O_RDONLY | O_CLOEXEC));
    behindTheWall([&] {
        char content[16];
        EXPECT_EQ(pread(opened.number(), content, sizeof content, 0), 7);
    });
}

}  // namespace
