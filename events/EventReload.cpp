// Which folders are event libraries, and rebuilding the event branch of the tree from them.
#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/StableSort.h"
#include "core/VXReelixPlugin.h"
#include "core/VolumeFolders.h"
#include "events/EventOrder.h"
#include "platform/Path.h"

namespace reelix {

using platform::Locked;
using ReelixSupport::EventOrder;
using ReelixSupport::groupsOf;
using ReelixSupport::OrderedEvent;
using ReelixSupport::sortedByYear;
using vexo::VXMediaGroupList;
using vexo::VXPathWatcher;

namespace {

std::optional<platform::Value> yearOf(const vexo::VXMediaGroup& group) {
    const auto attributes = group.attributes();
    const platform::Value* year = platform::find(*attributes, VXReelixEventCreationYear);
    return year ? std::optional(*year) : std::nullopt;
}

}  // namespace

// The year groups of one event library, with the events that were filed under them.
struct VXReelixPlugin::YearGroups {
    struct YearGroup {
        Group group;
        OrderedEvents events;
    };

    std::vector<YearGroup> inOrder;
    std::map<double, std::size_t> placeOfYear;
};

// Duplicates stay, and so do folders that do not exist.
void VXReelixPlugin::_prepareReelixEventsSearchPaths() {
    auto paths = std::make_shared<vexo::VXPathList>();
    for (const auto& folder : {_ReelixDefaultEventsFolderPath(), _ReelixDefaultEventsFolderPath2()}) {
        if (folder)
            paths->append(*folder);
    }
    for (std::string& folder : foldersOnVolumes(ReelixEventsFolderName))
        paths->append(std::move(folder));
    _ReelixEventsSearchPaths = std::move(paths);
}

VXReelixPlugin::Group VXReelixPlugin::_reloadReelixEvents() {
    const Group root = rootMediaGroup();
    return _reloadReelixEvents(root ? root->ID() : std::nullopt, /*updateRootMediaGroup=*/true);
}

VXReelixPlugin::Group VXReelixPlugin::_reloadReelixEvents(const std::optional<std::string>& parentID,
                                                          bool updateRootMediaGroup) {
    _poolingEventsReload = false;  // before all else: a change from now on needs a reload of its own
    OrderedEvents events;
    {
        Locked monitor(_monitor);
        events = scanEventLibraries();
    }
    const LoadState whenScanned = loadState();
    if (isCancelLoadRequestPending())
        return nullptr;

    const EventOrder order = _mostRecentEventFirst ? EventOrder::newestFirst : EventOrder::oldestFirst;
    const Group eventLibrary = newEventLibraryGroup(parentID);
    YearGroups years;
    for (OrderedEvent& event : sortedByYear(std::move(events), order)) {
        if (isCancelLoadRequestPending())
            break;
        fileEventUnderItsYear(std::move(event), eventLibrary, years);
    }
    for (YearGroups::YearGroup& year : years.inOrder) {
        if (!isCancelLoadRequestPending())
            year.events = sortedByYear(std::move(year.events), order);
        year.group->setChildGroups(groupsOf(year.events));
    }

    if (updateRootMediaGroup && !isCancelLoadRequestPending()) {
        Group root;
        {
            Locked rootUpdate(_rootUpdateLock);
            root = rootMediaGroup();
            finishReloadReelixEvents(eventLibrary);
            _setMediaObjectsForRootMediaGroup(root);
        }
        if (root)
            setRootMediaGroup(root);
        reloadAgainAfterLoads(whenScanned);
    }
    return eventLibrary->childGroups().empty() ? nullptr : eventLibrary;
}

VXReelixPlugin::OrderedEvents VXReelixPlugin::scanEventLibraries() {
    OrderedEvents events;
    _flatEventGroupsList = std::make_unique<Groups>();
    if (!_ReelixEventsSearchPaths)
        return events;
    for (const std::string& folder : _ReelixEventsSearchPaths->snapshot()) {
        if (isCancelLoadRequestPending())
            break;
        _createReelixEventsFolderForPath(folder, events);
        watchEventLibrary(folder);
    }
    return events;
}

// Not where the folder around it is watched already.
void VXReelixPlugin::watchEventLibrary(const std::string& folder) {
    VXPathWatcher& watcher = VXPathWatcher::sharedPathWatcher();
    if (watcher.watchPathIsUnique(platform::path::withoutLastComponent(folder), self()))
        _watchPath(folder);
}

VXReelixPlugin::Group VXReelixPlugin::newEventLibraryGroup(const std::optional<std::string>& parentID) {
    const auto title = localizedString("ReelixEventLibrary");
    const Group eventLibrary =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixEventLibraryGroupTypeIdentifier, title);
    eventLibrary->setName(title);
    eventLibrary->setParentID(parentID);
    eventLibrary->setIcon(iconCache().eventIcon.get());
    return eventLibrary;
}

// An event without a year matches no year group, so each such event gets one of its own.
void VXReelixPlugin::fileEventUnderItsYear(ReelixSupport::OrderedEvent event, const Group& eventLibrary,
                                           YearGroups& years) {
    std::size_t place = years.inOrder.size();
    if (event.year)
        place = years.placeOfYear.try_emplace(*event.year, place).first->second;
    if (place == years.inOrder.size()) {
        years.inOrder.push_back({newYearGroup(yearOf(*event.event)), {}});
        eventLibrary->addChildGroup(years.inOrder.back().group);
    }
    years.inOrder[place].events.push_back(std::move(event));
}

VXReelixPlugin::Group VXReelixPlugin::newYearGroup(const std::optional<platform::Value>& year) {
    const std::string title = std::to_string(year && year->integer() ? *year->integer() : 0);
    const Group yearGroup =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixEventCalendarGroupTypeIdentifier, title);
    yearGroup->setName(title);
    // Deliberately the root group and not the event library that holds the year.
    yearGroup->setParentID(std::string(vexo::VXReelix));
    yearGroup->setIcon(iconCache().calendarIcon.get());
    if (year) {
        platform::Dictionary attributes = *yearGroup->attributes();
        attributes.insert_or_assign(std::string(VXReelixEventCreationYear), *year);
        yearGroup->setAttributes(std::move(attributes));
    }
    return yearGroup;
}

// The new library takes the old one's place, or the end; one without clips only removes the old one. Several
// old ones are each replaced by it.
void VXReelixPlugin::finishReloadReelixEvents(const Group& eventLibrary) {
    const Group root = rootMediaGroup();
    if (!root)
        return;
    const bool hasClips = eventLibrary && eventLibrary->mediaObjectCount() > 0;
    bool placed = false;
    Groups children;
    for (const Group& child : root->childGroups()) {
        if (child->typeIdentifier() != vexo::VXReelixEventLibraryGroupTypeIdentifier) {
            children.push_back(child);
        } else if (hasClips) {
            children.push_back(eventLibrary);
            placed = true;
        }
    }
    if (!placed && hasClips)
        children.push_back(eventLibrary);

    const Groups inOrder = stableSorted(children, ReelixSupport::_ReelixRootGroupComparison);
    if (!isCancelLoadRequestPending())
        root->setChildGroups(VXMediaGroupList(inOrder));
}

}  // namespace reelix
