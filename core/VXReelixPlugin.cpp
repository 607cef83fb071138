#include "core/VXReelixPlugin.h"

#include "core/ProcessCaches.h"
#include "platform/Services.h"
#include "platform/UserDefaults.h"

namespace reelix {

using platform::Locked;

vexo::VXMediaManager* VXReelixPlugin::init() {
    if (!VXMediaManager::init())
        return nullptr;
    _appIconLock = std::make_unique<platform::RecursiveMutex>();
    _mostRecentEventFirst = true;
    _poolingProjectsReload = false;
    _poolingEventsReload = false;
    setNeedsReload(true);
    setAutoReloadEnabled(true);
    _grabReelixIcons();
    _checkReelixPreferences();
    _updatePreferencesLock = std::make_unique<platform::Mutex>();

    setLoadThreadPriority(0.5);
    const auto wanted =
        platform::services().userDefaults.objectForKey("MediaBrowserThreadPriorityFolderMediaManager");
    const std::optional<double> priority = wanted ? wanted->doubleValue() : std::nullopt;
    if (priority && 0.0 <= *priority && *priority <= 1.0)
        setLoadThreadPriority(*priority);
    return this;
}

// Watches, queries and the subscription to mounts are not undone: the host holds their observer weakly.
VXReelixPlugin::~VXReelixPlugin() {
    IconCache& icons = iconCache();
    for (IconSlot* slot :
         {&icons.smallApplicationIcon, &icons.projectIcon, &icons.trailerIcon, &icons.spareProjectIcon,
          &icons.spareTrailerIcon, &icons.calendarIcon, &icons.eventIcon, &icons.reelixIcon})
        slot->clear();
    // The localized default project path stays: a later object uses it again.
    DefaultPathCache& paths = defaultPathCache();
    for (PathSlot* slot : {&paths.oldDefaultPath, &paths.defaultPath, &paths.defaultEventsFolderPath,
                           &paths.defaultEventsFolderPath2})
        slot->clear();
}

VXReelixPlugin::Groups VXReelixPlugin::mediaGroups() {
    Locked monitor(_monitor);
    Groups groups;
    for (const auto* list : {&_flatEventGroupsList, &_flatProjectGroupsList}) {
        if (*list)
            groups.insert(groups.end(), (*list)->begin(), (*list)->end());
    }
    return groups;
}

VXReelixPlugin::Groups VXReelixPlugin::ReelixFolders() {
    return mediaGroups();
}

VXReelixPlugin::Groups VXReelixPlugin::movieGroups() {
    return ReelixFolders();
}

std::optional<std::string> VXReelixPlugin::ReelixApplicationVersion() const {
    return _ReelixAppVersionString;
}

std::shared_ptr<VXReelixPlugin> VXReelixPlugin::self() {
    return std::static_pointer_cast<VXReelixPlugin>(shared_from_this());
}

}  // namespace reelix
