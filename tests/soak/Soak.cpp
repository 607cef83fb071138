#include "tests/soak/Soak.h"

#include <fmt/format.h>
#include <unistd.h>

#include <iostream>
#include <stdexcept>

namespace soak {
namespace {

using namespace std::chrono_literals;

// Every act is over long before. The signal ends the program, which a debugger or a core file then shows.
constexpr unsigned hangSeconds = 600;

void require(bool holds, const std::string& otherwise) {
    if (!holds)
        throw std::runtime_error(otherwise);
}

void requireNothing(const char* what, const std::string& found) {
    require(found.empty(), std::string(what) + ":\n" + found);
}

double mebibytes(std::size_t bytes) {
    return static_cast<double>(bytes) / (1 << 20);
}

}  // namespace

Soak::Soak(const Places& places, const Options& options)
    : places_(places), options_(options), seeds_(options.seed), writers_(ledger_) {
    // A plug-in follows preferences that are there when it first loads.
    newPreferenceChanger(places_, nextSeed())->leave();
}

unsigned Soak::nextSeed() {
    return static_cast<unsigned>(seeds_.below(1u << 31));
}

bool Soak::isOver() const {
    const bool isCompared = sessions_ >= 2;  // memory with that after the first, often the tree as well
    return loop_.isEnded() || (isCompared && std::chrono::steady_clock::now() - start_ >= options_.time);
}

void Soak::run() {
    do {
        runSession();
        printProgress();
    } while (!isOver());
}

void Soak::runSession() {
    ++sessions_;
    alarm(hangSeconds + static_cast<unsigned>(options_.sessionTime.count()));
    std::vector<vexo::VXMediaObjectRef> kept;
    {
        Session session({places_, loop_, ledger_, census_}, nextSeed());
        if (lastTree_)
            requireNothing("the next host shows another tree", difference(*lastTree_, session.tree()));
        actAndCompare(session);
        kept = session.someItems(20);
        requireNothing("the plug-in raised", session.faults());
        trees_ += session.treesShown();
        if (seeds_.oneIn(2))
            endAmidChanges(session);
    }
    writers_.end();
    askItemsOfEndedHost(kept);
    kept.clear();
    checkMemory();
    alarm(0);
}

void Soak::recruitWriters() {
    const auto add = [this](ActorRef actor, std::chrono::microseconds meanRest) {
        writers_.add(std::move(actor), meanRest, nextSeed());
    };
    add(newLibraryMover(places_, nextSeed()), 3s);
    add(newClipEditor(places_, nextSeed()), 4ms);
    add(newEventMover(places_, nextSeed()), 20ms);
    add(newProjectEditor(places_, nextSeed()), 10ms);
    add(newLinkMaker(places_, nextSeed()), 30ms);
    add(newHider(places_, nextSeed()), 30ms);
    add(newPermissionChanger(places_, nextSeed()), 30ms);
    add(newPreferenceChanger(places_, nextSeed()), 300ms);
    add(newOtherProgram(places_, nextSeed()), 2s);
    if (!options_.mounts)
        return;
    add(newDiskUser(places_, nextSeed()), 300ms);
    add(newFolderCoverer(places_, nextSeed()), 300ms);
}

void Soak::actAndCompare(Session& session) {
    recruitWriters();
    session.act(options_.sessionTime, /*interrupted=*/options_.sessionTime * 0.6);
    writers_.end();
    requireNothing("the tree is not that of a fresh load", session.settle());
    lastTree_ = session.tree();
    const std::size_t strays = session.strays();
    require(strays <= lastTree_->size() + 100, fmt::format("{} things live in no tree", strays));
}

void Soak::endAmidChanges(Session& session) {
    recruitWriters();
    session.beginMuch();
    lastTree_ = std::nullopt;
}

// Programs may show what they have for a moment longer.
void Soak::askItemsOfEndedHost(const std::vector<vexo::VXMediaObjectRef>& items) {
    for (const vexo::VXMediaObjectRef& item : items) {
        item->name();
        item->duration();
        item->spotlightProperties();
        if (const auto image = item->thumbnailImage())
            image->picture()->draw(64, 64);
    }
}

// The first session fills what lives as long as the process; libraries that draw fill their caches of glyphs
// by and by.
void Soak::checkMemory() {
    const std::size_t living = census_.living();
    require(living == 0, fmt::format("{} groups and items of ended hosts live", living));
    bytesAtLast_ = allocatedBytes();
    if (!bytesAtFirst_)
        bytesAtFirst_ = bytesAtLast_;
    constexpr std::size_t tolerance = 8 << 20;
    require(bytesAtLast_ <= *bytesAtFirst_ + tolerance,
            fmt::format("{:.1f} MiB are allocated after {} sessions, {:.1f} MiB were after the first",
                        mebibytes(bytesAtLast_), sessions_, mebibytes(*bytesAtFirst_)));
}

void Soak::printProgress() const {
    const std::chrono::duration<double, std::ratio<60>> time = std::chrono::steady_clock::now() - start_;
    std::cout << fmt::format("{:.1f} min: {} sessions, {} trees shown, {:.2f} MiB allocated at rest\n",
                             time.count(), sessions_, trees_, mebibytes(bytesAtLast_))
              << ledger_.text() << std::flush;
}

}  // namespace soak
