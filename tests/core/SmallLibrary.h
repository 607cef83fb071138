// A home with a few projects and events, made by the tests of the plug-in's core.
#pragma once

#include <functional>
#include <string>
#include <thread>

#include "host/VXConstants.h"
#include "tests/support/PluginTest.h"

namespace testing_support {

class SmallLibraryTest : public PluginTest {
  protected:
    // A package with one rendered movie; answers the movie's path.
    std::string makeProject(const std::string& name) {
        const std::string movie = home().writeFile(
            "Movies/Reelix Projects/" + name + ".qnproject/Movies/" + name + ".mov", "movie");
        environment.metadata.setMovie(movie, {1280, 720});
        return movie;
    }
    // An event with one clip of noon on the first of July; answers the clip's path.
    std::string makeEvent(const std::string& name, int year) {
        return home().writeFile(
            "Movies/Reelix Events/" + name + "/clip-" + std::to_string(year) + "-07-01 12;00;00.mov", "clip");
    }

    // "dateSortReverse" of the suite's preferences, as another program would write it.
    void storeEventOrder(platform::Value mostRecentFirst) {
        platform::Dictionary reelix;
        reelix.emplace("dateSortReverse", std::move(mostRecentFirst));
        storeReelixPreferences(std::move(reelix));
    }
    void storeReelixPreferences(platform::Value reelix) {
        platform::Dictionary suite;
        suite.emplace("Reelix", std::move(reelix));
        environment.userDefaults.storeDomain(std::string(vexo::VXSuitePrefsDomainName), std::move(suite));
    }

    void inBackground(platform::Dispatcher::Block block) {
        environment.dispatcher.asyncInBackground(std::move(block));
        environment.dispatcher.runDueBlocks();
    }

    // The editor, as the desktop knows it. The file of the URL need not exist.
    void installApplication(std::optional<std::string> executable) {
        std::optional<platform::URL> url;
        if (executable)
            url = platform::URL::fileURLWithPath(*executable);
        environment.workspace.setApplicationForCreator("rlxm", {"com.norvale.ReelixApp", url, "reelix"});
    }
};

// Lets other threads run until something has happened, but not for long: what a lock prevents never happens.
inline bool happensSoon(const std::function<bool()>& something) {
    for (int turn = 0; turn < 20'000 && !something(); ++turn)
        std::this_thread::yield();
    return something();
}

// A picture of a size that was made up, drawable or not.
class PlainPicture final : public platform::Picture {
  public:
    PlainPicture(platform::Size size, bool drawable) : size_(size), drawable_(drawable) {}
    platform::Size naturalSize() const override { return size_; }
    bool isDrawable() const override { return drawable_; }
    std::optional<platform::Bitmap> draw(int, int) const override { return std::nullopt; }

  private:
    const platform::Size size_;
    const bool drawable_;
};

inline platform::ImageRef newImage(std::string name, platform::Size size = {32, 32}) {
    return std::make_shared<platform::Image>(std::make_shared<PlainPicture>(size, /*drawable=*/true),
                                             std::move(name));
}
inline platform::ImageRef newDamagedImage(std::string name) {
    return std::make_shared<platform::Image>(
        std::make_shared<PlainPicture>(platform::Size{32, 32}, /*drawable=*/false), std::move(name));
}

}  // namespace testing_support
