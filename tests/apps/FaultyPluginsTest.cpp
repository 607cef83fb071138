// Commands with two plug-ins, the first of which raises in one operation: the answer tells of the second.
#include <gmock/gmock.h>

#include <sstream>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "tests/faultyplugin/MadeBundle.h"
#include "tests/support/Program.h"

namespace {

using namespace vexo;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;
using testing_support::Outcome;
using testing_support::runVexo;
using testing_support::ScopedEnvironment;

// What a command said, and what the host warned of.
struct Answer {
    Problems problems;
    std::string output;
    std::vector<std::string> warnings;
};

class FaultyPlugins : public testing::Test {
  protected:
    std::string bundle(const std::string& fault) const {
        return testing_support::makeBundle(
            home, "Faulty.vxplugin", {.principalClass = "FaultyPlugin" + (fault.empty() ? "" : ":" + fault)});
    }
    Answer answer(const std::string& fault,
                  const std::function<Problems(Host&, std::ostream&)>& command) const {
        Host host({.homeDirectory = home.path(), .pluginBundles = {bundle(fault), REELIX_BUNDLE_DIR}});
        EXPECT_EQ(host.loadPlugins(), std::nullopt);
        std::ostringstream output;
        Problems problems = command(host, output);
        return {std::move(problems), output.str(), host.diagnostics().warnings()};
    }
    // Both forms of what can be raised.
    void expectWarning(const std::string& operation,
                       const std::function<Problems(Host&, std::ostream&)>& command,
                       const std::function<void(const Answer&)>& expectation) const {
        const Answer raised = answer(operation, command);
        EXPECT_THAT(raised.warnings, ElementsAre("a plug-in failed: fault in " + operation));
        expectation(raised);
        const Answer unknown = answer(operation + ":number", command);
        EXPECT_THAT(unknown.warnings, ElementsAre("a plug-in failed for an unknown reason")) << operation;
        expectation(unknown);
    }

