// What it costs to follow the file system, beside what it costs a program that does nothing else with
// inotify, and beside the packaged library of those who write such programs.
//
// The library imitated is one of a person who has filmed for twenty years: some ten thousand folders, seldom
// more than a few changes a minute; and once in a while a copy of everything.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <inotifytools/inotifytools.h>
#include <poll.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <thread>

#include "benchmarks/Surroundings.h"
#include "framework/Host.h"
#include "framework/pathwatcher/PathWatcher.h"

namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr std::uint32_t everything = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_ATTRIB |
                                     IN_MODIFY | IN_CLOSE_WRITE | IN_DELETE_SELF | IN_MOVE_SELF;

double seconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double>(time).count();
}

// The floor: reads events in batches of five milliseconds and counts them.
class BareLoop {
  public:
    explicit BareLoop(const std::vector<std::string>& folders)
        : inotify_(inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
        for (const std::string& folder : folders)
            inotify_add_watch(inotify_, folder.c_str(), everything);
    }
    ~BareLoop() { close(inotify_); }
    BareLoop(const BareLoop&) = delete;
    BareLoop& operator=(const BareLoop&) = delete;

    // Until nothing comes for half a second after `ended`.
    void drain(const std::atomic<bool>& ended) {
        for (pollfd readable{inotify_, POLLIN, 0}; poll(&readable, 1, 500) > 0 || !ended;) {
            std::this_thread::sleep_for(5ms);
            while (countBatch()) {
            }
        }
    }

    long events = 0;
    long overflows = 0;

  private:
    bool countBatch() {
        alignas(inotify_event) static thread_local std::array<char, 65536> buffer;
        const ssize_t size = read(inotify_, buffer.data(), buffer.size());
        for (ssize_t at = 0; at < size;) {
            const auto* event = reinterpret_cast<const inotify_event*>(buffer.data() + at);
            ++(event->mask & IN_Q_OVERFLOW ? overflows : events);
            at += static_cast<ssize_t>(sizeof(inotify_event) + event->len);
        }
        return size > 0;
    }

    const int inotify_;
};

// inotify-tools: learns of each event in which folder it was.
class ToolsLoop {
  public:
    explicit ToolsLoop(const std::vector<std::string>& folders) {
        inotifytools_initialize();
        for (const std::string& folder : folders)
            inotifytools_watch_file(folder.c_str(), static_cast<int>(everything));
    }
    ~ToolsLoop() { inotifytools_cleanup(); }
    ToolsLoop(const ToolsLoop&) = delete;
    ToolsLoop& operator=(const ToolsLoop&) = delete;

    // Until nothing comes for a second after `ended`.
    void drain(const std::atomic<bool>& ended) {
        for (;;) {
            const inotify_event* event = inotifytools_next_event(/*timeout=*/1);
            if (event)
                count(*event);
            else if (ended)
                return;
        }
    }

    long events = 0;
    long overflows = 0;

  private:
    void count(const inotify_event& event) {
        if (event.mask & IN_Q_OVERFLOW)
            ++overflows;
        else
            events += inotifytools_filename_from_wd(event.wd) != nullptr;
    }
};

// A hundred folders of files for a storm, which makes none itself: how long a file system takes to make a
// million, and what that does to everything else, differs from one minute to the next.
class StormGround {
  public:
    static constexpr long files = 33'334;
    static constexpr int rounds = 10;

