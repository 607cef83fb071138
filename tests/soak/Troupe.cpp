#include "tests/soak/Troupe.h"

#include <fmt/format.h>

#include <stdexcept>

namespace soak {

void Ledger::add(const std::string& name, const Tally::Counts& counts) {
    for (const auto& [deed, count] : counts)
        entries_[name][deed] += count;
}

std::string Ledger::text() const {
    std::string text;
    for (const auto& [name, counts] : entries_) {
        text += fmt::format("  {:15}", name);
        for (const auto& [deed, count] : counts)
            text += fmt::format(" {} {},", deed, count);
        text.back() = '\n';
    }
    return text;
}

void Troupe::add(ActorRef actor, std::chrono::microseconds meanRest, unsigned seed) {
    actors_.push_back(std::make_unique<ActorThread>(std::move(actor), meanRest, seed));
}

void Troupe::end() {
    std::string failures;
    for (const auto& actor : actors_) {
        actor->end();
        ledger_.add(actor->name(), actor->counts());
        if (!actor->failure().empty())
            failures += actor->name() + ": " + actor->failure() + "\n";
    }
    actors_.clear();
    if (!failures.empty())
        throw std::runtime_error(failures);
}

}  // namespace soak
