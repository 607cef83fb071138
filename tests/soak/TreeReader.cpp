#include "framework/TreeWalk.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class TreeReader final : public Actor {
  public:
    TreeReader(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "reading"; }

    void act() override {
        static constexpr Deed<TreeReader> deeds[] = {
            {"tree", &TreeReader::readTree},
            {"flat lists", &TreeReader::readLists},
            {"item by ID", &TreeReader::findItem},
            {"state", &TreeReader::askState},
        };
        doOneOf(*this, deeds);
    }

  private:
    bool readTree() {
        const vexo::VXMediaGroupRef root = managerOf(host_).rootMediaGroup();
        if (root)
            vexo::visitGroups(root, [](const vexo::VXMediaGroupRef& group) {
                readGroup(*group);
                return true;
            });
        return root != nullptr;
    }
    static void readGroup(const vexo::VXMediaGroup& group) {
        group.name();
        group.parentID();
        group.path();
        group.icon();
        group.modificationDate();
        group.attributes();
        group.typeIdentifier();
        for (const vexo::VXMediaObjectRef& item : group.mediaObjects())
            readItem(*item);
    }
    static void readItem(const vexo::VXMediaObject& item) {
        item.name();
        item.URL();
        item.icon();
        item.attributes();
        item.mediaSourceType();
    }

    bool readLists() {
        for (const vexo::VXMediaGroupRef& group : managerOf(host_).mediaGroups())
            readGroup(*group);
        return true;
    }
    // Another item may have come by the ID meanwhile, or none.
    bool findItem() {
        const PickedItem picked = anyItem(host_, chance);
        return picked.item && managerOf(host_).mediaObjectForID(picked.item->ID());
    }
    bool askState() {
        vexo::VXMediaManager& manager = managerOf(host_);
        manager.isLoading();
        manager.needsReload();
        manager.libraryLocations();
        manager.defaultLoadingMessage();
        host_.diagnostics().warnings();
        return true;
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newTreeReader(vexo::Host& host, unsigned seed) {
    return std::make_unique<TreeReader>(host, seed);
}

}  // namespace soak
