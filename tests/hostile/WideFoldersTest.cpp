// Folders with more entries than anybody made by hand.
#include <sys/stat.h>

#include "tests/hostile/HostileLibraryTest.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

#if VEXO_SANITIZED
constexpr int veryMany = 10'000;
#else
constexpr int veryMany = 100'000;
#endif
constexpr int many = veryMany / 10;

void makeFiles(const std::string& folder, int count, const std::string& extension) {
    for (int i = 0; i < count; ++i)
        ASSERT_EQ(mknod((folder + "/" + std::to_string(i) + extension).c_str(), S_IFREG | 0600, 0), 0);
}

TEST_F(HostileLibraryTest, AClipAmongVeryManyOtherFilesIsFound) {
    makeClip("Beach/good.mov");
    makeFiles(home_.path(event("Beach")), veryMany, ".txt");
    const FoundLibrary library = loadUnprinted();
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, AProjectAmongManyFilesIsFound) {
    makeProject("Good.qnproject");
    makeFiles(home_.path(project("")), many, ".qnproject");
    const FoundLibrary library = loadUnprinted();
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, AProjectOfManyMoviesHasThemAll) {
    makeFiles(home_.makeFolder(project("P.qnproject/Movies")), many / 10, ".mov");
    EXPECT_THAT(loadUnprinted().movies, testing::SizeIs(many / 10));
}

TEST_F(HostileLibraryTest, ManyClipsInAnEventAreAllPrinted) {
    makeFiles(home_.makeFolder(event("Beach")), many / 10, ".mov");
    EXPECT_THAT(load().clips, testing::SizeIs(many / 10));
}

TEST_F(HostileLibraryTest, ManyFoldersInALibraryAreAllThere) {
    constexpr int folders = 300;
    for (int i = 0; i < folders; ++i) {
        home_.makeFolder(project(std::to_string(i) + ".qnproject"));
        makeClip(std::to_string(i) + "/clip.mov");
    }
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, testing::SizeIs(folders));
    EXPECT_THAT(library.clips, testing::SizeIs(folders));
    EXPECT_THAT(library.warnings, IsEmpty());
}

}  // namespace
