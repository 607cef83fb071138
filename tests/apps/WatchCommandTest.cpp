// The commands that stay, and what they tell of changes: the real program on real libraries.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/support/Program.h"
#include "tests/support/RunningProgram.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using namespace testing_support;
using Json = nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;
namespace fs = std::filesystem;

const std::string vexo = VEXO_BIN_DIR "/vexo";

class CommandsThatStay : public testing::Test {
  protected:
    CommandsThatStay() { addEvent("Trip"); }

    void addEvent(const std::string& name) {
        home_.writeFile("Movies/Reelix Events/" + name + "/clip.mov", "no real movie");
    }
    static Json next(RunningProgram& program) {
        const auto line = program.nextLine();
        EXPECT_TRUE(line) << "the output ended";
        return line ? Json::parse(*line) : Json();
    }
    // The names of the events in a root event's tree.
    static std::vector<std::string> eventsIn(const Json& group) {
        std::vector<std::string> names;
        if (group["type"] == "VXReelixEventGroupTypeIdentifier")
            names.push_back(group["name"]);
        for (const Json& child : group["childGroups"])
            for (const std::string& name : eventsIn(child))
                names.push_back(name);
        return names;
    }

    TemporaryFolder home_;
    const ScopedEnvironment cache_{"XDG_CACHE_HOME", home_.makeFolder("cache").c_str()};
};

using WatchCommand = CommandsThatStay;
using QueryCommand = CommandsThatStay;
using LocationsCommand = CommandsThatStay;

TEST_F(WatchCommand, PrintsTheFirstTreeAndThatItIsReady) {
    const Outcome outcome = runVexo({"--home", home_.path(), "watch", "--json", "--for", "0"});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    const std::string firstLine = outcome.output.substr(0, outcome.output.find('\n'));
    const Json root = Json::parse(firstLine);
    const Json ready = Json::parse(outcome.output.substr(firstLine.size()));
    EXPECT_EQ(root["event"], "root");
    EXPECT_EQ(root["plugin"], "Reelix Media Manager");
    EXPECT_THAT(eventsIn(root["root"]), ElementsAre("Trip"));
    EXPECT_TRUE(root["mediaGroups"].is_array());
    EXPECT_EQ(ready["event"], "ready");
    EXPECT_GE(ready["seconds"].get<double>(), root["seconds"].get<double>());
}

TEST_F(WatchCommand, PrintsEachNewTreeOnceItsBurstIsOver) {
    RunningProgram watch(vexo, {"--home", home_.path(), "watch", "--json"});
    EXPECT_EQ(next(watch)["event"], "root");
    const double ready = next(watch)["seconds"].get<double>();
    addEvent("Camping");
    addEvent("Party");

    const Json after = next(watch);
    EXPECT_EQ(after["event"], "root");
    EXPECT_THAT(eventsIn(after["root"]), testing::UnorderedElementsAre("Trip", "Camping", "Party"));
    EXPECT_GE(after["seconds"].get<double>() - ready, 5);
    watch.send(SIGTERM);
    EXPECT_EQ(watch.nextLine(), std::nullopt);  // one tree for the whole burst
    EXPECT_EQ(watch.wait(), 0);
}

TEST_F(WatchCommand, EndsWellWhenItIsInterrupted) {
    RunningProgram watch(vexo, {"--home", home_.path(), "watch"});
    EXPECT_TRUE(watch.nextLine());
    watch.send(SIGINT);
    while (watch.nextLine()) {
    }
    EXPECT_EQ(watch.wait(), 0);
}

TEST_F(WatchCommand, ShowsPeopleTheTimeAndTheTree) {
    const Outcome outcome = runVexo({"--home", home_.path(), "watch", "--for", "0"});
    EXPECT_THAT(outcome.output, testing::ContainsRegex("^[0-9][0-9]:[0-9][0-9]:[0-9][0-9]\nReelix "));
    EXPECT_THAT(outcome.output, HasSubstr("Trip"));
}

