// What copies of items and groups put on the pasteboard, as scripts get it from the real program.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/support/FileContent.h"
#include "tests/support/Program.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using Json = nlohmann::json;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;
using testing_support::contentOf;
using testing_support::isOneLine;
using testing_support::Outcome;

using Arguments = std::vector<std::string>;

constexpr const char* projectsType = "VXReelixProjectsPboardType";

class CopyCommandTest : public testing::Test {
  protected:
    std::string projectPath(const std::string& name) const {
        return home.path("Movies/Reelix Projects/" + name + ".qnproject");
    }
    std::string makeMovie(const std::string& project, const std::string& name,
                          const std::string& content = "movie") {
        return home.writeFile("Movies/Reelix Projects/" + project + ".qnproject/Movies/" + name, content);
    }
    std::string makeClip(const std::string& event) {
        return home.writeFile("Movies/Reelix Events/" + event + "/clip-2008-07-01 12;00;00.mov", "clip");
    }

    Outcome copy(Arguments arguments) const {
        arguments.insert(arguments.begin(), {"--home", home.path(), "copy"});
        return testing_support::runVexo(arguments);
    }
    // The document of a copy that succeeds.
    Json document(Arguments arguments) const {
        arguments.push_back("--json");
        const Outcome outcome = copy(arguments);
        EXPECT_EQ(outcome.status, 0) << outcome.errors;
        return Json::parse(outcome.output);
    }
    Outcome inShell(const std::string& arguments) const {
        return testing_support::runProgram(
            "sh", {"-c", VEXO_BIN_DIR "/vexo --home '" + home.path() + "' copy " + arguments});
    }
    static void expectRefusal(const Outcome& outcome, int status, const std::string& reason) {
        EXPECT_EQ(outcome.status, status);
        EXPECT_THAT(outcome.errors, AllOf(StartsWith("vexo: "), HasSubstr(reason)));
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
        EXPECT_EQ(outcome.output, "");
    }

    testing_support::TemporaryFolder home;
};

TEST_F(CopyCommandTest, AnItemBringsItsFileAndItsProject) {
    const std::string movie = makeMovie("Film", "a b.mov");
    const Json answer = document({"--object", movie});
    EXPECT_EQ(answer["result"], true);
    EXPECT_EQ(answer["types"]["text/plain"], movie);
    EXPECT_EQ(answer["types"]["text/uri-list"],
              "file://" + home.path("Movies/Reelix%20Projects/Film.qnproject/Movies/a%20b.mov") + "\r\n");
    EXPECT_EQ(answer["types"][projectsType],
              (Json{{"ProjectList",
                     {{{"ProjectName", "Film"},
                       {"ProjectPath", projectPath("Film")},
                       {"RenderedVersions", {{{"Name", "a b"}, {"Path", movie}}}}}}}}));
}

TEST_F(CopyCommandTest, ARenderedVersionTellsItsSizeAndLength) {
    home.makeFolder("Movies/Reelix Projects/Film.qnproject/Movies");
    testing_support::makeSampleMovie(projectPath("Film") + "/Movies/a.mov",
                                     {.size = "640x360", .seconds = 2});
    const Json answer = document({"--group", projectPath("Film")});
    const Json& version = answer["types"][projectsType]["ProjectList"][0]["RenderedVersions"][0];
    EXPECT_EQ(version["Dimensions"], "{640, 360}");
    EXPECT_EQ(version["Duration"], 2.0);
    EXPECT_TRUE(version["Duration"].is_number_float());
}

TEST_F(CopyCommandTest, AGroupOfAProjectBringsOneMovieAndAllVersions) {
    makeMovie("Film", "a.mov");
    makeMovie("Film", "b.mov");
    makeMovie("Film", "c.mov");
    const Json answer = document({"--group", projectPath("Film")});
    EXPECT_TRUE(isOneLine(answer["types"]["text/uri-list"].get<std::string>()));
    EXPECT_EQ(answer["types"][projectsType]["ProjectList"][0]["RenderedVersions"].size(), 3u);
}

