#include <sys/xattr.h>
#include <unistd.h>

#include <filesystem>

#include "tests/soak/Actors.h"

namespace soak {
namespace {

namespace fs = std::filesystem;

class ClipEditor final : public Actor {
  public:
    ClipEditor(const Places& places, unsigned seed) : Actor(seed), places_(places) {}

    std::string name() const override { return "clips"; }

    void act() override {
        static constexpr Deed<ClipEditor> deeds[] = {
            {"write", &ClipEditor::write},   {"copy", &ClipEditor::copy},     {"cut", &ClipEditor::cut},
            {"rename", &ClipEditor::rename}, {"delete", &ClipEditor::remove}, {"date", &ClipEditor::date},
        };
        doOneOf(*this, deeds);
    }

  private:
    std::string clip() { return clipIn(eventIn(places_.events, chance), chance); }

    bool write() { return overwrite(clip(), std::string(chance.below(2000), 'x')); }
    bool copy() { return copyOver(sampleMovie(chance), clip()); }
    bool cut() { return truncate(clip().c_str(), off_t(chance.below(3000))) == 0; }
    bool rename() {
        std::error_code failed;
        fs::rename(clip(), clip(), failed);
        return !failed;
    }
    bool remove() {
        std::error_code failed;
        return fs::remove(clip(), failed);
    }
    bool date() {
        const std::string date = "200" + std::to_string(chance.below(9)) + "-03-01 10:00:00 +0000";
        return lsetxattr(clip().c_str(), "user.date", date.data(), date.size(), 0) == 0;
    }

    const Places& places_;
};

}  // namespace

ActorRef newClipEditor(const Places& places, unsigned seed) {
    return std::make_unique<ClipEditor>(places, seed);
}

}  // namespace soak
