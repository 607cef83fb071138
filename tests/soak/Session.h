// One host from its start to its end, and those who act on it. Belongs to the main thread.
#pragma once

#include <atomic>
#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "apps/vexo/MainLoop.h"
#include "tests/soak/Census.h"
#include "tests/soak/TreePicture.h"
#include "tests/soak/Troupe.h"

namespace soak {

class Session {
  public:
    using Seconds = vexo::MainLoop::Seconds;

    // Everything outlives the session.
    struct Surroundings {
        const Places& places;
        vexo::MainLoop& loop;
        Ledger& ledger;
        Census& census;
    };
    // Opens the plug-in and loads the tree. Raises std::runtime_error when the plug-in can't be opened.
    Session(const Surroundings& surroundings, unsigned seed);
    ~Session();

    // Has everybody act on the host for so long; those who load and cancel leave when `interrupted` is over.
    void act(Seconds time, Seconds interrupted);
    // Begins much and waits for nothing, so that the host ends in the middle of it.
    void beginMuch();

    TreePicture tree() const;
    // Waits until the tree is that of a fresh load, for some minutes at most; answers by what they differ
    // then. Requires: nobody changes the libraries any more.
    std::string settle();
    // Groups and items that live though they are in no tree any more.
    std::size_t strays() const;
    // Some of the items, which live on with the caller.
    std::vector<vexo::VXMediaObjectRef> someItems(std::size_t count);

    int treesShown() const { return observed_->trees; }
    // The warnings that tell of a fault in ourselves rather than in a file; empty for none.
    std::string faults();

  private:
    struct Observed {
        std::atomic<int> trees = 0;
    };

    void observeTree();
    void recruit(RandomSource& seeds);
    void actOnMainThread();
    void dismiss(std::vector<ActorRef>& actors);
    TreePicture freshTree();
    void runLoop(Seconds time) { surroundings_.loop.run(time); }

    const Surroundings surroundings_;
    RandomSource chance_;
    const std::shared_ptr<Observed> observed_ = std::make_shared<Observed>();
    vexo::Host host_;
    Troupe readers_;
    std::vector<ActorRef> users_;         // of menus, copies and overlays
    std::vector<ActorRef> interrupters_;  // who load and cancel
};

}  // namespace soak
