#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

class Loader final : public Actor {
  public:
    Loader(vexo::Host& host, unsigned seed) : Actor(seed), host_(host) {}

    std::string name() const override { return "loads"; }

    void act() override {
        static constexpr Deed<Loader> deeds[] = {
            {"load", &Loader::load},
            {"load twice", &Loader::loadTwice},
            {"need reload", &Loader::needReload},
            {"cancel", &Loader::cancel},
        };
        doOneOf(*this, deeds);
    }

    // A change that is reported while a load is being cancelled is dropped, so only another load learns of
    // it.
    void leave() override {
        managerOf(host_).waitUntilLoaded();
        host_.startLoading();
        managerOf(host_).waitUntilLoaded();
    }

  private:
    bool load() {
        host_.startLoading();
        return true;
    }
    bool loadTwice() { return load() && load(); }
    bool needReload() {
        managerOf(host_).setNeedsReload(true);
        return true;
    }
    bool cancel() {
        const bool wasLoading = managerOf(host_).isLoading();
        host_.cancelLoading();
        return wasLoading;
    }

    vexo::Host& host_;
};

}  // namespace

ActorRef newLoader(vexo::Host& host, unsigned seed) {
    return std::make_unique<Loader>(host, seed);
}

}  // namespace soak