    StormGround() : folders_(folder_.makeFolders(100)) {
        for (long i = 0; i < files; ++i)
            close(open(nameOf(i).c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
    }

    const std::string& path() const { return folder_.path(); }
    const std::vector<std::string>& folders() const { return folders_; }

    // Writes to each file, changes its rights and renames it, ten times over and in another process: a
    // million operations. Everything is then as it was before.
    void storm() const {
        bench::runInChild([&] {
            for (int round = 0; round < rounds; ++round)
                for (long file = 0; file < files; ++file) {
                    disturb(file, round % 2 == 0);
                    if (file % filesBetweenPauses == 0)
                        std::this_thread::sleep_for(pause);
                }
        });
    }

  private:
    // Whoever is without a processor for a tenth of a second, as happens on virtual machines, finds no more
    // events then than the kernel keeps (16,384).
    static constexpr long filesBetweenPauses = 300;
    static constexpr auto pause = 20ms;

    std::string nameOf(long file) const {
        return folders_[static_cast<std::size_t>(file) % folders_.size()] + "/" + std::to_string(file);
    }
    void disturb(long file, bool becomesMovie) const {
        std::string name = nameOf(file), next = name + ".mov";
        if (!becomesMovie)
            name.swap(next);
        const int descriptor = open(name.c_str(), O_WRONLY | O_CLOEXEC);
        const bool isWritten = descriptor >= 0 && write(descriptor, "x", 1) == 1;
        close(descriptor);
        if (!isWritten || chmod(name.c_str(), becomesMovie ? 0644 : 0600) != 0 ||
            rename(name.c_str(), next.c_str()) != 0)
            _exit(1);
    }

    const bench::Folder folder_;
    const std::vector<std::string> folders_;
};

// Counts what it hears.
class CountingObserver final : public vexo::VXPathObserver {
  public:
    void watchedPathChanged(const std::string&, std::uint64_t) override { ++reports; }
    void watchedQueryChanged(const platform::Notification&, const vexo::VXPathListRef&) override {}

    std::atomic<long> reports{0};
};

void waitUntilQuiet(const CountingObserver& observer) {
    for (long before = -1; before != observer.reports;) {
        before = observer.reports;
        std::this_thread::sleep_for(500ms);
    }
}

struct Drained {
    std::chrono::nanoseconds time{};
    long events = 0;
    long overflows = 0;
};

// A loop that runs on a thread of its own.
template <typename Loop>
class Running {
  public:
    explicit Running(const std::vector<std::string>& folders)
        : loop_(folders), thread_([this] {
              loop_.drain(ended_);
              drained_ = {bench::processorTimeOfThread(), loop_.events, loop_.overflows};
          }) {}

    Drained end() {
        ended_ = true;
        thread_.join();
        return drained_;
    }

  private:
    Loop loop_;
    std::atomic<bool> ended_ = false;
    Drained drained_;
    std::thread thread_;
};

double microsecondsOfAnEvent(const Drained& drained) {
    return seconds(drained.time) * 1e6 / static_cast<double>(drained.events);
}

// From the call to the last watch, and memory; the floor lists each folder and adds its watch.
void ArmFolders(benchmark::State& state) {
    const auto count = static_cast<int>(state.range(0));
    const bench::Folder folder;
    folder.makeFolders(count);
    for (auto _ : state) {
        const auto floorStart = Clock::now();
        std::vector<std::string> found{folder.path()};
        for (const auto& entry : fs::recursive_directory_iterator(folder.path()))
            if (entry.is_directory())
                found.push_back(entry.path());
        const auto floor = [&] {
            const BareLoop loop(found);
            return Clock::now() - floorStart;
        }();

        vexo::PathWatcher watcher;
        const bench::Services services;
        watcher.start();
        const auto observer = std::make_shared<CountingObserver>();
        const std::size_t bytesBefore = bench::residentBytes();
        const auto start = Clock::now();
        watcher.watchPath(folder.path(), observer);
        const auto time = Clock::now() - start;
        if (watcher.watchStateOf(folder.path()).how != vexo::WatchState::How::events)
            state.SkipWithError("the folders are not watched");
        state.SetIterationTime(seconds(time));
        state.counters["to_floor"] = seconds(time) / seconds(floor);
        state.counters["us_per_folder"] = seconds(time) * 1e6 / static_cast<double>(found.size());
        state.counters["bytes_per_folder"] =
            static_cast<double>(bench::residentBytes() - bytesBefore) / static_cast<double>(found.size());
        watcher.close();
    }
}
BENCHMARK(ArmFolders)
    ->Arg(21'500)
    ->Arg(100'000)
    ->Iterations(1)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

// A watcher that has nothing to do does nothing.
void WakeUpsOfAnIdleWatcher(benchmark::State& state) {
    const bench::Folder folder;
    folder.makeFolders(1000);
    vexo::PathWatcher watcher;
    const bench::Services services;
    watcher.start();
    const auto observer = std::make_shared<CountingObserver>();
    watcher.watchPath(folder.path(), observer);
    waitUntilQuiet(*observer);
    for (auto _ : state) {
        const auto before = bench::wakeUps();
        std::this_thread::sleep_for(10s);
        state.counters["wake_ups"] = static_cast<double>(bench::wakeUps() - before) - 1;  // our own sleep
    }
    watcher.close();
}
BENCHMARK(WakeUpsOfAnIdleWatcher)->Iterations(1)->Unit(benchmark::kSecond);

// A whole host with the plug-in: from the first change to the tree that shows it, beyond the five seconds
// that changes are collected, and how many trees there were.
void PublishABurst(benchmark::State& state) {
    const bench::Folder home;
    const std::string events = home.path() + "/Movies/Reelix Events";
    const auto addClip = [&](const std::string& event, int number) {
        fs::create_directories(events + "/" + event);
        const std::string clip = events + "/" + event + "/" + std::to_string(number) + ".mov";
        close(open(clip.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
    };
    for (int i = 0; i < 1000; ++i)
        addClip("Event " + std::to_string(i / 10), i);

    vexo::HostOptions options;
    options.homeDirectory = home.path();
    options.pluginBundles = {REELIX_BUNDLE_DIR};
    options.followsChanges = true;
    vexo::Host host(options);
    if (host.loadPlugins())
        return state.SkipWithError("the plug-in is not there");
    std::mutex mutex;
    std::condition_variable published;
    int trees = 0;
    const auto owner = std::make_shared<int>();
    host.plugins()[0].manager->addTreeObserver(owner, [&](const vexo::VXMediaGroupRef&) {
        const std::lock_guard lock(mutex);
        ++trees;
        published.notify_all();
    });
    host.startLoading();
    host.waitUntilLoaded(60s);
    for (auto _ : state) {
        std::unique_lock lock(mutex);
        const int before = trees;
        lock.unlock();
        const auto start = Clock::now();
        for (int i = 0; i < 1000; ++i)
            addClip("New " + std::to_string(i / 100), i);
        lock.lock();
        if (!published.wait_for(lock, 60s, [&] { return trees > before; }))
            return state.SkipWithError("no tree was published");
        const auto time = Clock::now() - start;
        published.wait_for(lock, 7s, [] { return false; });  // a further one would be one too many
        state.SetIterationTime(seconds(time));
        state.counters["beyond_5s_ms"] = (seconds(time) - 5) * 1000;
        state.counters["trees"] = trees - before;
        if (trees - before != 1)
            state.SkipWithError("not one tree for one burst");
    }
}
BENCHMARK(PublishABurst)->Iterations(1)->UseManualTime()->Unit(benchmark::kSecond);

// Processor time for the events of a storm, in the watcher and in the bare loop, which both follow the same
// one: a machine may be twice as slow in the next minute. Of inotify-tools the time of an event counts,
// because it may lose some.
void DrainAMillionOperations(benchmark::State& state) {
    for (auto _ : state) {
        const StormGround ground;
        vexo::PathWatcher watcher;
        const bench::Services services;
        std::atomic<int> warnings = 0;
        watcher.setWarningHandler([&](const std::string&) { ++warnings; });
        watcher.start();
        const auto observer = std::make_shared<CountingObserver>();
        watcher.watchPath(ground.path(), observer);
        Running<BareLoop> bareLoop(ground.folders());
        const auto before = bench::processorTime();
        ground.storm();
        const Drained floor = bareLoop.end();
        waitUntilQuiet(*observer);
        const auto time = bench::processorTime() - before - floor.time;
        watcher.close();
        Running<ToolsLoop> toolsLoop(ground.folders());
        ground.storm();
        const Drained tools = toolsLoop.end();
        if (floor.overflows > 0)
            state.SkipWithError("the bare loop lost events");
        if (warnings > 0 || observer->reports < StormGround::rounds * StormGround::files)
            state.SkipWithError("the watcher lost events");
        if (tools.events == 0)
            state.SkipWithError("inotify-tools saw nothing");
        state.SetIterationTime(seconds(time));
        const double perEvent = seconds(time) * 1e6 / static_cast<double>(floor.events);
        state.counters["floor_s"] = seconds(floor.time);
        state.counters["to_floor"] = seconds(time) / seconds(floor.time);
        state.counters["to_inotifytools"] = perEvent / microsecondsOfAnEvent(tools);
        state.counters["us_per_event"] = perEvent;
        state.counters["inotifytools_losses"] = static_cast<double>(tools.overflows);
        state.counters["reports"] = static_cast<double>(observer->reports);
    }
}
BENCHMARK(DrainAMillionOperations)->Iterations(1)->UseManualTime()->Unit(benchmark::kSecond);

}  // namespace
