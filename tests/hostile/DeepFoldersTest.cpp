// Folders of projects far below one another. The scan goes as deep as a path can name a folder, which bounds
// what it takes of the stack.
#include <climits>

#include "tests/hostile/DeepFolder.h"
#include "tests/hostile/HostileLibraryTest.h"

namespace {

using namespace testing_support;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

// How deep a library is made that is to be as deep as can be: a look at a path takes as long as the path.
#if VEXO_SANITIZED
constexpr int manyLevels = 500;
#else
constexpr int manyLevels = 1900;
#endif

TEST_F(HostileLibraryTest, ATreeOfTwoHundredLevelsIsWhole) {
    constexpr int levels = 200;
    DeepFolder folder(home_.makeFolder(project("deep")));
    for (int i = 0; i < levels; ++i) {
        folder.descend(1, "level");
        folder.makeProject("project.qnproject");
    }
    const FoundLibrary library = loadUnprinted();
    EXPECT_THAT(library.projects, SizeIs(levels));
    EXPECT_THAT(library.movies, SizeIs(levels));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, AProjectAtTheEndOfAVeryLongPathIsFound) {
    DeepFolder folder(home_.makeFolder(project("deep")));
    folder.descend(manyLevels, "d");
    folder.makeProject("bottom.qnproject");
    const FoundLibrary library = loadUnprinted();
    EXPECT_THAT(library.movies, SizeIs(1));
    EXPECT_THAT(library.warnings, IsEmpty());
}

// Every folder with a path that the kernel takes is in the tree, and the first beyond them is a warning.
TEST_F(HostileLibraryTest, WhatIsTooDeepForAPathIsOneWarning) {
    makeProject("Good.qnproject");
    makeClip("Beach/good.mov");
    DeepFolder folder(home_.makeFolder(project("deep")));
    const std::string name(200, 'd');
    folder.descend(PATH_MAX / 200 + 1, name);
    folder.makeProject("bottom.qnproject");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    ASSERT_THAT(library.warnings, SizeIs(1));
    EXPECT_THAT(library.warnings[0], testing::EndsWith(name + ": File name too long"));
}

TEST_F(HostileLibraryTest, WhatLiesDeepInAnEventIsNotLookedAt) {
    makeClip("Beach/good.mov");
    DeepFolder folder(home_.makeFolder(event("Beach/deep")));
    folder.descend(PATH_MAX / 200 + 1, std::string(200, 'd'));
    const FoundLibrary library = load();
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

}  // namespace
