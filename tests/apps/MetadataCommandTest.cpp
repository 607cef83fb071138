// What vexo tells of movies, and how often it has them read.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>

#include "tests/support/Program.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using namespace testing_support;
using Json = nlohmann::json;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

class MetadataCommandTest : public testing::Test {
  protected:
    std::string makeMovie(std::string_view name = "clip.mov") {
        const std::string path = folder_.path(name);
        std::filesystem::create_directories(std::filesystem::path(path).parent_path());
        makeSampleMovie(path, {.size = "320x180", .seconds = 1, .creationTime = "2008-12-31T23:59:59Z"});
        return path;
    }

    TemporaryFolder folder_;
};

TEST_F(MetadataCommandTest, TellsAMoviesPropertiesAsJSON) {
    const std::string path = makeMovie();
    const Outcome outcome = runVexo({"metadata", "--json", path});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    EXPECT_EQ(outcome.errors, "");
    const Json documents = Json::parse(outcome.output);
    ASSERT_EQ(documents.size(), 1u);
    const Json& movie = documents[0];
    EXPECT_EQ(movie["path"], path);
    EXPECT_EQ(movie["supportedMovieFile"], true);
    EXPECT_EQ(movie["contentType"], "com.norvale.quicktime-movie");
    EXPECT_EQ(movie["problem"], nullptr);
    const Json& properties = movie["properties"];
    EXPECT_EQ(properties["kMDItemPixelWidth"], 320);
    EXPECT_EQ(properties["kMDItemPixelHeight"], 180);
    EXPECT_EQ(properties["kMDItemMediaTypes"], (Json{"Video", "Sound"}));
    EXPECT_EQ(properties["kMDItemContentCreationDate"], "2008-12-31T23:59:59Z");
    EXPECT_NEAR(properties["kMDItemDurationSeconds"].get<double>(), 1, 0.1);
    EXPECT_EQ(properties["kMDItemFSSize"], std::filesystem::file_size(path));
}

TEST_F(MetadataCommandTest, TellsPeopleOnePropertyALine) {
    const Outcome outcome = runVexo({"metadata", makeMovie()});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.output, AllOf(HasSubstr(folder_.path("clip.mov") + "\n"), HasSubstr("kMDItemKind"),
                                      HasSubstr("QuickTime movie\n"), HasSubstr("Video, Sound\n")));
}

TEST_F(MetadataCommandTest, NamesWhatIsNoMovieAndGoesOn) {
    const std::string text = folder_.writeFile("notes.txt", "no movie");
    const std::string broken = folder_.writeFile("broken.mov", "no movie either");
    const std::string empty = folder_.writeFile("empty.mov");
    const std::string pipe = folder_.makeFifo("pipe.mov");
    const std::string missing = folder_.path("missing.mov");
    const std::string movie = makeMovie();
    const Outcome outcome =
        runVexo({"metadata", "--json", text, broken, empty, pipe, missing, folder_.path(), movie});
    EXPECT_EQ(outcome.status, 1);
    for (const std::string& path : {text, broken, empty, pipe, missing, folder_.path()})
        EXPECT_THAT(outcome.errors, HasSubstr("vexo: " + path + ": ")) << path;
    EXPECT_THAT(outcome.errors, HasSubstr("missing.mov: No such file or directory\n"));
    EXPECT_THAT(outcome.errors, Not(HasSubstr("clip.mov")));

    const Json documents = Json::parse(outcome.output);
    ASSERT_EQ(documents.size(), 7u);
    EXPECT_EQ(documents[0]["contentType"], "public.plain-text");
    EXPECT_EQ(documents[0]["supportedMovieFile"], false);
    EXPECT_EQ(documents[1]["supportedMovieFile"], true);
    EXPECT_EQ(documents[4]["contentType"], nullptr);
    EXPECT_EQ(documents[4]["properties"], Json::object());
    for (int i = 0; i < 6; ++i)
        EXPECT_TRUE(documents[i]["problem"].is_string()) << i;
    EXPECT_EQ(documents[6]["properties"]["kMDItemPixelWidth"], 320);
}

