// FIFOs, sockets and devices in every place where something else is expected. A scan that opened one would
// not end.
#include "tests/hostile/SpecialFiles.h"

#include "tests/hostile/HostileLibraryTest.h"
#include "tests/support/LoopImage.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

class HostileSpecialFiles : public HostileLibraryTest {
  protected:
    HostileSpecialFiles() {
        makeProject("Good.qnproject");
        makeClip("Beach/good.mov");
    }
    void expectTheRest(const FoundLibrary& library) {
        EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
        EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    }
};

TEST_F(HostileSpecialFiles, AreNoClips) {
    makeSpecialFiles(home_, event("Beach/"), ".mov");
    makeSpecialFiles(home_, event("Beach/"), "");
    home_.makeLink(event("Beach/link.mov"), "fifo.mov");
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileSpecialFiles, AreNeitherProjectsNorFoldersNorEvents) {
    makeSpecialFiles(home_, project(""), ".qnproject");
    makeSpecialFiles(home_, project(""), "");
    makeSpecialFiles(home_, event(""), "");
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileSpecialFiles, AsDocumentsAreOneWarningEach) {
    for (const std::string& made : makeSpecialFiles(home_, project(""), "")) {
        const std::string package = made + ".qnproject";
        home_.makeFolder(package);
        std::rename(home_.path(made).c_str(), home_.path(package + "/Project").c_str());
    }
    home_.makeFolder(project("folder.qnproject/Project"));
    const FoundLibrary library = load();
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    EXPECT_THAT(library.projects, testing::Contains("Good.qnproject"));
    EXPECT_EQ(library.warnings.size(), library.projects.size() - 1);
    for (const std::string& name : library.projects)
        EXPECT_EQ(library.warningsNaming("/" + name + "/Project: "), name == "Good.qnproject" ? 0 : 1)
            << name;
}

// What has the name of a rendered movie counts as one; only real movies are opened.
TEST_F(HostileSpecialFiles, AmongTheMoviesOfAProjectAreNotOpened) {
    makeSpecialFiles(home_, project("Good.qnproject/Movies/"), ".mov");
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.movies, testing::Contains("Good.qnproject/Movies/movie.mov"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileSpecialFiles, AsListsOfHiddenNamesHideNothing) {
    home_.makeFifo(project(".hidden"));
    home_.makeFifo(event(".hidden"));
    makeSocket(home_.path(event("Beach/.hidden")));
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, IsEmpty());
}

// Sidecars are looked for where the file system keeps no attributes.
TEST_F(HostileSpecialFiles, AsSidecarsTellNoDate) {
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const ScopedMount stick = ScopedMount::memory(home_.makeFolder(event("Stick")));
    makeClip("Stick/clip.mov");
    home_.makeFifo(event("Stick/._clip.mov"));
    const FoundLibrary library = load();
    EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov", "Stick/clip.mov"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileSpecialFiles, AsPreferencesAreOneWarning) {
    home_.makeFifo(".config/vexo/com.vexo.suite.plist");
    const FoundLibrary library = load();
    expectTheRest(library);
    ASSERT_THAT(library.warnings, testing::SizeIs(1));
    EXPECT_EQ(library.warningsNaming("home/.config/vexo/com.vexo.suite.plist"), 1);
}

}  // namespace
