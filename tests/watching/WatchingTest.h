// What the tests of watching share: a plug-in with a loaded tree, reports on the main thread or off it, and a
// clock that the test moves.
#pragma once

#include "tests/support/ForwardingFiles.h"
#include "tests/support/PluginTest.h"

namespace testing_support {

class WatchingTest : public PluginTest {
  protected:
    using Request = VirtualDispatcher::Request;

    static constexpr std::chrono::seconds delay{5};
    static const inline Request delayedReload{.place = VirtualDispatcher::Place::background, .delay = delay};

    WatchingTest() {
        observed_ = std::make_shared<int>();
        plugin().addTreeObserver(observed_, [this](const vexo::VXMediaGroupRef&) { ++publications; });
    }

    // Runs at once on a background thread, as the plug-in sees it.
    void offMainThread(platform::Dispatcher::Block block) {
        environment.dispatcher.asyncInBackground(std::move(block));
        environment.dispatcher.runDueBlocks();
    }
    void report(const std::string& path, std::uint64_t flags = 0) {
        offMainThread([&, path, flags] { plugin().watchedPathChanged(path, flags); });
    }
    void reportQuery(std::vector<std::string> scope,
                     std::string_view name = platform::kMDQueryDidUpdateNotification) {
        offMainThread([&, scope, name = std::string(name)] {
            plugin().watchedQueryChanged({name}, std::make_shared<vexo::VXPathList>(scope));
        });
    }

    // "", "projects", "events" or "projects events"
    std::string pending() {
        std::string text = plugin()._poolingProjectsReload ? "projects" : "";
        if (plugin()._poolingEventsReload)
            text += text.empty() ? "events" : " events";
        return text;
    }
    // The reloads that were ever scheduled.
    std::size_t scheduled() const {
        const auto requests = environment.dispatcher.requests();
        return static_cast<std::size_t>(std::count(requests.begin(), requests.end(), delayedReload));
    }
    std::vector<std::string> eventsSearchPaths() {
        ExposedPlugin& watching = plugin();
        platform::Locked monitor(watching._monitor);
        const auto paths = watching._ReelixEventsSearchPaths;
        return paths ? paths->snapshot() : std::vector<std::string>{"<none>"};
    }

    int publications = 0;  // trees that were installed or published again
    ForwardingFiles files{environment};

  private:
    std::shared_ptr<int> observed_;
    platform::ServicesScope scope_{servicesWith(files, environment)};
};

}  // namespace testing_support
