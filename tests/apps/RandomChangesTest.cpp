// A library that is changed at random while it is watched: in the end the tree is that of a fresh load.
#include <gtest/gtest.h>
#include <signal.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <random>

#include "tests/support/Program.h"
#include "tests/support/RunningProgram.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using namespace testing_support;
using Json = nlohmann::json;
namespace fs = std::filesystem;

unsigned chosenSeed() {
    const char* seed = std::getenv("VEXO_TEST_SEED");
    return seed ? static_cast<unsigned>(std::stoul(seed)) : std::random_device{}();
}

// Someone who imports, sorts and deletes, in great haste.
class Person {
  public:
    Person(const TemporaryFolder& home, unsigned seed)
        : events_(home.makeFolder("Movies/Reelix Events")),
          projects_(home.makeFolder("Movies/Reelix Projects")),
          random_(seed) {}

    // What cannot be done is left alone, as people do.
    void act() {
        std::error_code ignored;
        switch (number(12)) {
            case 0:
                fs::create_directories(event(), ignored);
                break;
            case 1:
                fs::rename(event(), event(), ignored);
                break;
            case 2:
                fs::remove_all(event(), ignored);
                break;
            case 3:
                fs::remove(clip(), ignored);
                break;
            case 4:
                fs::rename(clip(), clip(), ignored);
                break;
            case 5:
                write(clip());
                break;
            case 6:
                write(clip());
                break;
            case 7:
                fs::create_directories(project() + "/Movies", ignored);
                break;
            case 8:
                write(project() + "/Movies/" + std::to_string(number(3)) + ".mov");
                break;
            case 9:
                fs::rename(project(), project(), ignored);
                break;
            case 10:
                fs::remove_all(project(), ignored);
                break;
            case 11:
                fs::create_directories(projects_ + "/Folder/" + name(3) + ".qnproject", ignored);
                break;
        }
    }

  private:
    int number(int below) { return std::uniform_int_distribution<int>(0, below - 1)(random_); }
    std::string name(int below) { return std::string(1, static_cast<char>('A' + number(below))); }
    std::string event() { return events_ + "/" + name(8); }
    std::string clip() { return event() + "/clip-200" + std::to_string(number(9)) + "-05-01 10;00;00.mov"; }
    std::string project() { return projects_ + "/" + name(8) + ".qnproject"; }
    void write(const std::string& path) {
        std::ofstream(path) << std::string(std::size_t(number(2000)), 'x');
    }

    const std::string events_;
    const std::string projects_;
    std::mt19937 random_;
};

// Without the numbers that tell objects of one run apart. An item that a reload finds by its ID stays what it
// was, a movie of the project or the item that stood for it, so icons and attributes of items are its
// history.
Json withoutHistory(Json json) {
    if (json.contains("mediaType"))
        return {{"id", json["id"]}, {"name", json["name"]}, {"path", json["path"]}};
    if (json.is_object())
        json.erase("image");
    for (Json& each : json)
        if (each.is_structured())
            each = withoutHistory(std::move(each));
    return json;
}

// The tree as it is to compare: a reload sorts the groups right below the root, and a first load does not.
Json comparable(const Json& root) {
    Json tree = withoutHistory(root);
    for (const char* list : {"childGroups", "mediaObjects"})
        std::sort(tree[list].begin(), tree[list].end(),
                  [](const Json& one, const Json& other) { return one["id"] < other["id"]; });
    return tree;
}

TEST(RandomChanges, LeadToTheTreeOfAFreshLoad) {
    constexpr int bursts = 3;
    constexpr int actionsInABurst = 1500;
    const unsigned seed = chosenSeed();
    SCOPED_TRACE("VEXO_TEST_SEED=" + std::to_string(seed));
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    Person person(home, seed);
    RunningProgram watch(VEXO_BIN_DIR "/vexo", {"--home", home.path(), "--quiet", "watch", "--json"});
    ASSERT_TRUE(watch.nextLine());  // the first tree
    ASSERT_TRUE(watch.nextLine());  // ready

    for (int burst = 0; burst < bursts; ++burst) {
        for (int i = 0; i < actionsInABurst; ++i)
            person.act();
        const Json fresh = comparable(
            Json::parse(runVexo({"--home", home.path(), "tree", "--json"}).output)["plugins"][0]["root"]);
        Json seen;
        // One tree a branch, and one more each for what happened while a branch was read.
        for (int trees = 0; trees < 4 && seen != fresh; ++trees) {
            const auto line = watch.nextLine();
            ASSERT_TRUE(line) << "no further tree comes; the last one differs by "
                              << Json::diff(seen, fresh).dump(1);
            seen = comparable(Json::parse(*line)["root"]);
        }
        ASSERT_EQ(seen, fresh) << Json::diff(seen, fresh).dump(1);
    }
    watch.send(SIGTERM);
    while (watch.nextLine()) {
    }
    EXPECT_EQ(watch.wait(), 0);
}

}  // namespace