TEST_F(WatchCommand, TellsOfWarningsInBothPlaces) {
    home_.writeFile("Movies/Reelix Projects/Broken.qnproject/Project", "bplist00 broken");
    const Outcome outcome = runVexo({"--home", home_.path(), "watch", "--json", "--for", "0"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.errors, StartsWith("vexo: warning: "));
    EXPECT_THAT(outcome.output, HasSubstr("\"event\":\"warning\""));
}

TEST_F(WatchCommand, WantsANumberOfSeconds) {
    for (const char* time : {"x", "-1", "", "1s", "nan", "inf"}) {
        const Outcome outcome = runVexo({"watch", "--for", time});
        EXPECT_EQ(outcome.status, 2) << time;
        EXPECT_THAT(outcome.errors, StartsWith("vexo: ")) << time;
    }
}

TEST_F(QueryCommand, PrintsThePathsThatAreMeant) {
    home_.makeFolder("Movies/Reelix Projects/Summer.qnproject");
    home_.writeFile("Movies/b.fcmov", "x");
    const std::string movies = home_.path("Movies");
    const Outcome text = runVexo({"query",
                                  "kMDItemFSName = '*.qnproject'c || kMDItemContentType = "
                                  "'com.norvale.framecast-movie'",
                                  "--in", movies});
    EXPECT_EQ(text.status, 0) << text.errors;
    EXPECT_EQ(text.output, movies + "/Reelix Projects/Summer.qnproject\n" + movies + "/b.fcmov\n");

    const Outcome json = runVexo({"query", "--json", "kMDItemKind = '*Reelix Project*'cd", "--in", movies});
    EXPECT_EQ(Json::parse(json.output), (Json{{"results", {movies + "/Reelix Projects/Summer.qnproject"}}}));
}

TEST_F(QueryCommand, NothingFoundIsNoError) {
    const Outcome outcome = runVexo({"query", "--json", "kMDItemFSName = 'nothing'", "--in", home_.path()});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(Json::parse(outcome.output), (Json{{"results", Json::array()}}));
}

TEST_F(QueryCommand, AnExpressionThatMakesNoSenseIsStatus2AndTellsWhere) {
    const Outcome outcome = runVexo({"query", "kMDItemFSName = ", "--in", home_.path()});
    EXPECT_EQ(outcome.status, 2);
    EXPECT_THAT(outcome.errors, HasSubstr("at position 16"));
    EXPECT_EQ(std::count(outcome.errors.begin(), outcome.errors.end(), '\n'), 1);
}

TEST_F(QueryCommand, AFolderThatIsNotThereIsStatus1) {
    const Outcome outcome = runVexo({"query", "a = 1", "--in", home_.path("missing")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, StartsWith("vexo: there is no folder '" + home_.path("missing")));
    EXPECT_EQ(runVexo({"query", "a = 1"}).status, 2);
}

TEST_F(QueryCommand, PrintsTheResultsAgainAfterAChange) {
    RunningProgram query(
        vexo, {"query", "--watch", "--json", "kMDItemFSName = '*.fcmov'", "--in", home_.path("Movies")});
    EXPECT_EQ(next(query), (Json{{"results", Json::array()}}));
    const std::string found = home_.writeFile("Movies/new/a.fcmov", "x");
    EXPECT_EQ(next(query), (Json{{"results", {found}}}));
    fs::remove(found);
    EXPECT_EQ(next(query), (Json{{"results", Json::array()}}));
    query.send(SIGTERM);
    EXPECT_EQ(query.nextLine(), std::nullopt);
    EXPECT_EQ(query.wait(), 0);
}

TEST_F(LocationsCommand, TellsHowEachIsWatched) {
    const Outcome outcome = runVexo({"--home", home_.path(), "locations", "--json"});
    ASSERT_EQ(outcome.status, 0) << outcome.errors;
    const Json document = Json::parse(outcome.output);
    for (const Json& location : document["events"]) {
        EXPECT_EQ(location["how"], "events") << location;
        EXPECT_EQ(location["watched"], true) << location;
        EXPECT_NE(location["why"], "") << location;
    }
    EXPECT_EQ(document["events"][0]["path"], home_.path("Movies/Reelix Events"));
    EXPECT_EQ(document["events"][0]["exists"], true);
    EXPECT_THAT(runVexo({"--home", home_.path(), "locations"}).output,
                HasSubstr(home_.path("Movies/Reelix Events") + "\n           events: "));
}

}  // namespace
