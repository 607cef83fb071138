// Names that are no text, do something to a terminal, or differ less than people can see.
#include "tests/hostile/HostileLibraryTest.h"

namespace {

using namespace testing_support;
using testing::IsEmpty;
using testing::UnorderedElementsAreArray;

using Names = std::vector<std::string>;

std::string longName(const std::string& extension) {
    return std::string(255 - extension.size(), 'n') + extension;
}

// Every one is a name of its own to the file system, and so to the tree.
Names oddNames(const std::string& extension) {
    return {
        "\xff" + extension,                        // no UTF-8
        "half\xe2\x80" + extension,                // a character that is cut off
        "new\nline\r" + extension,                 // rows that are not there
        "red \x1b[31m\x1b]0;title\a" + extension,  // what a terminal obeys
        "c1 \xc2\x9b"
        "2J" +
            extension,  // the same in one character
        "right\xe2\x80\xae"
        "left" +
            extension,                    // order turned round
        "tab\t\x01\x7f" + extension,      // other controls
        longName(extension),              // as long as a name can be
        "   " + extension,                // blanks alone
        " . . " + extension,              // dots that hide nothing
        "caf\xc3\xa9" + extension,        // composed
        "cafe\xcc\x81" + extension,       // decomposed
        "CAF\xc3\x89" + extension,        // in capitals
        "a%2Fb?c#d&<e>\"\\" + extension,  // what URLs and markup read
        "{}{0}%s%n" + extension,          // what formatting reads
    };
}

TEST_F(HostileLibraryTest, EachProjectKeepsItsNameToTheByte) {
    Names movies;
    for (const std::string& name : oddNames(".qnproject")) {
        makeProject(name);
        movies.push_back(name + "/Movies/movie.mov");
    }
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, UnorderedElementsAreArray(oddNames(".qnproject")));
    EXPECT_THAT(library.movies, UnorderedElementsAreArray(movies));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, EachClipAndEventKeepsItsNameToTheByte) {
    Names clips;
    for (const std::string& event : oddNames("")) {
        for (const std::string& name : oddNames(".mov"))
            clips.push_back(event + "/" + name);
    }
    for (const std::string& clip : clips)
        makeClip(clip);
    const FoundLibrary library = load();
    EXPECT_THAT(library.clips, UnorderedElementsAreArray(clips));
    EXPECT_THAT(library.warnings, IsEmpty());
}

TEST_F(HostileLibraryTest, NamesThatBeginWithADotAreHidden) {
    for (const std::string name : {"...", "....qnproject", ".\xff.qnproject", ". .qnproject"})
        makeProject(name);
    for (const std::string name : {".../clip.mov", "Beach/....mov", "Beach/. .mov"})
        makeClip(name);
    const FoundLibrary library = load();
    EXPECT_THAT(library.projects, IsEmpty());
    EXPECT_THAT(library.clips, IsEmpty());
}

// A warning is one line of a terminal and of a log, whatever it names.
TEST_F(HostileLibraryTest, AWarningNamesAnOddPathInOneLine) {
    home_.makeFolder(project("new\nline \x1b[31m\xff.qnproject/Project"));
    const FoundLibrary library = load();
    EXPECT_THAT(library.warnings,
                testing::ElementsAre("cannot open home/Movies/Reelix Projects/"
                                     "new\\x0aline \\x1b[31m\xff.qnproject/Project: Is a directory"));
}

}  // namespace
