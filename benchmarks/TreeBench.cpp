// What a loaded library costs: its memory, publishing it, gathering its items, and reading it meanwhile.
//
// The library imitated is an event library of a person who films a lot: a hundred clips an event, named by
// the camera's clock. The files are empty; loading reads none of them.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <malloc.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <condition_variable>
#include <cstdio>
#include <ctime>
#include <filesystem>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <unordered_map>

#include "benchmarks/Surroundings.h"
#include "framework/Host.h"

namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;
using vexo::VXMediaGroupRef;
using vexo::VXMediaObjectList;
using vexo::VXMediaObjectRef;

constexpr int clipsAnEvent = 100;

double seconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double>(time).count();
}

void makeFile(const std::string& path) {
    const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    if (file < 0)
        throw std::runtime_error("cannot make " + path);
    close(file);
}

// A home with an event library of `count` clips.
class ClipLibrary {
  public:
    explicit ClipLibrary(int count) {
        for (int i = 0; i < count; ++i)
            addClip(i);
    }

    // "clip-2009-04-05 10;20;30.mov" in "Event 00012"
    void addClip(int number) {
        std::array<char, 32> event{};
        std::snprintf(event.data(), event.size(), "Event %05d", number / clipsAnEvent);
        const std::string folder = home_.path() + "/Movies/Reelix Events/" + event.data();
        if (number % clipsAnEvent == 0)
            fs::create_directories(folder);
        const std::time_t time = 1'230'000'000 + 500 * std::time_t{number};
        std::tm calendar{};
        gmtime_r(&time, &calendar);
        std::array<char, 64> name{};
        std::strftime(name.data(), name.size(), "clip-%Y-%m-%d %H;%M;%S.mov", &calendar);
        makeFile(folder + "/" + name.data());
        paths_.push_back(folder + "/" + name.data());
    }

    const std::string& home() const { return home_.path(); }
    const std::vector<std::string>& paths() const { return paths_; }

  private:
    const bench::Folder home_;
    std::vector<std::string> paths_;
};

