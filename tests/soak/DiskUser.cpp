#include <filesystem>
#include <optional>

#include "tests/soak/Actors.h"
#include "tests/support/LoopImage.h"

namespace soak {
namespace {

namespace fs = std::filesystem;
using testing_support::LoopImage;
using testing_support::ScopedMount;

// Its clips are of years that nobody else's are, because events of one date stand in the order in which their
// libraries were found.
class DiskUser final : public Actor {
  public:
    DiskUser(const Places& places, unsigned seed)
        : Actor(seed), places_(places), image_(places.diskImage, "Footage") {}

    std::string name() const override { return "disk"; }

    void act() override {
        static constexpr Deed<DiskUser> deeds[] = {
            {"put in", &DiskUser::putIn},
            {"take out", &DiskUser::takeOut},
            {"write", &DiskUser::write},
            {"delete", &DiskUser::remove},
        };
        doOneOf(*this, deeds);
    }

    void leave() override { takeOut(); }

  private:
    std::string event() { return places_.disk + "/Reelix Events/Disk " + std::to_string(chance.below(3)); }

    bool putIn() {
        if (mounted_)
            return false;
        mounted_.emplace(image_.mountAt(places_.disk));
        return true;
    }
    bool takeOut() {
        const bool wasIn = mounted_.has_value();
        mounted_.reset();
        return wasIn;
    }
    bool write() {
        std::error_code failed;
        const std::string folder = event();
        if (!mounted_ || (!fs::create_directories(folder, failed) && failed))
            return false;
        return copyOver(sampleMovie(chance),
                        folder + "/clip-201" + std::to_string(chance.below(9)) + "-05-01 10;00;00.mov");
    }
    bool remove() {
        std::error_code failed;
        return mounted_ && fs::remove_all(event(), failed) > 0;
    }

    const Places& places_;
    const LoopImage image_;
    std::optional<ScopedMount> mounted_;
};

}  // namespace

ActorRef newDiskUser(const Places& places, unsigned seed) {
    return std::make_unique<DiskUser>(places, seed);
}

}  // namespace soak
