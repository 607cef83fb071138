// Symbolic links that lead in circles, out of the library or nowhere.
#include "tests/hostile/HostileLibraryTest.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;

class HostileLinks : public HostileLibraryTest {
  protected:
    HostileLinks() {
        makeProject("Good.qnproject");
        makeClip("Beach/good.mov");
    }
    // What every test expects of the healthy rest.
    void expectTheRest(const FoundLibrary& library) {
        EXPECT_THAT(library.projects, ElementsAre("Good.qnproject"));
        EXPECT_THAT(library.clips, ElementsAre("Beach/good.mov"));
    }
};

TEST_F(HostileLinks, CirclesAreNotEntered) {
    for (const std::string& library : {project(""), event("")}) {
        home_.makeLink(library + "up", "..");
        home_.makeLink(library + "whole", home_.path(library));
        home_.makeFolder(library + "one");
        home_.makeFolder(library + "other");
        home_.makeLink(library + "one/to other", "../other");
        home_.makeLink(library + "other/to one", "../one");
    }
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLinks, ALinkToItselfIsOneWarning) {
    home_.makeLink(project("self.qnproject"), "self.qnproject");
    home_.makeLink(event("Beach/self.mov"), "self.mov");
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, ElementsAre("cannot look at home/Movies/Reelix Events/Beach/self.mov: "
                                              "Too many levels of symbolic links"));
}

TEST_F(HostileLinks, LinksOutOfTheLibraryAreNotEntered) {
    for (const std::string target : {"/", "/proc", "/dev"}) {
        const std::string name = "to " + std::to_string(target.size());
        for (const std::string& library : {project(name), event(name)}) {
            home_.makeLink(library, target);
            home_.makeLink(library + ".qnproject", target);
        }
        home_.makeLink(event("Beach/" + name + ".mov"), target);
    }
    home_.makeLink(event("Beach/kernel messages"), "/proc/kmsg");
    home_.makeLink(event("Beach/endless.mov"), "/dev/zero");
    home_.makeLink(event("Beach/nowhere.mov"), "nowhere");
    const FoundLibrary library = load();
    expectTheRest(library);
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLinks, ALibraryThatIsALinkToAFolderAroundItEnds) {
    home_.remove("Movies");
    home_.writeFile("Elsewhere/P.qnproject/Movies/movie.mov");
    home_.writeFile("Movies/clip.mov");
    home_.makeLink("Movies/Reelix Projects", home_.path());
    home_.makeLink("Movies/Reelix Events", "..");
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, ElementsAre("Elsewhere/P.qnproject"));
    EXPECT_THAT(library.clips, ElementsAre("Movies/clip.mov"));
    EXPECT_THAT(library.warnings, IsEmpty());
}

}  // namespace