    const testing_support::TemporaryFolder home;
    const std::string file = home.path("overlay.png");
    const ScopedEnvironment cache{"XDG_CACHE_HOME", home.makeFolder("cache").c_str()};
};

Problems tree(Host& host, std::ostream& out) {
    return runTree(host, {OutputFormat::json, /*withMetadata=*/false, /*depth=*/std::nullopt}, out);
}

TEST_F(FaultyPlugins, WithoutAFaultBothAreInTheTree) {
    const Answer whole = answer("", tree);
    EXPECT_THAT(whole.problems, IsEmpty());
    EXPECT_THAT(whole.warnings, IsEmpty());
    const Json plugins = Json::parse(whole.output)["plugins"];
    EXPECT_EQ(plugins[0]["root"]["mediaObjects"][0]["id"], "faulty-clip");
    EXPECT_EQ(plugins[1]["root"]["name"], "Reelix");
}

TEST_F(FaultyPlugins, AnAnswerThatIsRaisedInIsEmptyAndTheRestIsThere) {
    const std::pair<const char*, Json> fields[] = {
        {"rootMediaGroupTitle", Json{{"title", ""}}},
        {"uniqueID", Json{{"uniqueID", ""}}},
        {"mediaTypesSupported", Json{{"mediaTypesSupported", 0}}},
        {"canLoadData", Json{{"canLoadData", false}}},
        {"appInstalled", Json{{"appInstalled", false}}},
        {"mediaGroups", Json{{"mediaGroups", Json::array()}}},
        {"isManagedMediaSource", Json{{"managedMediaSource", false}}},
        {"defaultNoDataMessage", Json{{"defaultNoDataMessage", nullptr}}},
    };
    for (const auto& [operation, field] : fields) {
        expectWarning(operation, tree, [&, field = field](const Answer& given) {
            EXPECT_THAT(given.problems, IsEmpty());
            const Json plugins = Json::parse(given.output)["plugins"];
            EXPECT_EQ(plugins[0][field.items().begin().key()], field.items().begin().value());
            EXPECT_EQ(plugins[0]["root"]["name"], "Faulty");
            EXPECT_EQ(plugins[1]["root"]["name"], "Reelix");
        });
    }
}

TEST_F(FaultyPlugins, APluginThatCannotLoadIsAProblemAndTheOthersAreShown) {
    for (const char* operation : {"loadData", "performLoadData"}) {
        expectWarning(operation, tree, [](const Answer& given) {
            EXPECT_THAT(given.problems, ElementsAre(HasSubstr("Faulty.vxplugin' could not read")));
            const Json plugins = Json::parse(given.output)["plugins"];
            EXPECT_EQ(plugins[0]["root"], nullptr);
            EXPECT_EQ(plugins[1]["root"]["name"], "Reelix");
        });
    }
}

TEST_F(FaultyPlugins, TellsWhatItCanOfThem) {
    const auto info = [](Host& host, std::ostream& out) {
        return runInfo(host, {OutputFormat::json, /*withMediaReader=*/false}, out);
    };
    expectWarning("supportedPasteboardTypes", info, [](const Answer& given) {
        EXPECT_THAT(given.problems, IsEmpty());
        const Json plugins = Json::parse(given.output)["plugins"];
        EXPECT_EQ(plugins[0]["supportedPasteboardTypes"], Json::array());
        EXPECT_EQ(plugins[1]["title"], "Reelix");
    });
    const auto locations = [](Host& host, std::ostream& out) {
        return runLocations(host, OutputFormat::text, out);
    };
    expectWarning("libraryLocations", locations, [](const Answer& given) {
        EXPECT_THAT(given.problems, IsEmpty());
        EXPECT_THAT(given.output, HasSubstr("Movies/Reelix Events"));
    });
}

TEST_F(FaultyPlugins, WhatWasAskedOfItAloneIsAProblem) {
    using Command = std::function<Problems(Host&, std::ostream&)>;
    MenuOptions object, group, act;
    object.object = act.object = "faulty-clip";
    group.group = "faulty";
    act.chosenEntry = 1;
    CopyOptions copiedObject, copiedGroup;
    copiedObject.objects = {"faulty-clip"};
    copiedGroup.groups = {"faulty"};
    const OverlayOptions overlay{"faulty-clip", {16, 16}, /*scale=*/1, file};
    const Command showOverlay = [&](Host& host, std::ostream&) { return runOverlay(host, overlay); };
    const std::pair<const char*, Command> asked[] = {
        {"contextMenuForMediaObject", [&](auto& host, auto& out) { return runMenu(host, object, out); }},
        {"contextMenuForMediaGroup", [&](auto& host, auto& out) { return runMenu(host, group, out); }},
        {"perform", [&](auto& host, auto& out) { return runMenu(host, act, out); }},
        {"writeMediaObjects", [&](auto& host, auto& out) { return runCopy(host, copiedObject, out); }},
        {"writeMediaGroups", [&](auto& host, auto& out) { return runCopy(host, copiedGroup, out); }},
        {"thumbnailOverlayForMediaObject", showOverlay},
        {"draw", showOverlay},
    };
    for (const auto& [operation, command] : asked) {
        expectWarning(operation, command, [operation = operation](const Answer& given) {
            EXPECT_EQ(given.problems.size(), 1u) << operation;
            EXPECT_EQ(given.output, "");
        });
        EXPECT_EQ(answer("", command).warnings.size(), 0u) << operation;
    }
}

// What it did before it raised cannot be undone.
TEST_F(FaultyPlugins, AnActionIsPerformedOnce) {
    MenuOptions act;
    act.object = "faulty-clip";
    act.chosenEntry = 1;
    const Answer given =
        answer("perform:archive", [&](Host& host, std::ostream& out) { return runMenu(host, act, out); });
    EXPECT_THAT(given.problems, ElementsAre("'Act' failed"));
    EXPECT_THAT(given.warnings, ElementsAre("broken archive 1"));
}

TEST_F(FaultyPlugins, AnImageWithoutAPictureIsNoOverlay) {
    const Answer given = answer("noPicture", [&](Host& host, std::ostream&) {
        return runOverlay(host, {"faulty-clip", {16, 16}, /*scale=*/1, file});
    });
    EXPECT_THAT(given.problems, ElementsAre(HasSubstr("has no overlay")));
    EXPECT_THAT(given.warnings, IsEmpty());
}

TEST_F(FaultyPlugins, WatchingShowsTheOther) {
    const auto watch = [](Host& host, std::ostream& out) {
        return runWatch(host, {OutputFormat::json, std::chrono::duration<double>(0)}, out);
    };
    for (const char* operation : {"performLoadData", "uniqueID", "mediaGroups"}) {
        expectWarning(operation, watch, [](const Answer& given) {
            EXPECT_THAT(given.problems, IsEmpty());
            EXPECT_THAT(given.output, HasSubstr("\"plugin\":\"Reelix Media Manager\""));
            EXPECT_THAT(given.output, HasSubstr("\"event\":\"warning\""));
        });
    }
}

TEST_F(FaultyPlugins, AProgramWithoutAUsablePluginSaysSoWithStatus1) {
    const Outcome outcome = runVexo({"--plugin", bundle("constructor:number"), "--quiet", "tree"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_TRUE(testing_support::isOneLine(outcome.errors)) << outcome.errors;
    EXPECT_THAT(outcome.errors, AllOf(StartsWith("vexo: "), HasSubstr("could not be initialised")));
}

TEST_F(FaultyPlugins, AProgramOneOfWhosePluginsCannotLoadShowsTheOthersWithStatus1) {
    const Outcome outcome = runVexo({"--plugin", bundle("performLoadData"), "--plugin", REELIX_BUNDLE_DIR,
                                     "--home", home.path(), "tree"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, HasSubstr("vexo: warning: a plug-in failed: fault in performLoadData\n"));
    EXPECT_THAT(outcome.errors, HasSubstr("Faulty.vxplugin' could not read the libraries\n"));
    EXPECT_THAT(outcome.output, HasSubstr("Reelix"));
}

}  // namespace
