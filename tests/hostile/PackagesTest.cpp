// Folders that look like files, files that look like folders, and packages within packages.
#include "tests/hostile/HostileLibraryTest.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(HostileLibraryTest, APackageWithNothingInItIsAProjectWithoutMovies) {
    home_.makeFolder(project("Empty.qnproject"));
    home_.writeFile(project("File.qnproject"), "no folder");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Empty.qnproject"));
    EXPECT_THAT(library.movies, IsEmpty());
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, PackagesWithinPackagesAreNotEntered) {
    makeProject("Outer.qnproject");
    makeProject("Outer.qnproject/Inner.qnproject");
    makeProject("Outer.qnproject/Movies/Inner.qnproject");
    makeProject("Program.app/Inner.qnproject");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Outer.qnproject"));
    EXPECT_THAT(library.movies, ElementsAre("Outer.qnproject/Movies/movie.mov"));
}

TEST_F(HostileLibraryTest, AFolderNamedLikeAMovieHoldsProjects) {
    makeProject("Folder.mov/P.qnproject");
    makeProject("Folder.mov/Deeper.m4v/Q.qnproject");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Folder.mov/Deeper.m4v/Q.qnproject", "Folder.mov/P.qnproject"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

// By its name it is a movie of the project; it has no size, so it never stands for the project.
TEST_F(HostileLibraryTest, AFolderNamedLikeAMovieStandsForNoProject) {
    home_.makeFolder(project("P.qnproject/Movies/folder.mov/deeper.mov"));
    home_.writeFile(project("P.qnproject/Movies/real.mov"), "x");
    withHost([&](vexo::Host& host) {
        host.startLoading();
        ASSERT_TRUE(host.waitUntilLoaded(std::chrono::minutes(1)));
        const auto root = host.plugins().front().manager->rootMediaGroup();
        ASSERT_EQ(root->mediaObjects().size(), 1u);
        EXPECT_EQ(root->mediaObjects()[0]->path(), home_.path(project("P.qnproject/Movies/real.mov")));
    });
    EXPECT_THAT(load().warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, AFolderNamedLikeAMovieIsAnEventAndNoClip) {
    makeClip("Event.mov/clip.mov");
    makeClip("Event.mov/folder.mov/too deep.mov");
    makeClip("Event.qnproject/clip.mov");
    EXPECT_THAT(load().clips, ElementsAre("Event.mov/clip.mov", "Event.qnproject/clip.mov"));
}

}  // namespace
