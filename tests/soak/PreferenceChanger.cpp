#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

std::string preferences(bool isReverse) {
    return std::string("<?xml version=\"1.0\"?><plist version=\"1.0\"><dict><key>Reelix</key><dict>") +
           "<key>dateSortReverse</key>" + (isReverse ? "<true/>" : "<false/>") + "</dict></dict></plist>";
}

class PreferenceChanger final : public Actor {
  public:
    PreferenceChanger(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "preferences"; }

    void act() override {
        static constexpr Deed<PreferenceChanger> deeds[] = {
            {"replace", &PreferenceChanger::replace}, {"replace", &PreferenceChanger::replace},
            {"write", &PreferenceChanger::write},     {"break", &PreferenceChanger::breakThem},
            {"delete", &PreferenceChanger::remove},
        };
        doOneOf(*this, deeds);
    }

    // Where the order is not told, an object of the plug-in keeps the one it had.
    void leave() override { replace(); }

  private:
    bool replace() {
        std::error_code failed;
        overwrite(places_.preferences + ".new", preferences(chance.oneIn(2)));
        fs::rename(places_.preferences + ".new", places_.preferences, failed);
        return !failed;
    }
    bool write() { return overwrite(places_.preferences, preferences(chance.oneIn(2))); }
    bool breakThem() { return overwrite(places_.preferences, preferences(true).substr(0, chance.below(90))); }
    bool remove() {
        std::error_code failed;
        return fs::remove(places_.preferences, failed);
    }

    const Places& places_;
};

}  // namespace

ActorRef newPreferenceChanger(const Places& places, unsigned seed) {
    return std::make_unique<PreferenceChanger>(places, seed);
}

}  // namespace soak
