#include "framework/queries/MetadataQuery.h"

#include <filesystem>
#include <fstream>
#include <random>

#include "tests/queries/QueriesTest.h"

using namespace testing_support;
using namespace vexo;
using testing::ElementsAre;
using testing::IsEmpty;

namespace fs = std::filesystem;

namespace vexo {

void PrintTo(const QueryChange& change, std::ostream* stream) {
    *stream << testing::PrintToString(std::vector{change.added, change.changed, change.removed});
}

}  // namespace vexo

namespace {

const QueryChange nothing;

class QueryOverFolders : public QueriesTest {
  protected:
    MetadataQuery query(const std::string& text, VXPathListRef scope) {
        return {expression(text), std::move(scope), metadata_};
    }
    MetadataQuery movies(std::vector<std::string> folders) {
        return query("kMDItemFSName = '*.mov'", pathList(std::move(folders)));
    }
    void writeMore(const std::string& path) { std::ofstream(path, std::ios::app) << "more"; }
    void rename(std::string_view from, std::string_view to) {
        fs::rename(home().path(from), home().path(to));
    }
};

TEST_F(QueryOverFolders, TheQueryOfProjectsFindsProjectPackages) {
    const std::string beach = home().makeFolder("Reelix Projects/Beach.qnproject");
    const std::string trip = home().makeFolder("Reelix Projects/Trips/Trip.QNPROJECT");
    home().writeFile("Reelix Projects/Trips/Trip.QNPROJECT/Nested.qnproject/a.mov");
    home().writeFile("Reelix Projects/File.qnproject");  // no package, so no project
    home().makeFolder("Reelix Projects/Other.app");
    MetadataQuery projects = query(projectQuery, pathList({home().path("Reelix Projects")}));
    EXPECT_TRUE(projects.gather(now_));
    EXPECT_THAT(projects.results(), ElementsAre(beach, trip));
}

TEST_F(QueryOverFolders, TheQueryOfEventsFindsMoviesByTheirType) {
    const std::string clip = home().writeFile("Reelix Events/Party/clip.fcmov");
    home().writeFile("Reelix Events/Party/clip.mov");
    home().makeFolder("Reelix Events/Party/folder.fcmov");
    MetadataQuery events = query(eventQuery, pathList({home().path("Reelix Events"), "/Volumes/X/Events"}));
    EXPECT_TRUE(events.gather(now_));
    EXPECT_THAT(events.results(), ElementsAre(clip));
}

TEST_F(QueryOverFolders, WithoutAScopeThereAreNoResults) {
    home().writeFile("a.mov");
    MetadataQuery nowhere = query("kMDItemFSName = '*'", nullptr);
    EXPECT_TRUE(nowhere.gather(now_));
    EXPECT_EQ(nowhere.update({home().path()}, now_), nothing);
    EXPECT_THAT(nowhere.results(), IsEmpty());
}

TEST_F(QueryOverFolders, FoldersThatLieInOneAnotherGiveEachItemOnce) {
    const std::string a = home().writeFile("F/a.mov"), b = home().writeFile("F/G/b.mov");
    MetadataQuery query = movies({home().path("F/G"), home().path("F"), home().path("F/")});
    query.gather(now_);
    EXPECT_THAT(query.results(), ElementsAre(b, a));
    writeMore(b);
    EXPECT_EQ(query.update({b}, now_), (QueryChange{{}, {b}, {}}));
    EXPECT_EQ(query.update({home().path("F/G")}, now_), nothing);
}

TEST_F(QueryOverFolders, AScopeInAHiddenFolderIsLookedAtNonetheless) {
    const std::string clip = home().writeFile("F/.dot/G/a.mov");
    MetadataQuery query = movies({home().path("F"), home().path("F/.dot/G")});
    query.gather(now_);
    EXPECT_THAT(query.results(), ElementsAre(clip));
    for (const char* changed : {"F", "F/.dot", "F/.dot/G", "F/.dot/other"})
        EXPECT_EQ(query.update({home().path(changed)}, now_), nothing) << changed;
    writeMore(clip);
    EXPECT_EQ(query.update({home().path("F/.dot")}, now_), (QueryChange{{}, {clip}, {}}));
}

TEST_F(QueryOverFolders, UpdatesTellWhatCameWentAndChanged) {
    const std::string a = home().writeFile("F/a.mov"), b = home().writeFile("F/b.mov");
    home().writeFile("F/kept.mov");
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    EXPECT_EQ(query.update({home().path("F")}, now_), nothing);

    const std::string c = home().writeFile("F/c.mov");
    home().writeFile("F/c.txt");
    writeMore(a);
    home().remove("F/b.mov");
    EXPECT_EQ(query.update({home().path("F")}, now_), (QueryChange{{c}, {a}, {b}}));
    EXPECT_EQ(query.update({home().path("F")}, now_), nothing);
    EXPECT_THAT(query.results(), ElementsAre(a, c, home().path("F/kept.mov")));
}

TEST_F(QueryOverFolders, AChangeElsewhereIsNotLookedFor) {
    home().makeFolder("F/G");
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    const std::string clip = home().writeFile("F/a.mov");
    for (const std::string& path : {home().path("F/G"), home().path("F/G/b.mov"), home().path("FF"),
                                    home().path("Z"), std::string("relative"), std::string()})
        EXPECT_EQ(query.update({path}, now_), nothing) << path;
    EXPECT_EQ(query.update({clip}, now_), (QueryChange{{clip}, {}, {}}));
}

TEST_F(QueryOverFolders, AFileThatIsReportedHasChangedEvenIfItLooksTheSame) {
    const std::string clip = home().writeFile("F/a.mov");
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    EXPECT_EQ(query.update({clip}, now_), (QueryChange{{}, {clip}, {}}));
}

TEST_F(QueryOverFolders, WhatHappensInAPackageHappensToIt) {
    const std::string beach = home().makeFolder("F/Beach.qnproject");
    home().makeFolder("F/Beach.qnproject/Media");
    MetadataQuery query = this->query(projectQuery, pathList({home().path("F")}));
    query.gather(now_);
    EXPECT_EQ(query.update({home().path("F/Beach.qnproject/Media")}, now_), (QueryChange{{}, {beach}, {}}));
}

TEST_F(QueryOverFolders, AnotherFileOfTheSameNameSizeAndTimeIsAChange) {
    const std::string clip = home().writeFile("F/a.mov"), other = home().writeFile("other");
    setModificationTime(clip, 1000);
    setModificationTime(other, 1000);
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    rename("other", "F/a.mov");
    EXPECT_EQ(query.update({home().path("F")}, now_), (QueryChange{{}, {clip}, {}}));
}

TEST_F(QueryOverFolders, AFolderThatAppearsBringsAllThatIsInIt) {
    const std::string moved = home().writeFile("outside/G/H/a.mov");
    MetadataQuery query = movies({home().makeFolder("F")});
    query.gather(now_);
    rename("outside/G", "F/G");
    const std::string clip = home().path("F/G/H/a.mov");
    EXPECT_EQ(query.update({home().path("F")}, now_), (QueryChange{{clip}, {}, {}}));
    rename("F/G", "F/.G");
    EXPECT_EQ(query.update({home().path("F/G"), home().path("F/.G")}, now_), (QueryChange{{}, {}, {clip}}));
}

TEST_F(QueryOverFolders, APathBelowAMissingFolderTakesItsResultsAway) {
    const std::string clip = home().writeFile("F/G/H/a.mov");
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    home().remove("F/G");
    EXPECT_EQ(query.update({home().path("F/G/H")}, now_), (QueryChange{{}, {}, {clip}}));
}

TEST_F(QueryOverFolders, AScopeFolderMayComeAndGo) {
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    const std::string clip = home().writeFile("F/a.mov");
    EXPECT_EQ(query.update({home().path()}, now_), (QueryChange{{clip}, {}, {}}));
    home().remove("F");
    EXPECT_EQ(query.update({home().path("F")}, now_), (QueryChange{{}, {}, {clip}}));
}

TEST_F(QueryOverFolders, FoldersThatAreAddedToTheScopeCountAtTheNextUpdate) {
    const std::string a = home().writeFile("F/a.mov"), b = home().writeFile("G/b.mov");
    const VXPathListRef scope = pathList({home().path("F")});
    MetadataQuery query = this->query("kMDItemFSName = '*.mov'", scope);
    query.gather(now_);
    scope->append(home().path("G"));
    EXPECT_THAT(query.results(), ElementsAre(a));
    EXPECT_EQ(query.update({}, now_), (QueryChange{{b}, {}, {}}));
    EXPECT_EQ(query.update({}, now_), nothing);
}

TEST_F(QueryOverFolders, ANewScopeTakesThePlaceOfTheOldOne) {
    const std::string a = home().writeFile("F/a.mov"), b = home().writeFile("G/b.mov");
    const std::string inner = home().writeFile("F/I/c.mov");
    MetadataQuery query = movies({home().path("F")});
    query.gather(now_);
    query.setScope(pathList({home().path("G"), home().path("F/I")}));
    EXPECT_EQ(query.update({}, now_), (QueryChange{{b}, {}, {a}}));
    EXPECT_THAT(query.results(), ElementsAre(inner, b));
}

TEST_F(QueryOverFolders, AFolderThatLeavesTheScopeCountsAsWhatItIsToTheOthers) {
    home().writeFile("F/.dot/G/a.mov");
    const std::string b = home().writeFile("F/I/b.mov");
    MetadataQuery query = movies({home().path("F"), home().path("F/.dot/G"), home().path("F/I")});
    query.gather(now_);
    query.setScope(pathList({home().path("F")}));
    EXPECT_EQ(query.update({}, now_), (QueryChange{{}, {}, {home().path("F/.dot/G/a.mov")}}));
    EXPECT_THAT(query.results(), ElementsAre(b));
}

TEST_F(QueryOverFolders, AVolumeIsKnownByItsNameWhileItIsMounted) {
    const std::string clip = home().writeFile("mnt/Events/a.mov");
    MetadataQuery query = movies({"/Volumes/Archive/Events"});
    query.gather(now_);
    EXPECT_THAT(query.results(), IsEmpty());

    mountArchive();
    EXPECT_EQ(query.update({}, now_), (QueryChange{{clip}, {}, {}}));
    const std::string other = home().writeFile("mnt/Events/b.mov");
    EXPECT_EQ(query.update({"/Volumes/Archive/Events/b.mov"}, now_), (QueryChange{{other}, {}, {}}));
    host_.mounts.list = {};
    EXPECT_EQ(query.update({}, now_), (QueryChange{{}, {}, {clip, other}}));
}

TEST_F(QueryOverFolders, LinksThatLeadNowhereAreNoResults) {
    const std::string target = home().writeFile("target");
    const std::string link = home().makeLink("F/a.mov", target);
    home().makeLink("F/broken.mov", home().path("missing"));
    MetadataQuery query = this->query("kMDItemFSName != 'none'", pathList({home().path("F")}));
    query.gather(now_);
    EXPECT_THAT(query.results(), ElementsAre(link));
}

TEST_F(QueryOverFolders, TimesAreThoseOfTheMomentOfTheUpdate) {
    const std::string clip = home().writeFile("F/a.mov");
    setModificationTime(clip, 1000);
    MetadataQuery query =
        this->query("kMDItemFSContentChangeDate >= $time.now(-60)", pathList({home().path("F")}));
    query.gather(*platform::Date::since1970(1060));
    EXPECT_THAT(query.results(), ElementsAre(clip));
    EXPECT_EQ(query.update({home().path("F")}, *platform::Date::since1970(1061)),
              (QueryChange{{}, {}, {clip}}));
}

TEST_F(QueryOverFolders, OnlyWhatMayHaveChangedIsLookedAt) {
    for (const char* name : {"F/a.mov", "F/G/b.mov", "F/G/c.mov", "F/H/d.mov"})
        home().writeFile(name);
    const WatchedMetadata metadata(metadata_, [] {});
    MetadataQuery query(expression("kMDItemFSName = '*.mov'"), pathList({home().path("F")}), metadata);
    query.gather(now_);
    EXPECT_EQ(metadata.questions, 6);
    query.update({home().path("F/G"), home().path("F/G/b.mov"), home().path("F/G c")}, now_);
    EXPECT_EQ(metadata.questions, 9);  // the folder and its two files
}

TEST_F(QueryOverFolders, ACancelEndsTheWorkAndKeepsTheResults) {
    const std::string a = home().writeFile("F/a.mov");
    std::function<void()> atFirst = [] {};
    const WatchedMetadata metadata(metadata_, [&] { atFirst(); });
    MetadataQuery query(expression("kMDItemFSName = '*.mov'"), pathList({home().path("F")}), metadata);
    query.gather(now_);
    for (const char* name : {"F/b.mov", "F/c.mov", "F/G/d.mov"})
        home().writeFile(name);
    metadata.questions = 0;
    atFirst = [&] { query.cancel(); };
    EXPECT_EQ(query.update({home().path("F")}, now_), nothing);
    EXPECT_EQ(metadata.questions, 1);
    EXPECT_FALSE(query.gather(now_));
    EXPECT_THAT(query.results(), ElementsAre(a));
}

// --- Against gathering anew --------------------------------------------------------------------------------

// Names that do and do not match, hide, or make packages.
std::string randomName(std::mt19937& random) {
    static const std::vector<std::string> names{"a.mov", "b.mov", ".dot", "G", "G b", "P.qnproject", "x.txt"};
    return names[random() % names.size()];
}

class RandomChanges : public QueryOverFolders, public testing::WithParamInterface<unsigned> {
  protected:
    // Makes, moves or removes something, and answers what a watcher would report.
    std::vector<std::string> changeSomething() {
        const std::string path = randomPath(), other = randomPath();
        std::error_code error;
        switch (random_() % 4) {
            case 0:
                fs::create_directories(path, error);
                return {home().path()};
            case 1:
                fs::create_directories(fs::path(path).parent_path(), error);
                writeMore(path);
                return {home().path()};
            case 2:
                fs::rename(path, other, error);
                return {path, other};
            default:
                fs::remove_all(path, error);
                return {fs::path(path).parent_path()};
        }
    }
    std::string randomPath() {
        std::string path = home().path("F");
        for (unsigned depth = random_() % 3 + 1; depth > 0; --depth)
            path += "/" + randomName(random_);
        return path;
    }

    std::mt19937 random_{GetParam()};
};

TEST_P(RandomChanges, ResultsAreThoseOfGatheringAnew) {
    const auto folders = {home().path("F"), home().path("F/G"), home().path("F/.dot")};
    MetadataQuery updated = movies(folders);
    updated.gather(now_);
    for (int step = 0; step < 60; ++step) {
        const std::vector<std::string> before = updated.results();
        const QueryChange change = updated.update(changeSomething(), now_);
        MetadataQuery anew = movies(folders);
        anew.gather(now_);
        ASSERT_EQ(updated.results(), anew.results()) << "step " << step;

        std::vector<std::string> expected;
        std::set_difference(before.begin(), before.end(), change.removed.begin(), change.removed.end(),
                            std::back_inserter(expected));
        expected.insert(expected.end(), change.added.begin(), change.added.end());
        std::sort(expected.begin(), expected.end());
        ASSERT_EQ(updated.results(), expected) << "step " << step;
    }
}

INSTANTIATE_TEST_SUITE_P(Seeds, RandomChanges, testing::Range(1u, 9u));

}  // namespace
