// Odd libraries in a host that follows changes: what the kernel watches is as much as there is to watch.
#include <climits>
#include <filesystem>

#include "framework/pathwatcher/PathWatcher.h"
#include "tests/hostile/DeepFolder.h"
#include "tests/hostile/HostileLibraryTest.h"
#include "tests/hostile/SpecialFiles.h"
#include "tests/support/FileContent.h"

namespace {

using namespace testing_support;
namespace fs = std::filesystem;

// Of all notification queues of this process.
long watchesOfKernel() {
    long watches = 0;
    for (const auto& entry : fs::directory_iterator("/proc/self/fdinfo")) {
        const std::string info = contentOf(entry.path());
        for (auto at = info.find("inotify wd:"); at != info.npos; at = info.find("inotify wd:", at + 1))
            ++watches;
    }
    return watches;
}

class WatchedTrees : public HostileLibraryTest {
  protected:
    WatchedTrees() {
        options_.followsChanges = true;
        makeProject("Good.qnproject");
        makeClip("Beach/good.mov");
    }

    // How many watches the library takes once it is loaded.
    long watchesOfLibrary() {
        long watches = 0;
        withHost([&](vexo::Host& host) {
            host.startLoading();
            ASSERT_TRUE(host.waitUntilLoaded(std::chrono::minutes(1)));
            for (const char* library : {"Movies/Reelix Projects", "Movies/Reelix Events"})
                EXPECT_EQ(host.pathWatcher().watchStateOf(home_.path(library)).how,
                          vexo::WatchState::How::events);
            watches = watchesOfKernel();
        });
        return watches;
    }
};

TEST_F(WatchedTrees, LinksTakeNoWatches) {
    const long before = watchesOfLibrary();
    for (const std::string& library : {project(""), event("")}) {
        home_.makeLink(library + "up", "..");
        home_.makeLink(library + "self", "self");
        home_.makeLink(library + "whole", home_.path(library));
        home_.makeLink(library + "everything", "/");
        home_.makeLink(library + "processes.qnproject", "/proc");
    }
    EXPECT_EQ(watchesOfLibrary(), before);
}

TEST_F(WatchedTrees, SpecialFilesTakeNoWatches) {
    const long before = watchesOfLibrary();
    for (const std::string& folder :
         {project(""), event(""), event("Beach/"), project("Good.qnproject/Movies/")})
        makeSpecialFiles(home_, folder, ".mov");
    EXPECT_EQ(watchesOfLibrary(), before);
}

TEST_F(WatchedTrees, ADeepTreeTakesAWatchForEachFolderThatAPathCanName) {
    const long before = watchesOfLibrary();
    DeepFolder folder(home_.makeFolder(event("Beach/deep")));
    const std::string name(200, 'd');
    const auto room = PATH_MAX - 1 - home_.path(event("Beach/deep")).size();
    folder.descend(PATH_MAX / 200 + 1, name);
    EXPECT_EQ(watchesOfLibrary(), before + 1 + static_cast<long>(room / (name.size() + 1)));
}

}  // namespace
