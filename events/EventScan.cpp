// Turns one event library folder into its events and their clips.
#include <algorithm>
#include <iterator>

#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "events/EventLibraryScan.h"
#include "events/EventOrder.h"
#include "events/EventScansAhead.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"

namespace reelix {

namespace path = platform::path;

VXReelixPlugin::Group VXReelixPlugin::_createReelixEventsFolderForPath(const std::optional<std::string>& path,
                                                                       OrderedEvents& events) {
    if (!path)
        return nullptr;
    const auto scan = scanOfEventLibrary(*path);
    scan->work().finish();
    if (!scan->hasEntries())
        return nullptr;

    const Group library =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixEventLibraryGroupTypeIdentifier, *path);
    library->setName(localizedString("ReelixEventLibrary"));
    library->setParentID(*path);
    library->setModificationDate(vexo::VXMediaGroup::modDateForFile(*path));
    library->setIcon(iconCache().calendarIcon.get());
    library->setPath(*path);
    EventLibraryScan::Events found = scan->takeEvents();
    std::ranges::move(found.all, std::back_inserter(*_flatEventGroupsList));
    library->setChildGroups(ReelixSupport::groupsOf(found.withClips));
    std::ranges::move(found.withClips, std::back_inserter(events));
    return library;
}

std::shared_ptr<VXReelixPlugin::EventLibraryScan> VXReelixPlugin::scanOfEventLibrary(
    const std::string& folder) {
    auto begun = eventScansAhead_ ? eventScansAhead_->take(folder) : nullptr;
    return begun ? begun : std::make_shared<EventLibraryScan>(*this, folder);
}

VXReelixPlugin::Group VXReelixPlugin::eventGroupForFolder(const std::string& folder,
                                                          const std::string& libraryFolder,
                                                          platform::DateRef modificationDate) {
    const Group event = newMediaGroupWithTypeIdentifier(vexo::VXReelixEventGroupTypeIdentifier, folder);
    event->setName(path::lastComponent(folder));
    event->setParentID(libraryFolder);
    event->setModificationDate(std::move(modificationDate));
    event->setIcon(iconCache().eventIcon.get());
    event->setPath(folder);
    return event;
}

// An event is filed under the year of its newest clip when the newest events come first, else under that of
// its oldest.
void VXReelixPlugin::writeEventAttributes(const Group& event, const EventYears& years) {
    const bool newestFirst = _mostRecentEventFirst;
    if (newestFirst && years.highest <= 0)
        return;
    if (!newestFirst && years.lowest >= EventYears::noLowest) {
        platform::services().systemLog.log("Woooow");  // no clip has a year that can be used
        return;
    }
    platform::Dictionary attributes = *event->attributes();
    attributes.insert_or_assign(std::string(VXReelixEventCreationYear),
                                newestFirst ? years.highest : years.lowest);
    if (years.lowestDate)
        attributes.insert_or_assign(std::string(VXReelixEventOldestClipDate),
                                    _nonCalendarDateFromDate(years.lowestDate));
    if (years.highestDate)
        attributes.insert_or_assign(std::string(VXReelixEventNewestClipDate),
                                    _nonCalendarDateFromDate(years.highestDate));
    event->setAttributes(std::move(attributes));
}

}  // namespace reelix
