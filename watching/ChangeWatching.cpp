// Turns reports of changed paths and queries into at most one pending reload a branch.
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "host/VXLog.h"
#include "platform/Dispatcher.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {
namespace {

namespace path = platform::path;

// Neither the preference file nor a library: a report of it ends in an event reload.
constexpr const char* placeholderPath = "XXX";

bool isInProjectLibrary(const std::string& changedPath) {
    const std::vector<std::string> components = path::components(changedPath);
    return std::any_of(components.begin(), components.end(), [](const std::string& component) {
        return component == ReelixProjectsFolderName || component == ReelixProjectsFolderNameLoc;
    });
}

// Setting an item's own thumbnail again makes the host redraw it.
void redrawFirstItemAtPath(const vexo::VXMediaGroupRef& root, const std::string& changedPath) {
    if (!root)
        return;
    for (const vexo::VXMediaObjectRef& mediaObject : root->mediaObjects()) {
        if (mediaObject->path() == changedPath) {
            mediaObject->setThumbnailImage(mediaObject->thumbnailImage());
            return;
        }
    }
}

}  // namespace

void VXReelixPlugin::_watchPath(const std::string& path) {
    vexo::VXPathWatcher& watcher = vexo::VXPathWatcher::sharedPathWatcher();
    if (watcher.watchPathIsUnique(path, self()))
        watcher.watchPath(path, self());
}

void VXReelixPlugin::watchedPathChanged(const std::string& path, std::uint64_t fileChangedEventFlags) {
    platform::Dispatcher& dispatcher = platform::services().dispatcher;
    if (dispatcher.isMainThread()) {
        dispatcher.asyncInBackground([plugin = self(), path, fileChangedEventFlags] {
            plugin->watchedPathChanged(path, fileChangedEventFlags);
        });
        return;
    }
    vexo::VXLogDef("watchedPathChanged:" + path, vexo::VXLogLevelTrace, this);
    if (path == path::expandingTilde(vexo::VXSuitePrefsPath)) {
        _checkReelixPreferences();
        return;
    }
    if (platform::services().fileManager.kindOfItemAtPath(path) == platform::FileKind::file) {
        redrawFirstItemAtPath(rootMediaGroup(), path);
        return;
    }
    if (isCancelLoadRequestPending())
        return;
    if (isInProjectLibrary(path))
        scheduleProjectsReload();
    else
        scheduleEventsReload();
}

void VXReelixPlugin::watchedQueryChanged(const platform::Notification& notification,
                                         const vexo::VXPathListRef& queryScope) {
    if (notification.name != platform::kMDQueryDidUpdateNotification)
        return;
    const auto defaultPath = _ReelixDefaultPath();
    const auto defaultPath2 = _ReelixDefaultPath2();
    const std::vector<std::string> scope = queryScope ? queryScope->snapshot() : std::vector<std::string>{};
    const auto projectFolder = std::find_if(scope.begin(), scope.end(), [&](const std::string& folder) {
        return !folder.empty() && (folder == defaultPath || folder == defaultPath2);
    });
    if (projectFolder == scope.end()) {
        watchedPathChanged(placeholderPath, 0);
        return;
    }

    const auto kind = platform::services().fileManager.kindOfItemAtPath(*projectFolder);
    if (!_missingReelixDefaultPath && !kind) {
        _missingReelixDefaultPath = true;
    } else if (_missingReelixDefaultPath && kind == platform::FileKind::directory) {
        _missingReelixDefaultPath = false;
        if (defaultPath2)
            _watchPath(*defaultPath2);  // the localized form, whichever of the two is back
    }
    scheduleProjectsReload();
}

// The first report of a burst fixes the moment of the reload; those that follow are absorbed until it starts.
void VXReelixPlugin::scheduleProjectsReload() {
    if (!_poolingProjectsReload.exchange(true))
        platform::services().dispatcher.afterInBackground(
            reloadDelay, [plugin = self()] { plugin->_reloadReelixProjects(); });
}

void VXReelixPlugin::scheduleEventsReload() {
    if (!_poolingEventsReload.exchange(true))
        platform::services().dispatcher.afterInBackground(
            reloadDelay, [plugin = self()] { plugin->_reloadReelixEvents(); });
}

// In this order: a load that begins in between is then seen by its number.
VXReelixPlugin::LoadState VXReelixPlugin::loadState() const {
    const unsigned begun = loadsBegun_;
    return {begun, isLoading()};
}

void VXReelixPlugin::reloadAgainAfterLoads(const LoadState& whenScanned) {
    if (!whenScanned.isLoading && whenScanned.begun == loadsBegun_)
        return;
    scheduleProjectsReload();
    scheduleEventsReload();
}

}  // namespace reelix