TEST_F(CopyCommandTest, SeveralAreCopiedInTheOrderGiven) {
    const std::string first = makeClip("First");
    const std::string second = makeClip("Second");
    EXPECT_EQ(document({"--object", second, first})["types"]["text/plain"], second + "\n" + first);
    EXPECT_EQ(document({"--object", first, "--object", second})["types"]["text/plain"],
              first + "\n" + second);
    const std::string firstEvent = home.path("Movies/Reelix Events/First");
    const std::string secondEvent = home.path("Movies/Reelix Events/Second");
    EXPECT_EQ(document({"--group", secondEvent, firstEvent})["types"]["text/plain"],
              secondEvent + "\n" + firstEvent);
}

TEST_F(CopyCommandTest, AURLNamesWhatAnIDNames) {
    const std::string movie = makeMovie("Film", "\xFF.mov");
    const std::string url = "file://" + home.path("Movies/Reelix%20Projects/Film.qnproject/Movies/%FF.mov");
    EXPECT_EQ(document({"--object", url})["types"]["text/uri-list"], url + "\r\n");
    EXPECT_EQ(document({"--object", movie})["types"]["text/uri-list"], url + "\r\n");
}

TEST_F(CopyCommandTest, OfFilesThatArePrintedAlikeTheOneThatIsNamedIsCopied) {
    const std::string one = makeMovie("Film", "\xFE.mov");
    const std::string other = makeMovie("Film", "\xFF.mov");
    EXPECT_THAT(copy({"--object", one, "--type", "text/uri-list"}).output, HasSubstr("%FE.mov"));
    EXPECT_THAT(copy({"--object", other, "--type", "text/uri-list"}).output, HasSubstr("%FF.mov"));
}

TEST_F(CopyCommandTest, AnIDThatWasPrintedNamesTheFirstThatIsPrintedSo) {
    makeMovie("Film", "\xFF.mov");
    const Json answer = document({"--object", projectPath("Film") + "/Movies/\uFFFD.mov"});
    EXPECT_THAT(answer["types"]["text/uri-list"].get<std::string>(), HasSubstr("%FF.mov"));
}

TEST_F(CopyCommandTest, AnEventClipLeavesAnEmptyListOfProjects) {
    const std::string clip = makeClip("Trip");
    const Json answer = document({"--object", clip});
    EXPECT_EQ(answer["result"], true);
    EXPECT_EQ(answer["types"][projectsType], Json::object());
    EXPECT_EQ(answer["types"]["text/plain"], clip);
}

TEST_F(CopyCommandTest, NothingToCopyIsNoError) {
    makeClip("Trip");
    EXPECT_EQ(document({"--group", "2008"}), (Json{{"result", false}, {"types", Json::object()}}));
    const Outcome text = copy({"--group", "2008"});
    EXPECT_EQ(text.status, 0);
    EXPECT_EQ(text.output, "nothing to copy\n");
}

TEST_F(CopyCommandTest, OneTypeIsWrittenByteForByte) {
    const std::string movie = makeMovie("Film", "a\xFF.mov");
    const std::string url = "file://" + home.path("Movies/Reelix%20Projects/Film.qnproject/Movies/a%FF.mov");
    EXPECT_EQ(copy({"--object", movie, "--type", "text/uri-list"}).output, url + "\r\n");
    EXPECT_EQ(copy({"--object", movie, "--type", "x-special/gnome-copied-files"}).output, "copy\n" + url);
    EXPECT_EQ(copy({"--object", movie, "--type", "text/plain"}).output, url);
}

