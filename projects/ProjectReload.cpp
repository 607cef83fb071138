// Which folders are project libraries, and rebuilding the project branch of the tree from them.
#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/StableSort.h"
#include "core/VXReelixPlugin.h"
#include "core/VolumeFolders.h"
#include "events/EventOrder.h"
#include "platform/FileManager.h"
#include "platform/Services.h"

namespace reelix {

using platform::Locked;
using vexo::VXMediaGroupList;

namespace {

bool isProjectBranch(const vexo::VXMediaGroup& group) {
    const auto& type = group.typeIdentifier();
    return type == vexo::VXReelixProjectGroupTypeIdentifier ||
           type == vexo::VXReelixFolderGroupTypeIdentifier;
}

}  // namespace

// Duplicates stay, and so do folders that do not exist: those are watched until they appear.
void VXReelixPlugin::_prepareReelixProjectsSearchPaths() {
    _ReelixSearchPaths = std::make_unique<std::vector<std::string>>();
    const platform::FileManager& files = platform::services().fileManager;
    const auto plain = _ReelixDefaultPath();
    const auto localized = _ReelixDefaultPath2();
    if (plain && files.fileExistsAtPath(*plain)) {
        _missingReelixDefaultPath = false;
        _ReelixSearchPaths->push_back(*plain);
    } else {
        _missingReelixDefaultPath = !localized || !files.fileExistsAtPath(*localized);
        if (localized)
            _ReelixSearchPaths->push_back(*localized);
    }
    for (std::string& folder : foldersOnVolumes(ReelixProjectsFolderName))
        _ReelixSearchPaths->push_back(std::move(folder));
}

VXMediaGroupList VXReelixPlugin::_reloadReelixProjects() {
    return _reloadReelixProjects(/*updateRoot=*/true);
}

VXMediaGroupList VXReelixPlugin::_reloadReelixProjects(bool updateRoot) {
    _poolingProjectsReload = false;  // before all else: a change from now on needs a reload of its own
    Groups libraries;
    {
        Locked monitor(_monitor);
        _flatProjectGroupsList = std::make_unique<Groups>();
        scanProjectLibraries(libraries);
    }
    const LoadState whenScanned = loadState();
    if (!libraries.empty() && updateRoot && !isCancelLoadRequestPending()) {
        const Group& merged = libraries.front();
        for (std::size_t i = 1; i < libraries.size(); ++i)
            merged->addChildGroups(libraries[i]->childGroups());
        Group root;
        {
            Locked rootUpdate(_rootUpdateLock);
            root = rootMediaGroup();
            finishReloadReelixProjects(merged);
            _setMediaObjectsForRootMediaGroup(root);
        }
        if (root)
            setRootMediaGroup(root);
        reloadAgainAfterLoads(whenScanned);
    }

    VXMediaGroupList groups;
    for (const Group& library : libraries) {
        for (const Group& child : library->childGroups())
            groups = groups.appending(child);
    }
    return groups;
}

void VXReelixPlugin::scanProjectLibraries(Groups& libraries) {
    if (!_ReelixSearchPaths)
        return;
    for (std::size_t i = 0; i < _ReelixSearchPaths->size() && !isCancelLoadRequestPending(); ++i) {
        const std::string folder = (*_ReelixSearchPaths)[i];
        const Group library = _createReelixProjectsFolderForPath(folder);
        library->setName(localizedString("ReelixProjectLibrary"));
        // Deliberately the project type and not the folder type that the scan gave it.
        library->setTypeIdentifier(vexo::VXReelixProjectGroupTypeIdentifier);
        library->setParentID(std::string(vexo::VXReelix));
        library->setIcon(iconCache().smallApplicationIcon.get());
        libraries.push_back(library);
        _watchPath(folder);
    }
}

void VXReelixPlugin::finishReloadReelixProjects(const Group& mergedLibrary) {
    const Group root = rootMediaGroup();
    if (!root)
        return;
    Groups children;
    for (const Group& child : root->childGroups()) {
        if (child && !isProjectBranch(*child))
            children.push_back(child);
    }
    for (const Group& child : mergedLibrary->childGroups())
        children.push_back(child);

    const Groups sorted = stableSorted(children, ReelixSupport::_ReelixRootGroupComparison);
    if (!sorted.empty() || canLoadData())
        root->setChildGroups(VXMediaGroupList(sorted));
}

}  // namespace reelix
