#include <filesystem>

#include "platform/Path.h"
#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;
namespace path = platform::path;

class Hider final : public Actor {
  public:
    Hider(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "hiding"; }

    void act() override {
        static constexpr Deed<Hider> deeds[] = {
            {"hide", &Hider::hide},
            {"show", &Hider::show},
            {"list", &Hider::list},
            {"list anew", &Hider::listAnew},
            {"delete list", &Hider::removeList},
        };
        doOneOf(*this, deeds);
    }

  private:
    std::string item() {
        const std::string event = eventIn(places_.events, chance);
        return chance.oneIn(3) ? event : clipIn(event, chance);
    }
    std::string folder() { return chance.oneIn(3) ? places_.events : eventIn(places_.events, chance); }
    std::string content() { return path::lastComponent(item()) + "\n" + path::lastComponent(item()) + "\n"; }
    static std::string hidden(const std::string& item) {
        return path::appending(path::withoutLastComponent(item), "." + path::lastComponent(item));
    }
    static bool move(const std::string& from, const std::string& to) {
        std::error_code failed;
        fs::rename(from, to, failed);
        return !failed;
    }

    bool hide() {
        const std::string shown = item();
        return move(shown, hidden(shown));
    }
    bool show() {
        const std::string shown = item();
        return move(hidden(shown), shown);
    }
    bool list() { return overwrite(folder() + "/.hidden", content()); }
    // As file managers do.
    bool listAnew() {
        const std::string list = folder() + "/.hidden";
        return overwrite(list + ".new", content()) && move(list + ".new", list);
    }
    bool removeList() {
        std::error_code failed;
        return fs::remove(folder() + "/.hidden", failed);
    }

    const Places& places_;
};

}  // namespace

ActorRef newHider(const Places& places, unsigned seed) {
    return std::make_unique<Hider>(places, seed);
}

}  // namespace soak
