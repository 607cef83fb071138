#include <sys/stat.h>

#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

class PermissionChanger final : public Actor {
  public:
    PermissionChanger(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "permissions"; }

    void act() override {
        static constexpr Deed<PermissionChanger> deeds[] = {
            {"close event", &PermissionChanger::closeEvent},
            {"close clip", &PermissionChanger::closeClip},
            {"close project", &PermissionChanger::closeProject},
            {"open event", &PermissionChanger::openEvent},
            {"open clip", &PermissionChanger::openClip},
            {"open project", &PermissionChanger::openProject},
        };
        doOneOf(*this, deeds);
    }

    // So that the home can be removed.
    void leave() override {
        std::error_code failed;
        for (const std::string& folder : {places_.events, places_.projects, places_.outside})
            for (fs::recursive_directory_iterator entry(folder, failed), end; entry != end;
                 entry.increment(failed))
                if (entry->is_directory(failed) && !entry->is_symlink(failed))
                    chmod(entry->path().c_str(), 0755);
    }

  private:
    bool change(const std::string& path, mode_t mode) const {
        struct stat status;
        return lstat(path.c_str(), &status) == 0 && !S_ISLNK(status.st_mode) &&
               chmod(path.c_str(), mode) == 0;
    }
    std::string event() { return eventIn(places_.events, chance); }
    std::string clip() { return clipIn(event(), chance); }
    std::string project() { return projectIn(places_.projects, chance); }

    bool closeEvent() { return change(event(), 0); }
    bool closeClip() { return change(clip(), 0); }
    bool closeProject() { return change(project(), 0); }
    bool openEvent() { return change(event(), 0755); }
    bool openClip() { return change(clip(), 0644); }
    bool openProject() { return change(project(), 0755); }

    const Places& places_;
};

}  // namespace

ActorRef newPermissionChanger(const Places& places, unsigned seed) {
    return std::make_unique<PermissionChanger>(places, seed);
}

}  // namespace soak