TEST_F(MetadataCommandTest, ANameCannotActOnTheTerminal) {
    const std::string path = folder_.writeFile("a\x1b[31m\n.mov", "");
    const Outcome outcome = runVexo({"metadata", path});
    EXPECT_THAT(outcome.output + outcome.errors, Not(HasSubstr("\x1b")));
    EXPECT_EQ(std::count(outcome.errors.begin(), outcome.errors.end(), '\n'), 1);
}

TEST_F(MetadataCommandTest, NeedsAFileAndNoPlugin) {
    EXPECT_EQ(runVexo({"metadata"}).status, 2);
    EXPECT_EQ(runVexo({"--plugin", folder_.path("missing"), "metadata", makeMovie()}).status, 0);
}

TEST_F(MetadataCommandTest, TakesPathsFromTheWorkingFolder) {
    makeMovie();
    const Outcome outcome =
        runProgram("env", {"-C", folder_.path(), VEXO_BIN_DIR "/vexo", "metadata", "--json", "clip.mov"});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    EXPECT_EQ(Json::parse(outcome.output)[0]["path"], folder_.path("clip.mov"));
}

// A reader that leaves a line in a file each time one is started.
class ReaderStarts : public MetadataCommandTest {
  protected:
    ReaderStarts() {
        makeMovie("home/Movies/Reelix Events/Trip/a.mov");
        makeMovie("home/Movies/Reelix Events/Trip/b.mov");
        const std::string script =
            folder_.writeFile("reader", "#!/bin/sh\necho started >> '" + starts_ +
                                            "'\nexec '" VEXO_BIN_DIR "/vexo-media-reader'\n");
        std::filesystem::permissions(script, std::filesystem::perms::owner_all);
    }

    std::string tree() {
        const Outcome outcome = runProgram(
            "env", {"XDG_CACHE_HOME=" + folder_.path("cache"), "VEXO_MEDIA_READER=" + folder_.path("reader"),
                    VEXO_BIN_DIR "/vexo", "--home", folder_.path("home"), "tree", "--metadata"});
        EXPECT_EQ(outcome.status, 0) << outcome.errors;
        return outcome.output;
    }
    long starts() const {
        std::ifstream file(starts_);
        return std::count(std::istreambuf_iterator<char>(file), {}, '\n');
    }

    const std::string starts_ = folder_.path("starts");
};

TEST_F(ReaderStarts, OneReaderReadsAWholeLibrary) {
    EXPECT_THAT(tree(), HasSubstr("320×180"));
    EXPECT_EQ(starts(), 1);
}

TEST_F(ReaderStarts, NoReaderIsStartedForALibraryThatIsUnchanged) {
    const std::string first = tree();
    ASSERT_EQ(starts(), 1);
    EXPECT_EQ(tree(), first);
    EXPECT_EQ(starts(), 1);

    std::filesystem::rename(folder_.path("home/Movies/Reelix Events/Trip"),
                            folder_.path("home/Movies/Reelix Events/Journey"));
    EXPECT_THAT(tree(), HasSubstr("320×180"));
    EXPECT_EQ(starts(), 1);
}

TEST_F(ReaderStarts, AChangedMovieIsReadAgain) {
    tree();
    setModificationTime(folder_.path("home/Movies/Reelix Events/Trip/a.mov"), 1'000'000'000);
    tree();
    EXPECT_EQ(starts(), 2);
}

TEST_F(MetadataCommandTest, InfoTellsWhatTheReaderHasGivenUp) {
    const Outcome outcome = runVexo({"--verbose", "info", "--json"});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    const Json reader = Json::parse(outcome.output)["mediaReader"];
    EXPECT_EQ(reader["program"], VEXO_BIN_DIR "/vexo-media-reader");
    EXPECT_THAT(reader["confinement"].dump(), HasSubstr("limits"));
    EXPECT_THAT(runVexo({"--verbose", "info"}).output, HasSubstr("confined by"));
    EXPECT_FALSE(Json::parse(runVexo({"info", "--json"}).output).contains("mediaReader"));
}

}  // namespace
