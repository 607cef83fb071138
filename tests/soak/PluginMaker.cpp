#include "host/VXPlugin.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class PluginMaker final : public Actor {
  public:
    PluginMaker(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "plug-ins"; }

    void act() override {
        static constexpr Deed<PluginMaker> deeds[] = {
            {"make", &PluginMaker::make},
            {"load", &PluginMaker::load},
            {"close", &PluginMaker::close},
            {"drop", &PluginMaker::drop},
        };
        doOneOf(*this, deeds);
    }

    // Its loads are not to last into the time when the tree is compared.
    void leave() override {
        if (other_)
            other_->close();
        if (other_)
            other_->waitUntilLoaded();
        other_.reset();
    }

  private:
    bool make() {
        const vexo::LoadedPlugin& plugin = host_.plugins().front();
        other_ = plugin.principalClass->newObject(plugin.bundle);
        return other_ != nullptr;
    }
    bool load() {
        if (other_)
            other_->loadData();
        return other_ != nullptr;
    }
    bool close() {
        if (other_)
            other_->close();
        return other_ != nullptr;
    }
    bool drop() { return std::exchange(other_, nullptr) != nullptr; }

    vexo::Host& host_;
    std::shared_ptr<vexo::VXMediaManager> other_;
};

}  // namespace

ActorRef newPluginMaker(vexo::Host& host, unsigned seed) {
    return std::make_unique<PluginMaker>(host, seed);
}

}  // namespace soak
