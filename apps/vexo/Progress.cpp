#include "apps/vexo/Progress.h"

#include <fmt/format.h>
#include <unistd.h>

#include <iostream>
#include <unordered_set>

#include "apps/vexo/Terminal.h"
#include "framework/TreeWalk.h"

namespace vexo {
namespace {

using namespace std::chrono_literals;

constexpr auto redrawInterval = 200ms;
constexpr auto patience = 500ms;  // what is shorter than this shows no line
constexpr const char* eraseLine = "\r\033[K";

// Each item once, however many groups report it.
std::vector<VXMediaObjectRef> itemsOf(const Host& host) {
    std::vector<VXMediaObjectRef> items;
    std::unordered_set<VXMediaObjectRef> known;
    for (const LoadedPlugin& plugin : host.plugins()) {
        const VXMediaGroupRef root = plugin.manager->rootMediaGroup();
        if (!root)
            continue;
        visitGroups(root, [&](const VXMediaGroupRef& group) {
            for (const VXMediaObjectRef& item : group->ownMediaObjects().value_or(VXMediaObjectList()))
                if (known.insert(item).second)
                    items.push_back(item);
            return true;
        });
    }
    return items;
}

}  // namespace

void showWarning(const std::string& warning) {
    const char* const erase = isatty(STDERR_FILENO) ? eraseLine : "";
    std::cerr << erase + ("vexo: warning: " + printable(warning) + "\n") << std::flush;
}

ProgressLine::ProgressLine() : onTerminal_(isatty(STDERR_FILENO)) {}

ProgressLine::~ProgressLine() {
    if (isDrawn_)
        std::cerr << eraseLine << std::flush;
}

void ProgressLine::show(const std::string& text) {
    const auto now = Clock::now();
    if (!onTerminal_ || now - start_ < patience || now - lastDrawn_ < redrawInterval)
        return;
    std::cerr << eraseLine << text << std::flush;
    lastDrawn_ = now;
    isDrawn_ = true;
}

std::chrono::seconds ProgressLine::elapsed() const {
    return std::chrono::duration_cast<std::chrono::seconds>(Clock::now() - start_);
}

void loadWithProgress(Host& host) {
    ProgressLine line;
    host.startLoading();
    while (!host.waitUntilLoaded(redrawInterval))
        line.show(fmt::format("Reading the libraries… {} s", line.elapsed().count()));
}

void readMetadataWithProgress(Host& host) {
    ProgressLine line;
    const std::vector<VXMediaObjectRef> items = itemsOf(host);
    std::size_t done = 0;
    for (const VXMediaObjectRef& item : items) {
        line.show(fmt::format("Reading movies… {} of {}", ++done, items.size()));
        if (const VXMetadataPropertiesRef properties = item->spotlightProperties())
            properties->valueForKey(kMDItemMediaTypes);
    }
}

}  // namespace vexo
