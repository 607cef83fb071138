// The folders of the libraries themselves as something else, or out of reach.
#include <sys/stat.h>

#include "tests/hostile/HostileLibraryTest.h"
#include "tests/hostile/SpecialFiles.h"
#include "tests/support/OrdinaryUser.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

class HostileLibraryFolders : public HostileLibraryTest {
  protected:
    void expectNoProjectsAndAWarning(const std::string& reason) {
        const FoundLibrary library = load();
        EXPECT_THAT(library.projects, IsEmpty());
        EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
        EXPECT_THAT(library.warnings, ElementsAre("cannot list home/Movies/Reelix Projects: " + reason));
    }
    void expectNoEventsAndAWarning(const std::string& reason) {
        const FoundLibrary library = load();
        EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
        EXPECT_THAT(library.clips, IsEmpty());
        EXPECT_THAT(library.warnings, ElementsAre("cannot list home/Movies/Reelix Events: " + reason));
    }
};

TEST_F(HostileLibraryFolders, AFileIsNoProjectLibrary) {
    makeClip("Beach/good.mov");
    home_.writeFile("Movies/Reelix Projects", "no folder");
    expectNoProjectsAndAWarning("Not a directory");
}

TEST_F(HostileLibraryFolders, AFifoIsNoProjectLibrary) {
    makeClip("Beach/good.mov");
    home_.makeFifo("Movies/Reelix Projects");
    expectNoProjectsAndAWarning("Not a directory");
}

TEST_F(HostileLibraryFolders, AFifoIsNoEventLibrary) {
    makeProject("Good.qnproject");
    home_.makeFifo("Movies/Reelix Events");
    expectNoEventsAndAWarning("Not a directory");
}

TEST_F(HostileLibraryFolders, ASocketIsNoEventLibrary) {
    makeProject("Good.qnproject");
    makeSocket(home_.path("Movies/Reelix Events"));
    expectNoEventsAndAWarning("Not a directory");
}

TEST_F(HostileLibraryFolders, ALinkThatLeadsNowhereIsAMissingLibrary) {
    makeProject("Good.qnproject");
    home_.makeLink("Movies/Reelix Events", "nowhere");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryFolders, ALinkToItselfIsNoEventLibrary) {
    makeProject("Good.qnproject");
    home_.makeLink("Movies/Reelix Events", "Reelix Events");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_EQ(library.warningsNaming("home/Movies/Reelix Events: Too many levels"), 1);
}

// Takes every right to entries away, from a user whom that holds back.
class UnreadableFolders : public HostileLibraryTest {
  protected:
    FoundLibrary loadWithout(const std::vector<std::string>& unreadable, mode_t rights = 0) {
        for (const std::string& path : unreadable)
            EXPECT_EQ(chmod(home_.path(path).c_str(), rights), 0) << path;
        const FoundLibrary library = loadAsOrdinaryUser();
        for (const std::string& path : unreadable)
            EXPECT_EQ(chmod(home_.path(path).c_str(), 0700), 0) << path;  // else nobody can remove them
        return library;
    }

  private:
    FoundLibrary loadAsOrdinaryUser() {
        const OrdinaryUser somebody(home_.path());
        return load();
    }
};

TEST_F(UnreadableFolders, HideNothingBesideThem) {
    makeProject("Good.qnproject");
    makeProject("Closed/Lost.qnproject");
    makeProject("Open/Good.qnproject");
    makeClip("Beach/good.mov");
    makeClip("Closed/lost.mov");
    const FoundLibrary library = loadWithout({project("Closed"), event("Closed")});
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject", "Open/Good.qnproject"));
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    EXPECT_THAT(library.warnings, testing::UnorderedElementsAre(
                                      "cannot list home/Movies/Reelix Projects/Closed: Permission denied",
                                      "cannot list home/Movies/Reelix Events/Closed: Permission denied"));
}

TEST_F(UnreadableFolders, WithinAProjectTakeOnlyItsMovies) {
    makeProject("Good.qnproject");
    makeProject("Closed.qnproject");
    const FoundLibrary library = loadWithout({project("Closed.qnproject/Movies")});
    EXPECT_THAT(library.projects, ElementsAre("Closed.qnproject", "Good.qnproject"));
    EXPECT_THAT(library.movies, ElementsAre("Good.qnproject/Movies/movie.mov"));
    EXPECT_THAT(
        library.warnings,
        ElementsAre("cannot list home/Movies/Reelix Projects/Closed.qnproject/Movies: Permission denied"));
}

TEST_F(UnreadableFolders, AsALibraryAreOneWarning) {
    makeProject("Good.qnproject");
    makeClip("Beach/lost.mov");
    const FoundLibrary library = loadWithout({event("")});
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_THAT(library.clips, IsEmpty());
    EXPECT_THAT(library.warnings, ElementsAre("cannot list home/Movies/Reelix Events: Permission denied"));
}

// The names can be read, and nothing else.
TEST_F(UnreadableFolders, ThatCanOnlyBeListedAreOneWarningForEachEntry) {
    makeProject("Good.qnproject");
    makeClip("Beach/good.mov");
    makeClip("Closed/one.mov");
    makeClip("Closed/two.mov");
    const FoundLibrary library = loadWithout({event("Closed")}, S_IRUSR | S_IRGRP | S_IROTH);
    EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    EXPECT_THAT(library.warnings, testing::SizeIs(2));
    EXPECT_EQ(library.warningsNaming("home/Movies/Reelix Events/Closed/one.mov: Permission denied"), 1);
    EXPECT_EQ(library.warningsNaming("home/Movies/Reelix Events/Closed/two.mov: Permission denied"), 1);
}

TEST_F(UnreadableFolders, ADocumentThatMayNotBeReadMakesNoTrailer) {
    makeProject("Closed.qnproject");
    home_.writeFile(project("Closed.qnproject/Project"), "anything");
    const FoundLibrary library = loadWithout({project("Closed.qnproject/Project")});
    EXPECT_THAT(library.movies, ElementsAre("Closed.qnproject/Movies/movie.mov"));
    EXPECT_THAT(library.warnings,
                ElementsAre("cannot open home/Movies/Reelix Projects/Closed.qnproject/Project: "
                            "Permission denied"));
}

}  // namespace
