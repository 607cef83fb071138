#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"
#include "tests/support/Pixels.h"

namespace soak {
namespace {

class OverlayDrawer final : public Actor {
  public:
    OverlayDrawer(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "overlays"; }

    void act() override {
        static constexpr Deed<OverlayDrawer> deeds[] = {{"draw", &OverlayDrawer::draw},
                                                        {"draw over", &OverlayDrawer::drawOver}};
        doOneOf(*this, deeds);
    }

  private:
    platform::ImageRef overlayOfAnyItem() {
        const PickedItem picked = anyItem(host_, chance);
        if (!picked.item)
            return nullptr;
        return managerOf(host_).thumbnailOverlayForMediaObject(picked.item, {picked.group},
                                                               {double(64 + chance.below(200)), 96});
    }
    bool draw() {
        const auto overlay = overlayOfAnyItem();
        return overlay && overlay->picture()->draw(128, 96);
    }
    bool drawOver() {
        const auto overlay = overlayOfAnyItem();
        platform::Bitmap thumbnail = testing_support::plainBitmap(128, 96);
        return overlay && overlay->picture()->drawOver(thumbnail);
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newOverlayDrawer(vexo::Host& host, unsigned seed) {
    return std::make_unique<OverlayDrawer>(host, seed);
}

}  // namespace soak