// The one that most rows share, because making it takes longest. A row may add clips.
ClipLibrary& sharedLibrary() {
    static ClipLibrary library(100'000);
    return library;
}

enum class Changes { ignored, followed };

// A host with the plug-in, which a benchmark has load a library.
class LoadedHost {
  public:
    LoadedHost(const ClipLibrary& library, Changes changes) : host_(options(library, changes)) {
        if (const auto problem = host_.loadPlugins())
            throw std::runtime_error(*problem);
        manager().addTreeObserver(observer_, [this](const VXMediaGroupRef&) {
            const std::lock_guard lock(mutex_);
            ++trees_;
            published_.notify_all();
        });
        const auto before = bench::processorTime();
        host_.startLoading();
        if (!host_.waitUntilLoaded(10min))
            throw std::runtime_error("the library was not loaded");
        loadTime_ = bench::processorTime() - before;
    }

    vexo::VXMediaManager& manager() { return *host_.plugins()[0].manager; }
    VXMediaGroupRef root() { return manager().rootMediaGroup(); }
    std::chrono::nanoseconds loadTime() const { return loadTime_; }

    int trees() {
        const std::lock_guard lock(mutex_);
        return trees_;
    }
    bool waitForTreeAfter(int trees) {
        std::unique_lock lock(mutex_);
        return published_.wait_for(lock, 2min, [&] { return trees_ > trees; });
    }

  private:
    static vexo::HostOptions options(const ClipLibrary& library, Changes changes) {
        vexo::HostOptions options;
        options.homeDirectory = library.home();
        options.pluginBundles = {REELIX_BUNDLE_DIR};
        options.followsChanges = changes == Changes::followed;
        return options;
    }

    std::mutex mutex_;
    std::condition_variable published_;
    int trees_ = 0;
    const std::shared_ptr<int> observer_ = std::make_shared<int>();
    std::chrono::nanoseconds loadTime_{};
    vexo::Host host_;
};

std::size_t allocatedBytes() {
    const struct mallinfo2 info = mallinfo2();
    return info.uordblks + info.hblkhd;
}

std::size_t nameBytes(const ClipLibrary& library) {
    std::size_t bytes = 0;
    for (const std::string& path : library.paths())
        bytes += path.size() - path.rfind('/') - 1;
    return bytes;
}

struct Memory {
    double allocated;
    double resident;
    double path;  // one text of each clip's path
};

// Of a loaded library, beyond what there was before, without the bytes of its file names.
Memory memoryOf(const ClipLibrary& library, int count) {
    const std::size_t beforeTexts = allocatedBytes();
    const std::vector<std::string> texts(library.paths());
    const std::size_t path = allocatedBytes() - beforeTexts;

    malloc_trim(0);
    const std::size_t allocatedBefore = allocatedBytes();
    const std::size_t residentBefore = bench::residentBytes();
    LoadedHost host(library, Changes::ignored);
    malloc_trim(0);
    if (host.root()->mediaObjects().size() != static_cast<std::size_t>(count))
        throw std::runtime_error("not every clip was loaded");
    const auto names = static_cast<double>(nameBytes(library));
    return {static_cast<double>(allocatedBytes() - allocatedBefore) - names,
            static_cast<double>(bench::residentBytes() - residentBefore) - names, static_cast<double>(path)};
}

// Each further clip's share, between two sizes of library. The floor is one text of its path.
void MemoryOfAClip(benchmark::State& state) {
    const auto small = static_cast<int>(state.range(0));
    const auto large = static_cast<int>(state.range(1));
    for (auto _ : state) {
        const Memory few = memoryOf(ClipLibrary(small), small);
        const Memory many = memoryOf(ClipLibrary(large), large);
        const double clips = large - small;
        state.counters["bytes_per_clip"] = (many.allocated - few.allocated) / clips;
        state.counters["resident_per_clip"] = (many.resident - few.resident) / clips;
        state.counters["to_floor"] = (many.allocated - few.allocated) / (many.path - few.path);
    }
}
BENCHMARK(MemoryOfAClip)->Args({100'000, 300'000})->Iterations(1)->Unit(benchmark::kSecond);

// The processor time from a new clip's file to the tree that has it.
std::chrono::nanoseconds reloadWithOneMore(LoadedHost& host, ClipLibrary& library) {
    const int before = host.trees();
    const auto start = bench::processorTime();
    library.addClip(static_cast<int>(library.paths().size()));
    if (!host.waitForTreeAfter(before) || host.root()->mediaObjects().size() != library.paths().size())
        throw std::runtime_error("no tree with the new clip was published");
    return bench::processorTime() - start;
}

// One clip more in a large library, from the file to the published tree, beyond the delay before it. The
// floor is the processor time of the first load, without watching. The first reload is not counted: the
// metadata queries are still finding out what there is.
void ReloadAfterOneChange(benchmark::State& state) {
    ClipLibrary& library = sharedLibrary();
    LoadedHost host(library, Changes::followed);
    reloadWithOneMore(host, library);
    std::chrono::nanoseconds floor{}, time{};
    for (auto _ : state) {
        const auto firstLoad = LoadedHost(library, Changes::ignored).loadTime();
        const auto reload = reloadWithOneMore(host, library);
        state.SetIterationTime(seconds(reload));
        floor += firstLoad;
        time += reload;
    }
    const auto iterations = static_cast<double>(state.iterations());
    state.counters["first_load_s"] = seconds(floor) / iterations;
    state.counters["to_floor"] = seconds(time) / seconds(floor);
    state.counters["us_per_clip"] =
        seconds(time) * 1e6 / iterations / static_cast<double>(library.paths().size());
}
BENCHMARK(ReloadAfterOneChange)->Iterations(5)->UseManualTime()->Unit(benchmark::kMillisecond);

// Publishing a tree again and asking for an item, which has the table of them made. The floor puts each ID
// into a table.
void PublishATree(benchmark::State& state) {
    LoadedHost host(sharedLibrary(), Changes::ignored);
    const VXMediaGroupRef root = host.root();
    const VXMediaObjectList items = root->mediaObjects();
    for (auto _ : state) {
        const auto floorStart = bench::processorTimeOfThread();
        std::unordered_map<std::string_view, VXMediaObjectRef> table;
        for (const VXMediaObjectRef& item : items)
            table.emplace(item->ID(), item);
        const auto floor = bench::processorTimeOfThread() - floorStart;
        if (table.size() != sharedLibrary().paths().size())
            state.SkipWithError("an ID is there twice");

        const auto start = bench::processorTimeOfThread();
        host.manager().setRootMediaGroup(root);
        const VXMediaObjectRef found = host.manager().mediaObjectForID(items.back()->ID());
        const auto time = bench::processorTimeOfThread() - start;
        if (found != items.back())
            state.SkipWithError("an item is not found by its ID");
        state.SetIterationTime(seconds(time));
        state.counters["to_floor"] = seconds(time) / seconds(floor);
    }
}
BENCHMARK(PublishATree)->Iterations(20)->UseManualTime()->Unit(benchmark::kMillisecond);

// The items of a group that was never given any: here of the event library. The floor copies the pointers.
void GatherItems(benchmark::State& state) {
    LoadedHost host(sharedLibrary(), Changes::ignored);
    const VXMediaGroupRef events = host.root()->childGroups().front();
    if (events->ownMediaObjects())
        return state.SkipWithError("the event library has a list of its own");
    const VXMediaObjectList items = events->mediaObjects();
    for (auto _ : state) {
        const auto floorStart = bench::processorTimeOfThread();
        const std::vector<VXMediaObjectRef> copied(items.begin(), items.end());
        const auto floor = bench::processorTimeOfThread() - floorStart;

        const auto start = bench::processorTimeOfThread();
        const VXMediaObjectList gathered = events->mediaObjects();
        const auto time = bench::processorTimeOfThread() - start;
        if (!std::equal(gathered.begin(), gathered.end(), copied.begin(), copied.end()))
            state.SkipWithError("not the items of the children, in order");
        state.SetIterationTime(seconds(time));
        state.counters["to_floor"] = seconds(time) / seconds(floor);
    }
}
BENCHMARK(GatherItems)->Iterations(50)->UseManualTime()->Unit(benchmark::kMicrosecond);

// How often the thread has waited for something, a lock for instance.
long waitsOfThread() {
    rusage usage{};
    getrusage(RUSAGE_THREAD, &usage);
    return usage.ru_nvcsw;
}

// Walks a tree as somebody who draws it does.
class Reader {
  public:
    explicit Reader(vexo::VXMediaManager& manager) : manager_(manager) {}

    void readUntil(const std::atomic<bool>& ended) {
        const long before = waitsOfThread();
        while (!ended) {
            const auto start = Clock::now();
            items += read(*manager_.rootMediaGroup());
            longest = std::max(longest, Clock::now() - start);
            ++trees;
        }
        waits = waitsOfThread() - before;
    }

    long trees = 0;
    std::size_t items = 0;
    Clock::duration longest{};
    long waits = 0;

  private:
    static std::size_t read(const vexo::VXMediaGroup& group) {
        std::size_t items = group.attributes()->size() + group.name().value_or("").size();
        if (const auto own = group.ownMediaObjects(); own && !own->empty())
            items += own->size() + own->front()->attributes().size();
        for (const VXMediaGroupRef& child : group.childGroups())
            items += read(*child);
        return items;
    }

    vexo::VXMediaManager& manager_;
};

// Reads the tree for as long as `work` runs.
Reader readDuring(LoadedHost& host, const std::function<void()>& work) {
    Reader reader(host.manager());
    std::atomic<bool> ended = false;
    std::thread thread([&] { reader.readUntil(ended); });
    work();
    ended = true;
    thread.join();
    return reader;
}

// A reader of the tree while it is loaded anew and published; the floor reads it while nothing happens.
// Waiting counts, whatever else the machine does: a reader that waits for nobody never gives up its
// processor.
void ReadsDuringAReload(benchmark::State& state) {
    LoadedHost host(sharedLibrary(), Changes::ignored);
    for (auto _ : state) {
        const Reader idle = readDuring(host, [] { std::this_thread::sleep_for(1s); });
        const Reader busy = readDuring(host, [&] {
            const int before = host.trees();
            host.manager().loadData();
            if (!host.waitForTreeAfter(before))
                state.SkipWithError("no tree was published");
            host.manager().waitUntilLoaded();
        });
        if (busy.trees == 0 || busy.items == 0)
            return state.SkipWithError("nothing was read");
        state.SetIterationTime(seconds(busy.longest));
        state.counters["waits"] = static_cast<double>(busy.waits);
        state.counters["reads"] = static_cast<double>(busy.trees);
        state.counters["to_floor"] = seconds(busy.longest) / seconds(idle.longest);
    }
}
BENCHMARK(ReadsDuringAReload)->Iterations(3)->UseManualTime()->Unit(benchmark::kMillisecond);

}  // namespace
