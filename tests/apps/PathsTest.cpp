#include "apps/vexo/Paths.h"

#include <gtest/gtest.h>

#include <filesystem>

namespace {

TEST(AbsolutePath, BeginsAtTheWorkingFolder) {
    const std::string here = std::filesystem::current_path();
    EXPECT_EQ(vexo::absolutePath("clip.mov"), here + "/clip.mov");
    EXPECT_EQ(vexo::absolutePath("./a//b/./clip.mov"), here + "/a/b/clip.mov");
    EXPECT_EQ(vexo::absolutePath("."), here);
}

TEST(AbsolutePath, HasNoSlashAtItsEnd) {
    EXPECT_EQ(vexo::absolutePath("/a/b//"), "/a/b");
    EXPECT_EQ(vexo::absolutePath("/"), "/");
    EXPECT_EQ(vexo::absolutePath("/a/.."), "/a/..");
}

TEST(AbsolutePath, LeavesTheWayUpToTheFileSystem) {
    EXPECT_EQ(vexo::absolutePath("/a/link/../b"), "/a/link/../b");
}

}  // namespace
