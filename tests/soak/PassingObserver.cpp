#include <atomic>

#include "framework/pathwatcher/PathWatcher.h"
#include "tests/soak/Actors.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

// Counts in itself, so that a call which comes after its end is seen by the sanitizers.
class Listener final : public vexo::VXPathObserver {
  public:
    void watchedPathChanged(const std::string&, std::uint64_t) override { hear(); }
    void watchedQueryChanged(const platform::Notification&, const vexo::VXPathListRef&) override { hear(); }
    void hear() { ++heard_; }
    bool hasHeard() const { return heard_ > 0; }

  private:
    std::atomic<int> heard_ = 0;
};

class PassingObserver final : public Actor {
  public:
    PassingObserver(vexo::Host& host, const Places& places, unsigned seed)
        : Actor(seed), host_(host), places_(places) {}

    std::string name() const override { return "observers"; }

    void act() override {
        static constexpr Deed<PassingObserver> deeds[] = {
            {"path", &PassingObserver::watchPath},   {"query", &PassingObserver::watchQuery},
            {"tree", &PassingObserver::observeTree}, {"ask", &PassingObserver::askState},
            {"heard", &PassingObserver::dropOne},
        };
        doOneOf(*this, deeds);
        if (listeners_.size() > 10)
            dropOne();
    }

    void leave() override { listeners_.clear(); }

  private:
    std::string place() {
        const std::string event = eventIn(places_.events, chance);
        return chance.oneIn(2) ? event : chance.oneIn(2) ? clipIn(event, chance) : places_.outside;
    }
    const std::shared_ptr<Listener>& newListener() {
        return listeners_.emplace_back(std::make_shared<Listener>());
    }

    bool watchPath() {
        vexo::VXPathWatcher::sharedPathWatcher().watchPath(place(), newListener());
        return true;
    }
    bool watchQuery() {
        static const std::vector<std::string> queries{"kMDItemFSName = '*.mov'c", "kMDItemFSSize > 1000",
                                                      "(kMDItemContentType = 'com.norvale.framecast-movie')",
                                                      "kMDItemDurationSeconds > 0.5", "nonsense ("};
        const auto scope = std::make_shared<vexo::VXPathList>(std::vector{place()});
        vexo::VXPathWatcher::sharedPathWatcher().watchQuery(chance.among(queries), newListener(), scope,
                                                            /*queryRunMode=*/4);
        if (chance.oneIn(2))
            scope->append(places_.projects);
        return true;
    }
    bool observeTree() {
        const auto& listener = newListener();
        managerOf(host_).addTreeObserver(
            listener, [&heard = *listener](const vexo::VXMediaGroupRef&) { heard.hear(); });
        return true;
    }
    bool askState() {
        host_.pathWatcher().watchStateOf(place());
        host_.pathWatcher().watchedAncestor(place());
        host_.pathWatcher().queries();
        return true;
    }
    bool dropOne() {
        if (listeners_.empty())
            return false;
        const auto dropped =
            listeners_.begin() + static_cast<std::ptrdiff_t>(chance.below(listeners_.size()));
        const bool hasHeard = (*dropped)->hasHeard();
        listeners_.erase(dropped);
        return hasHeard;
    }

    vexo::Host& host_;
    const Places& places_;
    std::vector<std::shared_ptr<Listener>> listeners_;
};

}  // namespace

ActorRef newPassingObserver(vexo::Host& host, const Places& places, unsigned seed) {
    return std::make_unique<PassingObserver>(host, places, seed);
}

}  // namespace soak
