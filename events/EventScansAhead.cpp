#include "events/EventScansAhead.h"

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace reelix {

VXReelixPlugin::EventScansAhead::EventScansAhead(VXReelixPlugin& plugin) : plugin_(plugin) {
    platform::Locked monitor(plugin._monitor);
    for (const std::string& folder : plugin._ReelixEventsSearchPaths->snapshot()) {
        plugin.watchEventLibrary(folder);  // else what changes before the load comes to it would go unnoticed
        scans_.push_back(std::make_shared<EventLibraryScan>(plugin, folder));
    }
    const auto help = [plugin = plugin.self(), scans = scans_] {
        for (const auto& scan : scans)
            scan->work().help();
    };
    platform::services().dispatcher.detachThread("vexo-scan", plugin.loadThreadPriority(), help);
    plugin.eventScansAhead_ = this;
}

VXReelixPlugin::EventScansAhead::~EventScansAhead() {
    platform::Locked monitor(plugin_._monitor);
    plugin_.eventScansAhead_ = nullptr;
    for (const auto& scan : scans_)
        scan->work().abandon();
}

std::shared_ptr<VXReelixPlugin::EventLibraryScan> VXReelixPlugin::EventScansAhead::take(
    const std::string& libraryFolder) {
    if (scans_.empty() || scans_.front()->libraryFolder() != libraryFolder)
        return nullptr;
    auto scan = std::move(scans_.front());
    scans_.pop_front();
    return scan;
}

}  // namespace reelix
