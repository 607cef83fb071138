// A soak: sessions one after another on libraries that others change all the time, until the time is over.
//
// What has to hold is looked at whenever nobody acts:
// - the tree is that of a fresh load, in this host and in the next one;
// - what is in no tree any more has gone, and of ended hosts nothing is left;
// - the plug-in raised nothing but what its interface names.
// What else goes wrong, a crash, a race, a leak, ends the program or is told by the sanitizers.
#pragma once

#include <chrono>
#include <optional>
#include <string>

#include "tests/soak/Session.h"

namespace soak {

class Soak {
  public:
    using Seconds = Session::Seconds;

    struct Options {
        Seconds time{60};
        Seconds sessionTime{40};
        unsigned seed = 0;
        bool mounts = true;  // requires that the process may mount
    };

    Soak(const Places& places, const Options& options);

    // Prints as it goes. Raises std::runtime_error at what must not be.
    void run();

  private:
    void runSession();
    void recruitWriters();
    void actAndCompare(Session& session);
    void endAmidChanges(Session& session);
    void askItemsOfEndedHost(const std::vector<vexo::VXMediaObjectRef>& items);
    void checkMemory();
    void printProgress() const;
    bool isOver() const;
    unsigned nextSeed();

    const Places& places_;
    const Options options_;
    const std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
    RandomSource seeds_;
    vexo::MainLoop loop_;
    Ledger ledger_;
    Census census_;
    Troupe writers_;
    int sessions_ = 0;
    int trees_ = 0;
    std::optional<TreePicture> lastTree_;      // of libraries that nobody has changed since
    std::optional<std::size_t> bytesAtFirst_;  // after the first session
    std::size_t bytesAtLast_ = 0;
};

}  // namespace soak
