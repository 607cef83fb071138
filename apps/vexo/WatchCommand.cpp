#include <fmt/chrono.h>
#include <fmt/format.h>

#include <map>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/MainLoop.h"
#include "apps/vexo/MainThread.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/TextTree.h"
#include "framework/GuardedWork.h"
#include "framework/pathwatcher/PathWatcher.h"

namespace vexo {
namespace {

using Clock = std::chrono::steady_clock;

// Prints what happens as it happens. Used on the main thread alone.
class WatchPrinter {
  public:
    WatchPrinter(const WatchOptions& options, MainLoop& loop, std::ostream& out)
        : options_(options), loop_(loop), out_(out) {}

    void printRoot(const LoadedPlugin& plugin, const VXMediaGroupRef& root) {
        if (options_.format == OutputFormat::json)
            printLine(jsonRoot(*plugin.manager, root));
        else if (root)
            printText(*plugin.manager, root);
    }
    void printReady() {
        if (options_.format == OutputFormat::json)
            printLine(event("ready"));
    }
    void printWarning(const std::string& warning) {
        if (options_.format != OutputFormat::json)
            return;
        Json json = event("warning");
        json["message"] = jsonText(warning);
        printLine(json);
    }

  private:
    Json event(const char* name) const {
        return {{"event", name}, {"seconds", std::chrono::duration<double>(Clock::now() - start_).count()}};
    }

    Json jsonRoot(VXMediaManager& manager, const VXMediaGroupRef& root) {
        JsonTreeWriter& writer =
            writers_.try_emplace(&manager, manager, MetadataOutput::leaveOut).first->second;
        Json json = event("root");
        json["plugin"] = jsonText(guardedAnswer([&] { return manager.uniqueID(); }));
        json["root"] = root ? writer.group(root, /*depth=*/std::nullopt) : Json();
        json["mediaGroups"] = writer.mediaGroups();
        return json;
    }

    void printText(VXMediaManager& manager, const VXMediaGroupRef& root) {
        const OutputStyle style = OutputStyle::ofStandardOutput();
        out_ << style.dim(fmt::format("{:%H:%M:%S}", fmt::localtime(std::time(nullptr)))) << "\n";
        printTree(manager, root, {}, style, out_);
        flush();
    }

    void printLine(const Json& json) {
        out_ << json.dump() << "\n";
        flush();
    }

    // Nobody reads on: there is nothing left to do.
    void flush() {
        if (!out_.flush())
            loop_.end();
    }

    const WatchOptions& options_;
    MainLoop& loop_;
    std::ostream& out_;
    const Clock::time_point start_ = Clock::now();
    std::map<VXMediaManager*, JsonTreeWriter> writers_;
};

void printWarningsOf(Host& host, const std::shared_ptr<WatchPrinter>& printer) {
    host.diagnostics().addWarningObserver(
        printer, [weakPrinter = std::weak_ptr(printer)](const std::string& warning) {
            onMainThread(weakPrinter, [warning](WatchPrinter& living) { living.printWarning(warning); });
        });
}

void printTreesOf(Host& host, const std::shared_ptr<WatchPrinter>& printer) {
    for (const LoadedPlugin& plugin : host.plugins())
        plugin.manager->addTreeObserver(
            printer, [weakPrinter = std::weak_ptr(printer), &plugin](const VXMediaGroupRef& root) {
                onMainThread(weakPrinter,
                             [&plugin, root](WatchPrinter& living) { living.printRoot(plugin, root); });
            });
}

// False when the loop was ended meanwhile.
bool load(Host& host, MainLoop& loop) {
    ProgressLine line;
    host.startLoading();
    while (!host.waitUntilLoaded(std::chrono::milliseconds(50))) {
        line.show(fmt::format("Reading the libraries… {} s", line.elapsed().count()));
        loop.runPending();
        if (loop.isEnded()) {
            host.cancelLoading();
            return false;
        }
    }
    loop.runPending();
    return !loop.isEnded();
}

}  // namespace

Problems runWatch(Host& host, const WatchOptions& options, std::ostream& out) {
    MainLoop loop;
    const auto printer = std::make_shared<WatchPrinter>(options, loop, out);
    printWarningsOf(host, printer);
    printTreesOf(host, printer);
    if (!load(host, loop))
        return {};
    loop.runPending();
    printer->printReady();
    loop.run(options.time);
    return {};
}

}  // namespace vexo
