#include "apps/vexo/Json.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

// Chooses nothing from its menus: that would start programs.
class MenuOpener final : public Actor {
  public:
    MenuOpener(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "menus"; }

    void act() override {
        static constexpr Deed<MenuOpener> deeds[] = {
            {"of an item", &MenuOpener::ofItem},
            {"of a group", &MenuOpener::ofGroup},
            {"message", &MenuOpener::message},
        };
        doOneOf(*this, deeds);
    }

  private:
    bool ofItem() {
        const PickedItem picked = anyItem(host_, chance);
        return picked.item && managerOf(host_).contextMenuForMediaObject(picked.item, picked.group);
    }
    bool ofGroup() {
        const auto group = anyGroup(host_, chance);
        return group && managerOf(host_).contextMenuForMediaGroup(group);
    }
    bool message() {
        const auto group = anyGroup(host_, chance);
        return group && vexo::noDataMessage(managerOf(host_), group);
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newMenuOpener(vexo::Host& host, unsigned seed) {
    return std::make_unique<MenuOpener>(host, seed);
}

}  // namespace soak