TEST_F(CopyCommandTest, PythonReadsThePropertyListAndFindsTheFiles) {
    const std::string names[] = {"a b%20.mov", "new\nline.mov", "\xFF.mov", "]]>.mov", "\x01.mov"};
    for (const std::string& name : names)
        makeMovie("Film", name, "content of " + name);
    const std::string list = home.path("list.plist");
    ASSERT_EQ(copy({"--group", projectPath("Film"), "--type", projectsType, "-o", list}).status, 0);
    const Outcome python = testing_support::runProgram(
        "python3", {"-c",
                    "import os, plistlib, sys\n"
                    "[project] = plistlib.load(open(sys.argv[1], 'rb'))['ProjectList']\n"
                    "paths = [os.fsencode(version['Path']) for version in project['RenderedVersions']]\n"
                    "for path in paths:\n"
                    "    assert open(path, 'rb').read() == b'content of ' + os.path.basename(path)\n"
                    "print(len(paths))\n",
                    list});
    EXPECT_EQ(python.output, "5\n") << python.errors;
}

TEST_F(CopyCommandTest, AnotherConverterReadsThePropertyList) {
    const std::string movie = makeMovie("Film", "\xFF<&>.mov");
    const std::string list = home.path("list.plist");
    ASSERT_EQ(copy({"--object", movie, "--type", projectsType, "-o", list}).status, 0);
    const Outcome outcome =
        testing_support::runProgram("plistutil", {"-f", "bin", "-i", list, "-o", home.path("bin")});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    EXPECT_THAT(contentOf(home.path("bin")), AllOf(StartsWith("bplist00"), HasSubstr("\xFF<&>.mov")));
}

TEST_F(CopyCommandTest, TextListsEachTypeWithWhatItHolds) {
    const std::string movie = makeMovie("Film", "a.mov");
    const std::string url = "file://" + home.path("Movies/Reelix%20Projects/Film.qnproject/Movies/a.mov");
    EXPECT_EQ(copy({"--object", movie}).output,
              "text/uri-list\n"
              "  " +
                  url +
                  "\n"
                  "x-special/gnome-copied-files\n"
                  "  copy\n"
                  "  " +
                  url +
                  "\n"
                  "text/plain\n"
                  "  " +
                  movie +
                  "\n"
                  "VXReelixProjectsPboardType\n"
                  "  ProjectList:\n"
                  "    - ProjectName: Film\n"
                  "      ProjectPath: " +
                  projectPath("Film") +
                  "\n"
                  "      RenderedVersions:\n"
                  "        - Name: a\n"
                  "          Path: " +
                  movie + "\n");
}

TEST_F(CopyCommandTest, TextShowsAnEmptyPropertyList) {
    EXPECT_THAT(copy({"--object", makeClip("Trip")}).output,
                HasSubstr("VXReelixProjectsPboardType\n  (empty)\n"));
}

TEST_F(CopyCommandTest, TextPassesNoControlCharacterOn) {
    const std::string movie = makeMovie("Evil\x1B[2J\r\n\x07", "a\x1B]0;title\x07\u009B\u202E\n.mov");
    const std::string text = copy({"--object", movie}).output;
    EXPECT_THAT(text, HasSubstr("\u241B"));
    for (const char c : text)
        EXPECT_TRUE(c == '\n' || static_cast<unsigned char>(c) >= 0x20) << static_cast<int>(c);
    EXPECT_THAT(text, AllOf(Not(HasSubstr("\u009B")), Not(HasSubstr("\u202E"))));
    EXPECT_THAT(text,
                HasSubstr("      ProjectPath: " + projectPath("Evil\u241B[2J\u240D\u240A\u2407") + "\n"));
}

TEST_F(CopyCommandTest, JSONIsUTF8WhateverTheNames) {
    const std::string movie = makeMovie("F\xFF", "\xC3.mov");
    const Json answer = document({"--object", movie});
    EXPECT_EQ(answer["types"][projectsType]["ProjectList"][0]["ProjectPath"], projectPath("F\uFFFD"));
}

// --- Refusals ----------------------------------------------------------------------------------------------

