#include <unistd.h>

#include <filesystem>

#include "platform/Path.h"
#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;
namespace path = platform::path;

class LibraryMover final : public Actor {
  public:
    LibraryMover(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "libraries"; }

    void act() override {
        static constexpr Deed<LibraryMover> deeds[] = {
            {"move events", &LibraryMover::moveEvents},
            {"move projects", &LibraryMover::moveProjects},
            {"link events", &LibraryMover::linkEvents},
            {"move Movies", &LibraryMover::moveMovies},
        };
        doOneOf(*this, deeds);
        bringBack();
    }

    void leave() override { bringBack(); }

  private:
    std::string movies() const { return path::withoutLastComponent(places_.events); }
    std::string away(const std::string& library) const {
        return path::appending(places_.outside, path::lastComponent(library));
    }
    static bool move(const std::string& from, const std::string& to) {
        std::error_code failed;
        fs::rename(from, to, failed);
        return !failed;
    }

    bool moveEvents() { return move(places_.events, away(places_.events)); }
    bool moveProjects() { return move(places_.projects, away(places_.projects)); }
    bool moveMovies() { return move(movies(), away(movies())); }
    // The library stays where it was by name, and lies elsewhere.
    bool linkEvents() {
        return moveEvents() && symlink(away(places_.events).c_str(), places_.events.c_str()) == 0;
    }

    // What others have put in the place of a library meanwhile goes.
    void bringBack() {
        for (const std::string& library : {movies(), places_.events, places_.projects}) {
            std::error_code failed;
            if (!fs::exists(away(library), failed))
                continue;
            fs::remove_all(library, failed);
            move(away(library), library);
        }
    }

    const Places& places_;
};

}  // namespace

ActorRef newLibraryMover(const Places& places, unsigned seed) {
    return std::make_unique<LibraryMover>(places, seed);
}

}  // namespace soak
