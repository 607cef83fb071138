#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "events/EventScansAhead.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/Workspace.h"

namespace reelix {
namespace {

using platform::Locked;

constexpr std::string_view projectQuery =
    "(kMDItemKind = '*Reelix Project*'cd) && (kMDItemFSName = '*.qnproject'c)";
constexpr std::string_view eventQuery = "(kMDItemContentType = 'com.norvale.framecast-movie')";
constexpr unsigned queryRunMode = 4;

// The paths up to the first that is missing.
vexo::VXPathListRef pathList(std::initializer_list<std::optional<std::string>> paths) {
    auto list = std::make_shared<vexo::VXPathList>();
    for (const auto& path : paths) {
        if (!path)
            break;
        list->append(*path);
    }
    return list;
}

}  // namespace

void VXReelixPlugin::loadData() {
    if (firstTimeCallingLoadData()) {
        const std::string suitePreferences = platform::path::expandingTilde(vexo::VXSuitePrefsPath);
        if (platform::services().fileManager.fileExistsAtPath(suitePreferences))
            _watchPath(suitePreferences);
        if (const auto defaultPath = _ReelixDefaultPath())
            _watchPath(*defaultPath);
        platform::services().workspace.notificationCenter().addObserver(
            weak_from_this(), platform::NSWorkspaceDidMountNotification,
            [this](const platform::Notification& notification) { _fileSystemMounted(notification); });
    }
    VXMediaManager::loadData();
}

VXReelixPlugin::Group VXReelixPlugin::performLoadData() {
    ++loadsBegun_;
    Locked monitor(_monitor);
    if (!_ReelixSearchPaths)
        _prepareReelixProjectsSearchPaths();
    if (!_ReelixEventsSearchPaths)
        _prepareReelixEventsSearchPaths();

    const Group root =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixRootGroupTypeIdentifier, std::string(vexo::VXReelix));
    root->setName(std::string(ReelixApplicationName));
    root->setParentID(std::nullopt);
    root->setIcon(iconCache().smallApplicationIcon.get());
    root->setDynamicMediaObjects(false);

    // The event query shares the list of folders, so that volumes mounted later are searched as well.
    vexo::VXPathWatcher& watcher = vexo::VXPathWatcher::sharedPathWatcher();
    watcher.watchQuery(std::string(projectQuery), self(),
                       pathList({_ReelixDefaultPath(), _ReelixDefaultPath2()}), queryRunMode);
    watcher.watchQuery(std::string(eventQuery), self(), _ReelixEventsSearchPaths, queryRunMode);

    const EventScansAhead eventScansAhead(*this);
    root->setChildGroups(_reloadReelixProjects(/*updateRoot=*/false));
    root->addChildGroup(_reloadReelixEvents(root->ID(), /*updateRootMediaGroup=*/false));
    _setMediaObjectsForRootMediaGroup(root);
    return root;
}

void VXReelixPlugin::_setMediaObjectsForRootMediaGroup(const Group& rootMediaGroup) {
    if (!rootMediaGroup)
        return;
    std::vector<vexo::VXMediaObjectList> lists;
    for (const Group& child : rootMediaGroup->childGroups()) {
        const auto& type = child->typeIdentifier();
        if (type == vexo::VXReelixProjectLibraryGroupTypeIdentifier)
            continue;
        if (type == vexo::VXReelixProjectGroupTypeIdentifier) {
            if (const Object representative = _representingMediaObjectForProject(child))
                lists.push_back({representative});
            continue;
        }
        lists.push_back(child->mediaObjects());
    }
    rootMediaGroup->setMediaObjects(vexo::VXMediaObjectList::joining(lists));
}

bool VXReelixPlugin::canLoadData() {
    const auto application =
        platform::services().workspace.applicationForCreator(ReelixApplicationCreatorCode);
    return application && application->url &&
           platform::services().fileManager.fileExistsAtPath(application->url->path());
}

bool VXReelixPlugin::appInstalled() {
    return platform::services().workspace.applicationForCreator(ReelixApplicationCreatorCode).has_value();
}

std::optional<std::string> VXReelixPlugin::defaultLoadingMessage() {
    if (!isLoading())
        return std::nullopt;
    return localizedString(vexo::VXPluginDefaultLoadingStringKey);
}

std::optional<std::string> VXReelixPlugin::defaultNoDataMessage(const Group& group) {
    const Group root = rootMediaGroup();
    if (group && group == root && root->childGroups().empty())
        return localizedString(vexo::VXPluginDefaultNoDataStringKey);
    if (group && group->typeIdentifier() == vexo::VXReelixProjectGroupTypeIdentifier)
        return localizedString(_isTrailer(group->ID().value_or("")) ? "ReelixTrailerNotReady"
                                                                    : "ReelixProjectNotReady");
    return std::nullopt;
}

std::vector<vexo::VXLibraryLocations> VXReelixPlugin::libraryLocations() {
    Locked monitor(_monitor);
    std::vector<vexo::VXLibraryLocations> locations;
    if (_ReelixSearchPaths)
        locations.push_back({"projects", *_ReelixSearchPaths});
    if (_ReelixEventsSearchPaths)
        locations.push_back({"events", _ReelixEventsSearchPaths->snapshot()});
    return locations;
}

}  // namespace reelix