TEST_F(CopyCommandTest, WhatIsNotThereIsNamedOnOneLine) {
    const std::string movie = makeMovie("Film", "a.mov");
    expectRefusal(copy({"--object", movie, "/no\nsuch"}), 1, "no item with the ID or URL '/no");
    expectRefusal(copy({"--group", "nosuch", "--json"}), 1, "no group with the ID or URL 'nosuch'");
    expectRefusal(copy({"--group", movie}), 1, "no group with");
    expectRefusal(copy({"--object", "[a,b]"}), 1, "no item with the ID or URL '[a,b]'");
    expectRefusal(copy({"--group", "[]"}), 1, "no group with the ID or URL '[]'");
    expectRefusal(copy({"--object", movie, "--type", "image/png\x1B"}), 1,
                  "the type 'image/png\u241B' is not among those copied: text/uri-list, ");
    makeClip("Trip");
    expectRefusal(copy({"--group", "2008", "--type", "text/plain"}), 1, "there is none");
}

TEST_F(CopyCommandTest, ALineThatSaysNotWhatToCopyIsWrong) {
    expectRefusal(copy({}), 2, "--object");
    expectRefusal(copy({"--object", "/a", "--group", "/b"}), 2, "--group");
    expectRefusal(copy({"--object"}), 2, "--object");
}

// --- Files -------------------------------------------------------------------------------------------------

TEST_F(CopyCommandTest, AFileGetsWhatTheOutputWouldHaveGot) {
    const std::string movie = makeMovie("Film", "a.mov");
    for (const Arguments& form : {Arguments{}, Arguments{"--json"}, Arguments{"--type", projectsType}}) {
        Arguments arguments{"--object", movie};
        arguments.insert(arguments.end(), form.begin(), form.end());
        const std::string answer = copy(arguments).output;
        const std::string file = home.writeFile("answer", "an answer from before");
        arguments.insert(arguments.end(), {"-o", file});
        const Outcome outcome = copy(arguments);
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.output, "");
        EXPECT_NE(answer, "");
        EXPECT_EQ(contentOf(file), answer);
    }
}

TEST_F(CopyCommandTest, AFileThatCannotBeWrittenIsNamedAndNothingIsLeft) {
    const std::string movie = makeMovie("Film", "a.mov");
    const std::string folder = home.makeFolder("out");
    expectRefusal(copy({"--object", movie, "-o", folder}), 1, "cannot write '" + folder + "'");
    expectRefusal(copy({"--object", movie, "-o", folder + "/no\nsuch/file"}), 1, "cannot write");
    expectRefusal(copy({"--object", movie, "-o", ""}), 1, "has no name");
    expectRefusal(copy({"--object", movie, "-o", "/dev/full"}), 1, "No space left");
    EXPECT_TRUE(std::filesystem::is_empty(folder));
}

TEST_F(CopyCommandTest, WhatIsNotThereLeavesTheFileAlone) {
    const std::string file = home.writeFile("answer", "from before");
    expectRefusal(copy({"--object", "nosuch", "-o", file}), 1, "no item");
    EXPECT_EQ(contentOf(file), "from before");
}

TEST_F(CopyCommandTest, TheOutputUnderItsOtherNamesKeepsWhatIsBeforeAndAfter) {
    const std::string movie = makeMovie("Film", "a.mov");
    for (const std::string name : {"-", "/dev/stdout", "/dev/fd/1", "/proc/self/fd/1"}) {
        const std::string file = home.writeFile("answer", "before ");
        const Outcome outcome = inShell("--type text/plain --object '" + movie + "' -o " + name + " >> '" +
                                        file + "'; echo ' after' >> '" + file + "'");
        EXPECT_EQ(outcome.errors, "");
        EXPECT_EQ(contentOf(file), "before " + movie + " after\n") << name;
    }
    EXPECT_EQ(inShell("--type text/plain --object '" + movie + "' -o /dev/stdout | cat").output, movie);
}

TEST_F(CopyCommandTest, AnOutputThatCannotBeWrittenIsStatus1) {
    const std::string movie = makeMovie("Film", "a.mov");
    expectRefusal(inShell("--object '" + movie + "' > /dev/full"), 1, "cannot be written");
    expectRefusal(inShell("--object '" + movie + "' -o - > /dev/full"), 1, "No space left");
}

}  // namespace
