// The demo command, run as people run it: the real program in a process of its own.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <ctime>
#include <filesystem>
#include <iterator>
#include <map>
#include <memory>
#include <nlohmann/json.hpp>
#include <set>
#include <string>
#include <vector>

#include "tests/support/FileContent.h"
#include "tests/support/Program.h"
#include "tests/support/TemporaryFolder.h"

namespace {

namespace fs = std::filesystem;
using Json = nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::StartsWith;
using testing_support::contentOf;
using testing_support::Outcome;
using testing_support::runProgram;
using testing_support::ScopedEnvironment;
using testing_support::TemporaryFolder;

constexpr const char* projectLibrary = "Movies/Reelix Projects/";
constexpr const char* eventLibrary = "Movies/Reelix Events/";
constexpr const char* oddName = "Lena’s \"Best Of\" 🎬\n(final)";
constexpr const char* longName =
    "The Complete and Unabridged Story of How We Repainted the Kitchen, Lost the Cat, Found It Again and "
    "Decided to "
    "Move House";

const std::string realProgram = std::string(VEXO_BIN_DIR) + "/vexo";

// Every file and every folder without entries, relative to `folder`, sorted.
std::vector<std::string> listing(const std::string& folder) {
    std::vector<std::string> paths;
    for (const fs::directory_entry& entry : fs::recursive_directory_iterator(folder)) {
        if (!entry.is_directory() || fs::is_empty(entry))
            paths.push_back(entry.path().lexically_relative(folder));
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

// Tests that look at one sample home, which is made once.
class DemoHomeTest : public testing::Test {
  protected:
    static void SetUpTestSuite() {
        temporary_ = std::make_unique<TemporaryFolder>();
        made_ = runProgram(realProgram, {"demo", home()});
    }
    static void TearDownTestSuite() { temporary_.reset(); }
    void SetUp() override { ASSERT_EQ(made_.status, 0) << made_.errors; }

    static std::string home() { return temporary_->path("it's home"); }
    static std::string project(const std::string& name) {
        return home() + "/" + projectLibrary + name + ".qnproject";
    }
    static std::string event(const std::string& name) { return home() + "/" + eventLibrary + name; }

    static bool keepsAttributes() {
        const std::string probe = temporary_->writeFile("probe");
        return setxattr(probe.c_str(), "user.date", "", 0, 0) == 0;
    }
    static Json tree(const std::vector<std::string>& options = {}) {
        std::vector<std::string> arguments{"--home", home(), "tree", "--json"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const Outcome outcome = runProgram(realProgram, arguments);
        EXPECT_EQ(outcome.status, 0) << outcome.errors;
        return Json::parse(outcome.output, nullptr, /*allow_exceptions=*/false);
    }

    static inline std::unique_ptr<TemporaryFolder> temporary_;
    static inline Outcome made_;
};

TEST_F(DemoHomeTest, HoldsProjectsAndEventsOfEveryKind) {
    const std::string projects = projectLibrary;
    const std::string events = eventLibrary;
    std::vector<std::string> expected{
        projects + "Alps 2009.qnproject/Movies/HD.mov",
        projects + "Alps 2009.qnproject/Movies/Medium.mov",
        projects + "Alps 2009.qnproject/Movies/Mobile.m4v",
        projects + "Alps 2009.qnproject/Movies/Tiny.3gp",
        projects + "Alps 2009.qnproject/Project",
        projects + "Coming Soon.qnproject/Project",
        projects + "Cutting Room.qnproject/Project",
        projects + "Family/2008/First Steps.qnproject/Movies/Mobile.3gp",
        projects + "Family/2008/First Steps.qnproject/Project",
        projects + "Family/Grandma’s 80th Birthday.qnproject/Movies/Mobile.m4v",
        projects + "Family/Grandma’s 80th Birthday.qnproject/Project",
        projects + oddName + ".qnproject/Movies/Mobile.m4v",
        projects + oddName + ".qnproject/Project",
        projects + "Skate Park.qnproject/Movies/Medium.mov",
        projects + "Skate Park.qnproject/Project",
        projects + "Summer Blockbuster.qnproject/Movies/HD.mov",
        projects + "Summer Blockbuster.qnproject/Project",
        projects + longName + ".qnproject/Movies/Medium.mov",
        projects + longName + ".qnproject/Project",
        events + ".Import/M2U00017.mp4",
        events + "Beach Holiday/clip-2009-07-04 18;30;05.mov",
        events + "Beach Holiday/clip-2009-07-05 09;12;44.mov",
        events + "Beach Holiday/clip-2009-07-05 09;31;02.mov",
        events + "Birthday/Birthday.mp4",
        events + "Birthday/Cake 🎂 \"slow motion\" \x1b[7m.m4v",
        events + "Camping/clip-2012-06-30 07;45;00.3gp",
        events + "Camping/clip-2012-06-30 21;15;33.mp4",
        events + "Concert/clip-2011-10-08 21;40;00.mov",
        events + "New Year’s Eve/MVI_0412.mov",
        events + "New Year’s Eve/MVI_0413.mov",
        events + "School Play/clip-2010-05-21 19;02;30.m4v",
        events + "School Play/clip-2010-05-21 19;48;09.m4v",
        events + "Shot Lists/Next summer.txt",
        events + "Ski Trip/M2U00017.mp4",
        events + "Ski Trip/M2U00018.mp4",
    };
    std::sort(expected.begin(), expected.end());
    EXPECT_EQ(listing(home()), expected);
}

TEST_F(DemoHomeTest, MoviesAreWholeFilesOfTheirFormat) {
    for (const std::string& path : listing(home())) {
        const std::string extension = fs::path(path).extension();
        if (extension == ".txt" || extension.empty())
            continue;
        EXPECT_EQ(contentOf(home() + "/" + path).substr(4, 4), "ftyp") << path;
    }
}

TEST_F(DemoHomeTest, StaysBelowThreeMegabytes) {
    std::uintmax_t bytes = 0;
    for (const std::string& path : listing(home()))
        bytes += fs::file_size(home() + "/" + path);
    EXPECT_LT(bytes, 3'000'000u);
}

TEST_F(DemoHomeTest, IsAsReadableAsAnyNewFolder) {
    const std::string ordinary = temporary_->makeFolder("ordinary");
    EXPECT_EQ(fs::status(home()).permissions(), fs::status(ordinary).permissions());
}

TEST_F(DemoHomeTest, OnlyOneDocumentIsXML) {
    EXPECT_THAT(contentOf(project("Skate Park") + "/Project"), StartsWith("<?xml"));
    for (const char* name : {"Alps 2009", "Coming Soon", "Cutting Room", "Family/2008/First Steps",
                             "Family/Grandma’s 80th Birthday", oddName, "Summer Blockbuster", longName})
        EXPECT_THAT(contentOf(project(name) + "/Project"), StartsWith("bplist00")) << name;
}

// Follows the references of an archive from its root, whichever form they have, and prints what it finds.
constexpr const char* archiveReader = R"(
import plistlib, sys
archive = plistlib.load(open(sys.argv[1], 'rb'))
assert archive['$archiver'] == 'NSKeyedArchiver' and archive['$version'] == 100000
records = archive['$objects']
assert records[0] == '$null'

def number(reference):
    return reference['CF$UID'] if isinstance(reference, dict) else reference.data

def follow(reference):
    return records[number(reference)]

def entries(dictionary):
    assert 'NSDictionary' in follow(dictionary['$class'])['$classes']
    return {follow(k): follow(v) for k, v in zip(dictionary['NS.keys'], dictionary['NS.objects'])}

classes = {r['$classname'] for r in records if isinstance(r, dict) and '$classname' in r}
assert number(archive['$top']['root']) == 1
root = entries(follow(archive['$top']['root']))
info = entries(root['editInfo'])
clips = follow(root['timeline']['clips'])['NS.objects']
assert info['playhead'] is follow(clips[0])
assert follow(follow(clips[0])['timeline']) is root['timeline']
print('trailer' if 'trailer' in info else 'project', ' '.join(sorted(c for c in classes if c.startswith('QN'))))
)";

TEST_F(DemoHomeTest, OtherReadersOfPropertyListsUnderstandItsDocuments) {
    if (runProgram("python3", {"-c", "import plistlib"}).status != 0)
        GTEST_SKIP() << "needs python3";
    const std::string ofProject = "project QNClip QNTimeline QNTitle QNTitleStyle\n";
    const std::string ofTrailer = "trailer QNClip QNStoryboard QNTimeline QNTitle QNTitleStyle\n";
    const std::map<std::string, std::string> expected{{"Alps 2009", ofProject},
                                                      {"Coming Soon", ofTrailer},
                                                      {"Cutting Room", ofProject},
                                                      {"Family/2008/First Steps", ofProject},
                                                      {"Family/Grandma’s 80th Birthday", ofProject},
                                                      {oddName, ofProject},
                                                      {"Skate Park", ofProject},
                                                      {"Summer Blockbuster", ofTrailer},
                                                      {longName, ofProject}};
    for (const auto& [name, content] : expected) {
        const Outcome read = runProgram("python3", {"-c", archiveReader, project(name) + "/Project"});
        EXPECT_EQ(read.output, content) << name << "\n" << read.errors;
    }
}

TEST_F(DemoHomeTest, PackagesWereChangedInThePast) {
    struct stat status;
    ASSERT_EQ(stat(project("Alps 2009").c_str(), &status), 0);
    char text[32];
    std::tm local;
    std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", localtime_r(&status.st_mtime, &local));
    EXPECT_STREQ(text, "2009-08-23 20:15:00");
}

std::string dateAttribute(const std::string& path) {
    char text[100];
    const ssize_t length = getxattr(path.c_str(), "user.date", text, sizeof text);
    return length < 0 ? "none" : std::string(text, static_cast<std::size_t>(length));
}

TEST_F(DemoHomeTest, SomeClipsCarryTheirDateAsAnAttribute) {
    if (!keepsAttributes())
        GTEST_SKIP() << "the temporary folder's file system keeps no extended attributes";
    EXPECT_EQ(dateAttribute(event("Ski Trip/M2U00017.mp4")), "2007-02-17 10;15;00");
    EXPECT_EQ(dateAttribute(event("Ski Trip/M2U00018.mp4")), "2007-02-18 14;08;21");
    EXPECT_EQ(dateAttribute(event("New Year’s Eve/MVI_0412.mov")), "2008-12-31 23;59;59");
    EXPECT_EQ(dateAttribute(event("New Year’s Eve/MVI_0413.mov")), "2009-01-01 00;04;12");
    EXPECT_EQ(dateAttribute(event("Concert/clip-2011-10-08 21;40;00.mov")), "2012-10-06 21;41;10");
    EXPECT_EQ(dateAttribute(event("Camping/clip-2012-06-30 07;45;00.3gp")), "none");
    EXPECT_EQ(dateAttribute(event("Birthday/Birthday.mp4")), "none");
}

TEST_F(DemoHomeTest, TheAnswerSaysWhatWasMadeAndWhatToRunNext) {
    EXPECT_EQ(made_.errors, "");
    EXPECT_THAT(made_.output, StartsWith("Made a sample home in " + home() +
                                         ": 9 projects, 2 of them trailers, and 7 events, with 25 movies ("));
    std::string quoted = home();
    quoted.replace(quoted.find('\''), 1, "'\\''");
    EXPECT_THAT(made_.output, HasSubstr("\n  vexo --home '" + quoted + "' tree\n"));
    EXPECT_EQ(made_.output.find("extended attributes") == std::string::npos, keepsAttributes());
}

// Gathers what a tree says of the groups that lie in the sample home; there may be libraries elsewhere.
struct TreeFacts {
    using ProjectFacts = std::pair<std::string, std::size_t>;  // the icon's name and how many renders
    std::map<std::string, ProjectFacts> projects;
    std::vector<std::string> years;
    std::map<std::string, std::set<std::string>> eventsByYear;

    TreeFacts(const Json& tree, std::string homePath) : home(std::move(homePath)) {
        for (const Json& plugin : tree.at("plugins"))
            visit(plugin.at("root"), "");
    }

  private:
    void visit(const Json& group, const std::string& year) {
        const std::string type = group.at("type");
        const std::string path = group.at("path").is_string() ? group.at("path").get<std::string>() : "";
        const bool inHome = path.starts_with(home + "/");
        if (inHome && type == "VXReelixProjectGroupTypeIdentifier")
            projects[group.at("name")] = {group.at("icon").at("name"), group.at("mediaObjects").size()};
        if (inHome && type == "VXReelixEventGroupTypeIdentifier")
            addEvent(year, group.at("name"));
        const bool isYear = type == "VXReelixEventCalendarGroupTypeIdentifier";
        for (const Json& child : group.at("childGroups"))
            visit(child, isYear ? group.at("name").get<std::string>() : year);
    }

    void addEvent(const std::string& year, const std::string& name) {
        if (std::find(years.begin(), years.end(), year) == years.end())
            years.push_back(year);
        eventsByYear[year].insert(name);
    }

    const std::string home;
};

TEST_F(DemoHomeTest, TheTreeShowsItsProjects) {
    const std::string projectIcon = "Reelix-icon-project";
    const std::string trailerIcon = "Reelix-icon-trailer";
    const std::map<std::string, TreeFacts::ProjectFacts> expected{
        {"Alps 2009", {projectIcon, 4}},
        {"Coming Soon", {trailerIcon, 0}},
        {"Cutting Room", {projectIcon, 0}},
        {"First Steps", {projectIcon, 1}},
        {"Grandma’s 80th Birthday", {projectIcon, 1}},
        {oddName, {projectIcon, 1}},
        {"Skate Park", {projectIcon, 1}},
        {"Summer Blockbuster", {trailerIcon, 1}},
        {longName, {projectIcon, 1}}};
    EXPECT_EQ(TreeFacts(tree(), home()).projects, expected);
}

std::string yearOfFile(const std::string& path) {
    struct stat status;
    std::tm local;
    return stat(path.c_str(), &status) == 0 && localtime_r(&status.st_mtime, &local)
               ? std::to_string(1900 + local.tm_year)
               : "";
}

TEST_F(DemoHomeTest, TheTreeShowsItsEventsUnderTheYearOfTheNewestClip) {
    if (!keepsAttributes())
        GTEST_SKIP() << "the temporary folder's file system keeps no extended attributes";
    const TreeFacts facts(tree(), home());
    const std::string now = yearOfFile(event("Birthday/Birthday.mp4"));
    const std::map<std::string, std::set<std::string>> expected{{now, {"Birthday"}},
                                                                {"2012", {"Concert", "Camping"}},
                                                                {"2010", {"School Play"}},
                                                                {"2009", {"Beach Holiday", "New Year’s Eve"}},
                                                                {"2007", {"Ski Trip"}}};
    EXPECT_EQ(facts.eventsByYear, expected);
    EXPECT_THAT(facts.years, ElementsAre(now, "2012", "2010", "2009", "2007"));
}

// Size and length in seconds of the rendered movies, by path below the library.
using MovieFacts = std::map<std::string, std::pair<std::string, long>>;

void gatherMovies(const Json& group, const std::string& library, MovieFacts& facts) {
    for (const Json& child : group.at("childGroups"))
        gatherMovies(child, library, facts);
    if (group.at("type") != "VXReelixProjectGroupTypeIdentifier")
        return;
    for (const Json& movie : group.at("mediaObjects")) {
        const std::string path = movie.at("path");
        if (path.starts_with(library))
            facts[path.substr(library.size())] = {movie.value("resolution", ""),
                                                  std::lround(movie.value("duration", 0.0))};
    }
}

TEST_F(DemoHomeTest, RenderedMoviesAreReadWithTheirSizesAndLengths) {
    MovieFacts facts;
    const Json answer = tree({"--metadata"});
    for (const Json& plugin : answer.at("plugins"))
        gatherMovies(plugin.at("root"), home() + "/" + projectLibrary, facts);
    const MovieFacts expected{
        {"Alps 2009.qnproject/Movies/HD.mov", {"{1920, 1080}", 6}},
        {"Alps 2009.qnproject/Movies/Medium.mov", {"{1280, 720}", 6}},
        {"Alps 2009.qnproject/Movies/Mobile.m4v", {"{640, 360}", 6}},
        {"Alps 2009.qnproject/Movies/Tiny.3gp", {"{176, 144}", 6}},
        {"Family/2008/First Steps.qnproject/Movies/Mobile.3gp", {"{320, 240}", 4}},
        {"Family/Grandma’s 80th Birthday.qnproject/Movies/Mobile.m4v", {"{480, 272}", 75}},
        {std::string(oddName) + ".qnproject/Movies/Mobile.m4v", {"{640, 360}", 8}},
        {"Skate Park.qnproject/Movies/Medium.mov", {"{960, 540}", 3}},
        {"Summer Blockbuster.qnproject/Movies/HD.mov", {"{1280, 720}", 5}},
        {std::string(longName) + ".qnproject/Movies/Medium.mov", {"{854, 480}", 12}},
    };
    EXPECT_EQ(facts, expected);
}

// Tests of what can be in the way: the program runs beside a stand-in for the helper that makes movies, a
// shell script.
class DemoObstacleTest : public testing::Test {
  protected:
    // The file to write is the last argument of the helper.
    static constexpr const char* makesMovies = "for file; do :; done\necho movie > \"$file\"\n";

    std::string programWithHelper(const std::string& script) const {
        const std::string helper = bin_.writeFile("vexo-sample-movie", "#!/bin/sh\n" + script);
        fs::permissions(helper, fs::perms::owner_all);
        return programWithoutHelper();
    }
    std::string programWithoutHelper() const {
        fs::copy_file(realProgram, bin_.path("vexo"), fs::copy_options::overwrite_existing);
        return bin_.path("vexo");
    }

    TemporaryFolder bin_;
    TemporaryFolder place_;
    const ScopedEnvironment libraries_{"LD_LIBRARY_PATH", VEXO_BIN_DIR "/../lib"};
};

const auto oneLine = MatchesRegex("vexo: [^\n]+\n");

TEST_F(DemoObstacleTest, AFolderThatIsNotEmptyIsRefusedAndLeftAlone) {
    place_.writeFile("home/.hidden", "mine");
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", place_.path("home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.output, "");
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(outcome.errors, HasSubstr("is not empty"));
    EXPECT_THAT(listing(place_.path()), ElementsAre("home/.hidden"));
}

TEST_F(DemoObstacleTest, AFileIsRefusedAndLeftAlone) {
    const std::string file = place_.writeFile("home", "mine");
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", file});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_EQ(contentOf(file), "mine");
}

TEST_F(DemoObstacleTest, AFolderInsideNoFolderIsRefused) {
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", place_.path("missing/home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(listing(place_.path()), ElementsAre());
}

TEST_F(DemoObstacleTest, AFolderWithoutANameIsRefused) {
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", ""});
    EXPECT_NE(outcome.status, 0);
    EXPECT_THAT(outcome.errors, oneLine);
}

TEST_F(DemoObstacleTest, TheMessageStaysOneLineWhateverTheFolderIsCalled) {
    const std::string folder = place_.makeFolder("two\nlines");
    place_.writeFile("two\nlines/file");
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", folder});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(outcome.errors, HasSubstr("is not empty"));
}

TEST_F(DemoObstacleTest, AnEmptyFolderIsFilledAndNotReplaced) {
    const std::string home = place_.makeFolder("home");
    struct stat before;
    ASSERT_EQ(stat(home.c_str(), &before), 0);
    const Outcome outcome = runProgram(programWithHelper(makesMovies), {"demo", home + "/"});
    ASSERT_EQ(outcome.status, 0) << outcome.errors;
    struct stat after;
    ASSERT_EQ(stat(home.c_str(), &after), 0);
    EXPECT_EQ(after.st_ino, before.st_ino);
    EXPECT_TRUE(fs::exists(home + "/" + eventLibrary + "Birthday/Birthday.mp4"));
    EXPECT_EQ(std::distance(fs::directory_iterator(home), {}), 1);
}

// Mounts in a namespace of its own, which is gone with the program.
Outcome runOnFileSystemWithoutAttributes(const std::string& program, const std::string& mountPoint) {
    const std::string script = "mount -t ramfs none \"$1\" || exit 77; exec \"$0\" demo \"$1/home\"";
    return runProgram("unshare",
                      {"--user", "--map-root-user", "--mount", "sh", "-c", script, program, mountPoint});
}

TEST_F(DemoObstacleTest, TheAnswerTellsThatTheFileSystemKeepsNoAttributes) {
    const Outcome outcome =
        runOnFileSystemWithoutAttributes(programWithHelper(makesMovies), place_.makeFolder("mount"));
    if (outcome.status != 0 && outcome.errors.find("vexo: ") == std::string::npos)
        GTEST_SKIP() << "may not mount a file system: " << outcome.errors;
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    EXPECT_THAT(outcome.output, HasSubstr("\nThis file system keeps no extended attributes: "));
}

TEST_F(DemoObstacleTest, NothingIsLeftWhenAMovieFails) {
    const std::string failsAtTheEnd =
        "case \"$*\" in *Birthday.mp4) echo 'vexo-sample-movie: out of ink' >&2; exit 1;; esac\n";
    const Outcome outcome =
        runProgram(programWithHelper(failsAtTheEnd + makesMovies), {"demo", place_.path("home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.output, "");
    EXPECT_EQ(outcome.errors, "vexo: no movie could be made: out of ink\n");
    EXPECT_THAT(listing(place_.path()), ElementsAre());
}

TEST_F(DemoObstacleTest, AnEmptyFolderIsEmptyAgainWhenAMovieFails) {
    const std::string home = place_.makeFolder("home");
    const Outcome outcome = runProgram(programWithHelper("exit 3\n"), {"demo", home});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(listing(place_.path()), ElementsAre("home"));
}

TEST_F(DemoObstacleTest, NothingIsLeftWhenTheHelperWritesNoFile) {
    const Outcome outcome = runProgram(programWithHelper("exit 0\n"), {"demo", place_.path("home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(listing(place_.path()), ElementsAre());
}

TEST_F(DemoObstacleTest, NothingIsLeftWhenTheProgramIsAskedToEnd) {
    const std::string endsItsParent = "kill -TERM $PPID\n";
    const Outcome outcome =
        runProgram(programWithHelper(endsItsParent + makesMovies), {"demo", place_.path("home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.errors, "vexo: interrupted; nothing was made\n");
    EXPECT_THAT(listing(place_.path()), ElementsAre());
}

TEST_F(DemoObstacleTest, AMissingHelperIsNamed) {
    const Outcome outcome = runProgram(programWithoutHelper(), {"demo", place_.path("home")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, oneLine);
    EXPECT_THAT(outcome.errors, HasSubstr(bin_.path("vexo-sample-movie")));
    EXPECT_THAT(listing(place_.path()), ElementsAre());
}

}  // namespace
