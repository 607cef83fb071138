// The first load of a whole library, in a process of its own, beside a walk over the same files on one thread
// that keeps nothing, and beside what others take for that walk.
#include <benchmark/benchmark.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <stdexcept>
#include <string>

#include "benchmarks/BareWalk.h"
#include "benchmarks/PeerWalks.h"
#include "benchmarks/SampleLibrary.h"
#include "benchmarks/Surroundings.h"
#include "framework/Host.h"
#include "framework/TreeWalk.h"

namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr int rounds = 9;
// For a peer that takes this many times as long as we do, one round is enough.
constexpr double timesNotRepeated = 15;

// What one run took and came by; of several the least time counts.
struct Run {
    double seconds = 1e9;
    double processorSeconds = 1e9;
    long clips = 0;
    long groups = 0;
    std::size_t digest = 0;  // of the clips' paths
};

double seconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double>(time).count();
}

template <typename Work>
void measure(Run& run, const Work& work) {
    const auto processorStart = bench::processorTime();
    const auto start = Clock::now();
    work();
    run.seconds = std::min(run.seconds, seconds(Clock::now() - start));
    run.processorSeconds = std::min(run.processorSeconds, seconds(bench::processorTime() - processorStart));
}

long groupsOf(const vexo::VXMediaGroupRef& root) {
    long count = 0;
    vexo::visitGroups(root, [&count](const vexo::VXMediaGroupRef&) { return ++count > 0; });
    return count;
}

// Digests add up to the same in any order.
std::size_t digestOf(const std::string& path) {
    return std::hash<std::string>()(path);
}

std::size_t digestOfClips(const std::string& home) {
    std::size_t digest = 0;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(bench::eventsFolder(home)))
        if (entry.is_regular_file())
            digest += digestOf(entry.path());
    return digest;
}

void load(const std::string& home, Run& run) {
    setenv("XDG_CACHE_HOME", (home + "/.cache").c_str(), /*overwrite=*/1);
    vexo::HostOptions options;
    options.homeDirectory = home;
    options.pluginBundles = {REELIX_BUNDLE_DIR};
    vexo::Host host(options);
    if (host.loadPlugins())
        throw std::runtime_error("the plug-in is not there");
    measure(run, [&host] {
        host.startLoading();
        host.waitUntilLoaded(600s);
    });
    const auto root = host.plugins()[0].manager->rootMediaGroup();
    const auto clips = root->mediaObjects();
    run.clips = static_cast<long>(clips.size());
    run.digest = 0;
    for (const auto& clip : clips)
        run.digest += digestOf(clip->path().value_or(""));
    run.groups = groupsOf(root);
}

// Memory that a child writes and its parent reads.
class SharedRun {
  public:
    SharedRun()
        : run_(new (mmap(nullptr, sizeof(Run), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0))
                   Run) {}
    ~SharedRun() { munmap(run_, sizeof(Run)); }
    SharedRun(const SharedRun&) = delete;
    SharedRun& operator=(const SharedRun&) = delete;
    Run& operator*() { return *run_; }
    Run* operator->() { return run_; }

  private:
    Run* const run_;
};

void walk(const std::string& home, const bench::LibrarySize& size, Run& run) {
    bench::BareWalk found;
    measure(run, [&] { found = bench::walkLibraries(home); });
    run.clips = found.clips;
    if (found.clips != size.clips || found.projects != size.projects || found.trailers != 0)
        throw std::runtime_error("the walk missed something");
}

void walk(const std::string& home, const bench::PeerWalk& peer, const bench::LibrarySize& size, Run& run) {
    bench::PeerFindings found;
    measure(run, [&] { found = peer.walk(home + "/Movies"); });
    if (found.clips != size.clips || (peer.knowsProjects && found.projects != size.projects))
        throw std::runtime_error(std::string(peer.name) + " missed something");
}

// The library's own root, the years and what the projects lie in are groups as well.
bool isComplete(const Run& run, const bench::LibrarySize& size, std::size_t digest) {
    return run.clips == size.clips && run.digest == digest &&
           run.groups > size.projects + size.clips / size.clipsAnEvent;
}

void FirstLoad(benchmark::State& state) {
    const bench::LibrarySize size{static_cast<int>(state.range(0)), static_cast<int>(state.range(1)),
                                  static_cast<int>(state.range(2))};
    const bench::Folder home;
    bench::makeLibraries(home.path(), size);
    const std::size_t digest = digestOfClips(home.path());
    for (auto _ : state) {
        SharedRun floor, ours;
        std::array<SharedRun, bench::peerWalks.size()> peers;
        for (int i = 0; i < rounds; ++i) {
            bench::runInChild([&] { walk(home.path(), size, *floor); });
            bench::runInChild([&] { load(home.path(), *ours); });
            if (!isComplete(*ours, size, digest))
                return state.SkipWithError("the tree is not complete");
            for (std::size_t j = 0; j < peers.size(); ++j) {
                if (peers[j]->seconds > timesNotRepeated * ours->seconds && i > 0)
                    continue;
                bench::runInChild([&] { walk(home.path(), bench::peerWalks[j], size, *peers[j]); });
            }
        }
        state.SetIterationTime(ours->seconds);
        state.counters["to_floor"] = ours->seconds / floor->seconds;
        state.counters["cpu_to_floor"] = ours->processorSeconds / floor->processorSeconds;
        state.counters["us_per_clip"] = ours->seconds * 1e6 / size.clips;
        state.counters["floor_s"] = floor->seconds;
        for (std::size_t j = 0; j < peers.size(); ++j)
            state.counters[std::string("to_") + bench::peerWalks[j].name] = ours->seconds / peers[j]->seconds;
    }
}
BENCHMARK(FirstLoad)
    ->ArgNames({"clips", "an_event", "projects"})
    ->Args({100'000, 100, 10'000})
    ->Args({100'000, 10, 0})
    ->Args({100'000, 100, 0})
    ->Args({100'000, 100'000, 0})
    ->Args({1'000'000, 100, 0})
    ->Iterations(1)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

}  // namespace
