#include "platform/Pasteboard.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class Copier final : public Actor {
  public:
    Copier(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "copies"; }

    void act() override {
        static constexpr Deed<Copier> deeds[] = {
            {"items", &Copier::copyItems},
            {"groups", &Copier::copyGroups},
        };
        doOneOf(*this, deeds);
    }

  private:
    bool copyItems() {
        std::vector<vexo::VXMediaObjectRef> items;
        for (std::size_t i = chance.below(5); i > 0; --i)
            if (const auto item = anyItem(host_, chance).item)
                items.push_back(item);
        platform::Pasteboard pasteboard;
        return managerOf(host_).writeMediaObjects(items, pasteboard);
    }
    bool copyGroups() {
        std::vector<vexo::VXMediaGroupRef> groups;
        for (std::size_t i = chance.below(5); i > 0; --i)
            if (const auto group = anyGroup(host_, chance))
                groups.push_back(group);
        platform::Pasteboard pasteboard;
        return managerOf(host_).writeMediaGroups(groups, pasteboard);
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newCopier(vexo::Host& host, unsigned seed) {
    return std::make_unique<Copier>(host, seed);
}

}  // namespace soak
