#include "tests/soak/Session.h"

#include <algorithm>
#include <stdexcept>

#include "framework/TreeWalk.h"
#include "tests/soak/TreePick.h"

namespace soak {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr std::chrono::minutes longestSettling{3};

vexo::HostOptions optionsFor(const Places& places) {
    return {.homeDirectory = places.home,
            .pluginBundles = {REELIX_BUNDLE_DIR},
            .prefetchesMetadata = true,
            .followsChanges = true};
}

}  // namespace

Session::Session(const Surroundings& surroundings, unsigned seed)
    : surroundings_(surroundings),
      chance_(seed),
      host_(optionsFor(surroundings.places)),
      readers_(surroundings.ledger) {
    if (const auto problem = host_.loadPlugins())
        throw std::runtime_error(*problem);
    observeTree();
    host_.startLoading();
    while (!host_.waitUntilLoaded(50ms))
        surroundings_.loop.runPending();
}

Session::~Session() = default;

void Session::observeTree() {
    managerOf(host_).addTreeObserver(observed_,
                                     [observed = std::weak_ptr(observed_),
                                      &census = surroundings_.census](const vexo::VXMediaGroupRef& root) {
                                         if (const auto living = observed.lock())
                                             ++living->trees;
                                         census.take(root);
                                     });
}

void Session::recruit(RandomSource& seeds) {
    const auto seed = [&] { return static_cast<unsigned>(seeds.below(1u << 31)); };
    readers_.add(newTreeReader(host_, seed()), 20ms, seed());
    readers_.add(newPropertyAsker(host_, seed()), 5ms, seed());
    readers_.add(newThumbnailDrawer(host_, seed()), 20ms, seed());
    readers_.add(newPassingObserver(host_, surroundings_.places, seed()), 30ms, seed());
    users_.push_back(newMenuOpener(host_, seed()));
    users_.push_back(newCopier(host_, seed()));
    users_.push_back(newOverlayDrawer(host_, seed()));
    interrupters_.push_back(newLoader(host_, seed()));
    interrupters_.push_back(newPluginMaker(host_, seed()));
}

void Session::act(Seconds time, Seconds interrupted) {
    const auto start = Clock::now();
    recruit(chance_);
    while (Clock::now() - start < time && !surroundings_.loop.isEnded()) {
        actOnMainThread();
        if (Clock::now() - start > interrupted)
            dismiss(interrupters_);
        runLoop(10ms);
    }
    dismiss(interrupters_);
    dismiss(users_);
    readers_.end();
}

void Session::actOnMainThread() {
    for (const ActorRef& user : users_)
        user->act();
    // Loads come one after another, but not at once.
    if (!interrupters_.empty() && chance_.oneIn(5))
        chance_.among(interrupters_)->act();
}

void Session::dismiss(std::vector<ActorRef>& actors) {
    for (const ActorRef& actor : actors) {
        actor->leave();
        surroundings_.ledger.add(actor->name(), actor->counts());
    }
    actors.clear();
}

void Session::beginMuch() {
    host_.startLoading();
    for (const vexo::VXMediaObjectRef& item : someItems(50))
        if (const auto image = item->thumbnailImage())
            image->picture()->draw(200, 200);
    runLoop(Seconds(chance_.below(1000) / 1000.0));
    host_.startLoading();
}

TreePicture Session::tree() const {
    return pictureOf(managerOf(host_).rootMediaGroup());
}

TreePicture Session::freshTree() {
    const vexo::LoadedPlugin& plugin = host_.plugins().front();
    const auto other = plugin.principalClass->newObject(plugin.bundle);
    other->loadData();
    other->waitUntilLoaded();
    TreePicture picture = pictureOf(other->rootMediaGroup());
    other->close();
    return picture;
}

std::string Session::settle() {
    const TreePicture fresh = freshTree();
    const auto deadline = Clock::now() + longestSettling;
    while (tree() != fresh && Clock::now() < deadline)
        runLoop(100ms);
    return difference(tree(), fresh);
}

std::size_t Session::strays() const {
    std::size_t living = surroundings_.census.living();
    Census current;
    current.take(managerOf(host_).rootMediaGroup());
    return living - std::min(living, current.living());
}

std::vector<vexo::VXMediaObjectRef> Session::someItems(std::size_t count) {
    std::vector<vexo::VXMediaObjectRef> items;
    for (std::size_t i = 0; i < count; ++i)
        if (const auto item = anyItem(host_, chance_).item)
            items.push_back(item);
    return items;
}

std::string Session::faults() {
    std::string faults;
    for (const std::string& warning : host_.diagnostics().warnings())
        if (warning.starts_with("a plug-in failed"))
            faults += warning + "\n";
    return faults;
}

}  // namespace soak
