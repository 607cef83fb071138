#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

// Its links lead to places in the libraries alone. Others write and delete through them, and what changes
// beyond a library is not followed.
class LinkMaker final : public Actor {
  public:
    LinkMaker(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "links"; }

    void act() override {
        static constexpr Deed<LinkMaker> deeds[] = {
            {"link of a clip", &LinkMaker::linkClip},
            {"link of a folder", &LinkMaker::linkFolder},
            {"loop", &LinkMaker::loop},
            {"project that is a link", &LinkMaker::linkProject},
            {"hard link", &LinkMaker::hardLink},
            {"pipe", &LinkMaker::pipe},
            {"folder for a clip", &LinkMaker::folder},
            {"remove", &LinkMaker::remove},
            {"remove project", &LinkMaker::removeProject},
        };
        doOneOf(*this, deeds);
    }

  private:
    std::string event() { return eventIn(places_.events, chance); }
    std::string clip() { return clipIn(event(), chance); }

    static bool link(const std::string& target, const std::string& path) {
        return symlink(target.c_str(), path.c_str()) == 0;
    }
    bool linkClip() { return link(clip(), clip()); }
    bool linkFolder() { return link(event(), event()); }
    bool loop() { return link("..", clip()); }
    bool linkProject() {
        return link(projectIn(places_.projects, chance), projectIn(places_.projects, chance));
    }
    bool hardLink() { return ::link(clip().c_str(), clip().c_str()) == 0; }
    bool pipe() { return mkfifo(clip().c_str(), 0644) == 0; }
    bool folder() { return mkdir(clip().c_str(), 0755) == 0; }
    bool remove() {
        const std::string path = clip();
        std::error_code failed;
        return !fs::is_regular_file(path, failed) && fs::remove(path, failed);
    }
    bool removeProject() {
        const std::string path = projectIn(places_.projects, chance);
        std::error_code failed;
        return fs::is_symlink(path, failed) && fs::remove(path, failed);
    }

    const Places& places_;
};

}  // namespace

ActorRef newLinkMaker(const Places& places, unsigned seed) {
    return std::make_unique<LinkMaker>(places, seed);
}

}  // namespace soak
