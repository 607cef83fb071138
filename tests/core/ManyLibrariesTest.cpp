// More folders of libraries than anybody has volumes.
#include "tests/core/SmallLibrary.h"

namespace reelix {
namespace {

using testing_support::SmallLibraryTest;

class ManyLibrariesTest : public SmallLibraryTest {
  protected:
    static constexpr int volumes = 2000;

    // Media of which every hundredth holds a project and a clip.
    void insertMedia() {
        std::vector<std::string> media;
        for (int i = 0; i < volumes; ++i) {
            const std::string name = "media/" + std::to_string(i);
            media.push_back(home().path(name));
            if (i % 100 != 0)
                continue;
            home().makeFolder(name + "/Reelix Projects/P" + std::to_string(i) + ".qnproject");
            home().writeFile(name + "/Reelix Events/Trip/clip-2010-07-01 12;00;00.mov", "clip");
        }
        environment.workspace.setRemovableMedia(std::move(media));
    }
    std::vector<std::string> searchPaths() {
        ExposedPlugin& scanned = plugin();
        platform::Locked monitor(scanned._monitor);
        return *scanned._ReelixSearchPaths;
    }
};

TEST_F(ManyLibrariesTest, ThousandsOfSearchPathsAreAllLookedAt) {
    insertMedia();
    const auto root = load();
    // The project below each plain name stands there for the localized name beside it as well.
    std::size_t projects = 0, clips = 0;
    for (const auto& child : root->childGroups()) {
        if (child->typeIdentifier() == vexo::VXReelixProjectGroupTypeIdentifier)
            ++projects;
        else
            clips += child->mediaObjects().size();
    }
    EXPECT_EQ(projects, 2 * volumes / 100);
    EXPECT_EQ(clips, volumes / 100);
    EXPECT_GT(searchPaths().size(), std::size_t{2 * volumes});
}

TEST_F(ManyLibrariesTest, EachOfThousandsOfSearchPathsIsWatched) {
    insertMedia();
    load();
    for (const auto& folder : searchPaths())
        EXPECT_FALSE(environment.watcher.watchPathIsUnique(folder, plugin().shared_from_this())) << folder;
}

}  // namespace
}  // namespace reelix
