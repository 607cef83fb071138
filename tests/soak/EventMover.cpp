#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

class EventMover final : public Actor {
  public:
    EventMover(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "events"; }

    void act() override {
        static constexpr Deed<EventMover> deeds[] = {
            {"make", &EventMover::make},       {"make", &EventMover::make},
            {"rename", &EventMover::rename},   {"move out", &EventMover::moveOut},
            {"move in", &EventMover::moveIn},  {"move in", &EventMover::moveIn},
            {"delete", &EventMover::remove},   {"nest", &EventMover::nest},
            {"replace", &EventMover::replace},
        };
        doOneOf(*this, deeds);
    }

  private:
    std::string event() { return eventIn(places_.events, chance); }
    std::string outside() { return eventIn(places_.outside, chance); }

    bool make() {
        std::error_code failed;
        const std::string made = event();
        fs::create_directory(made, failed);
        return copyOver(sampleMovie(chance), clipIn(made, chance));
    }
    static bool move(const std::string& from, const std::string& to) {
        std::error_code failed;
        fs::rename(from, to, failed);
        return !failed;
    }
    bool rename() { return move(event(), event()); }
    bool moveOut() { return move(event(), outside()); }
    bool moveIn() { return move(outside(), event()); }
    bool remove() {
        std::error_code failed;
        return fs::remove_all(event(), failed) > 0 && !failed;
    }
    // An event in an event, with a cache folder as the editor makes them.
    bool nest() {
        std::error_code failed;
        const std::string inner = chance.oneIn(2) ? event() + "/Reelix Cache" : eventIn(event(), chance);
        return fs::create_directories(inner, failed) && copyOver(sampleMovie(chance), clipIn(inner, chance));
    }
    // A file where a folder was.
    bool replace() {
        std::error_code failed;
        const std::string place = event();
        fs::remove_all(place, failed);
        return overwrite(place, "no folder");
    }

    const Places& places_;
};

}  // namespace

ActorRef newEventMover(const Places& places, unsigned seed) {
    return std::make_unique<EventMover>(places, seed);
}

}  // namespace soak
