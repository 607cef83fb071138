#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class ThumbnailDrawer final : public Actor {
  public:
    ThumbnailDrawer(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "thumbnails"; }

    void act() override {
        static constexpr Deed<ThumbnailDrawer> deeds[] = {
            {"draw", &ThumbnailDrawer::draw},
            {"refresh", &ThumbnailDrawer::refresh},
            {"icon", &ThumbnailDrawer::drawIcon},
        };
        doOneOf(*this, deeds);
    }

  private:
    bool drawImage(const platform::ImageRef& image) {
        static const std::vector<int> sides{16, 64, 200, 300};
        const int side = chance.among(sides);
        return image && image->picture() && image->picture()->draw(side, side);
    }

    bool draw() {
        const auto item = anyItem(host_, chance).item;
        return item && drawImage(item->thumbnailImage());
    }
    bool refresh() {
        const auto item = anyItem(host_, chance).item;
        if (!item)
            return false;
        item->setThumbnailImage(item->thumbnailImage());
        return drawImage(item->thumbnailImage());
    }
    bool drawIcon() {
        const auto group = anyGroup(host_, chance);
        return group && drawImage(group->icon());
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newThumbnailDrawer(vexo::Host& host, unsigned seed) {
    return std::make_unique<ThumbnailDrawer>(host, seed);
}

}  // namespace soak
