#include "host/VXConstants.h"
#include "host/VXMediaBrowserUtilities.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class PropertyAsker final : public Actor {
  public:
    PropertyAsker(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "properties"; }

    void act() override {
        static constexpr Deed<PropertyAsker> deeds[] = {
            {"duration", &PropertyAsker::askDuration}, {"resolution", &PropertyAsker::askResolution},
            {"all", &PropertyAsker::askAll},           {"real path", &PropertyAsker::askRealPath},
            {"type", &PropertyAsker::askType},
        };
        doOneOf(*this, deeds);
    }

  private:
    vexo::VXMediaObjectRef item() { return anyItem(host_, chance).item; }

    bool askDuration() {
        const auto asked = item();
        return asked && asked->duration() > 0;
    }
    bool askResolution() {
        const auto asked = item();
        return asked && asked->attributeForKey(vexo::VXMediaObjectResolutionStringKey);
    }
    bool askAll() {
        const auto asked = item();
        const auto properties = asked ? asked->spotlightProperties() : nullptr;
        return properties && !properties->allValues().empty();
    }
    bool askRealPath() {
        const auto asked = item();
        return asked && asked->aliasResolvedPath();
    }
    bool askType() {
        const auto asked = item();
        return asked && vexo::VXMediaBrowserUtilities::supportedMovieFile(asked->ID());
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newPropertyAsker(vexo::Host& host, unsigned seed) {
    return std::make_unique<PropertyAsker>(host, seed);
}

}  // namespace soak
