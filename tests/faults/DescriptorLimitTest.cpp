// A process that may open few files: what it can't open is missing and named, and nothing ends it but itself.
#include <gmock/gmock.h>

#include <nlohmann/json.hpp>

#include "tests/support/Program.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using testing::AnyOf;
using testing::HasSubstr;
using testing::Not;
using Json = nlohmann::json;

constexpr int highestLimit = 24;

class DescriptorLimitTest : public testing::Test {
  protected:
    // UBSan looks through a pipe whether an object is in memory, and reports the object where it gets none.
    void SetUp() override {
        if (VEXO_SANITIZED)
            GTEST_SKIP() << "a sanitizer needs descriptors of its own";
        for (const std::string number : {"1", "2", "3", "4", "5"}) {
            home.makeFolder("Movies/Reelix Projects/Film " + number + ".qnproject/Movies");
            home.writeFile("Movies/Reelix Events/Trip " + number + "/clip.mov");
        }
    }
    Outcome runLimited(int limit, const std::vector<std::string>& command) const {
        std::vector<std::string> line{"--nofile=" + std::to_string(limit), VEXO_BIN_DIR "/vexo", "--home",
                                      home.path()};
        line.insert(line.end(), command.begin(), command.end());
        return runProgram("prlimit", line);
    }
    // Either it works, or it has said why it can't.
    static void expectRegularEnd(const Outcome& outcome) {
        EXPECT_THAT(outcome.status, AnyOf(0, 1, 127));  // 127 where not even the libraries can be opened
        EXPECT_THAT(outcome.errors, Not(HasSubstr("GLib-ERROR")));
        if (outcome.status != 0) {
            EXPECT_THAT(outcome.errors, HasSubstr("vexo: "));
        }
    }

    void expectRegularEndAtEachLimit(const std::vector<std::string>& command) const {
        for (int limit = 1; limit <= highestLimit; ++limit) {
            SCOPED_TRACE(limit);
            expectRegularEnd(runLimited(limit, command));
        }
    }

    const TemporaryFolder home;
};

TEST_F(DescriptorLimitTest, WhatIsMissingFromATreeIsWarnedOf) {
    const Outcome unlimited = runLimited(64, {"tree", "--json"});
    ASSERT_EQ(unlimited.status, 0);
    const Json whole = Json::parse(unlimited.output);
    EXPECT_EQ(whole["warnings"], Json::array());
    int trees = 0;
    for (int limit = 1; limit <= highestLimit; ++limit) {
        SCOPED_TRACE(limit);
        const Outcome outcome = runLimited(limit, {"tree", "--json"});
        expectRegularEnd(outcome);
        if (outcome.status != 0)
            continue;
        ++trees;
        const Json tree = Json::parse(outcome.output);
        EXPECT_TRUE(tree["plugins"] == whole["plugins"] || !tree["warnings"].empty());
    }
    EXPECT_GT(trees, 0);
}

// The index and the media reader take descriptors of their own.
TEST_F(DescriptorLimitTest, ReadingMoviesEndsRegularly) {
    makeSampleMovie(home.path("Movies/Reelix Events/Trip 1/clip.mov"), {.size = "320x240", .seconds = 1});
    expectRegularEndAtEachLimit({"tree", "--metadata"});
}

TEST_F(DescriptorLimitTest, ActingEndsRegularly) {
    const std::string clip = home.path("Movies/Reelix Events/Trip 1/clip.mov");
    makeSampleMovie(clip, {.size = "320x240", .seconds = 1});
    expectRegularEndAtEachLimit({"menu", "--object", clip, "--choose", "1"});
}

TEST_F(DescriptorLimitTest, FollowingChangesEndsRegularly) {
    expectRegularEndAtEachLimit({"watch", "--for", "0.01"});
}

}  // namespace
}  // namespace testing_support
