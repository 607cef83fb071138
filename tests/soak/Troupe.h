// Several actors, each on a thread of its own.
#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "tests/soak/ActorThread.h"
#include "tests/soak/Actors.h"

namespace soak {

// What was done in all, by whom.
class Ledger {
  public:
    void add(const std::string& name, const Tally::Counts& counts);
    // A line for each name.
    std::string text() const;

  private:
    std::map<std::string, Tally::Counts> entries_;
};

class Troupe {
  public:
    explicit Troupe(Ledger& ledger) : ledger_(ledger) {}

    // Begins at once.
    void add(ActorRef actor, std::chrono::microseconds meanRest, unsigned seed);
    // Has all leave, in the order in which they came. Raises std::runtime_error when one of them raised.
    void end();

  private:
    Ledger& ledger_;
    std::vector<std::unique_ptr<ActorThread>> actors_;
};

}  // namespace soak
