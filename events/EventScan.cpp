// Turns one event library folder into its events and their clips.
#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "host/VXMediaBrowserUtilities.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"

namespace reelix {

// A clip's item, with what its event needs to know of it.
struct VXReelixPlugin::ScannedClip {
    Object mediaObject;
    int year;
    platform::DateRef date;  // may be nil
};

// The earliest and the latest year among an event's clips, and the dates of the clips that set them. Only
// years are compared: among clips of one year the first in listing order stays.
struct VXReelixPlugin::EventYears {
    static constexpr int noLowest = 9999;

    int lowest = noLowest;
    platform::DateRef lowestDate;
    int highest = 0;
    platform::DateRef highestDate;

    void add(const ScannedClip& clip) {
        if (clip.year < lowest) {
            lowest = clip.year;
            lowestDate = clip.date;
        }
        if (clip.year > highest) {
            highest = clip.year;
            highestDate = clip.date;
        }
    }
};

namespace {

namespace path = platform::path;

constexpr int yearWithoutCreationDate = -1;

bool isHiddenName(const std::string& name) {
    return name.empty() || name.front() == '.';
}

constexpr std::uint32_t containerOrInvisible = platform::itemIsContainer | platform::itemIsInvisible;

// The flags that decide; an item whose flags can't be had counts as invisible.
std::uint32_t decidingFlags(const std::string& item) {
    const auto flags = platform::services().fileManager.itemFlagsAtPath(item);
    return flags.value_or(platform::itemIsInvisible) & containerOrInvisible;
}

std::vector<std::string> namesIn(const std::string& folder) {
    return platform::services().fileManager.contentsOfDirectoryAtPath(folder).value_or(
        std::vector<std::string>{});
}

bool listContains(const platform::Array& list, std::initializer_list<std::string_view> texts) {
    return std::any_of(list.begin(), list.end(), [&](const platform::Value& entry) {
        return entry.string() && std::find(texts.begin(), texts.end(), *entry.string()) != texts.end();
    });
}

// Whether a file that the host does not know as a movie is one by its content.
bool isMovieByMetadata(const vexo::VXMetadataProperties& properties) {
    if (const auto types = properties.valueForKey(vexo::kMDItemMediaTypes); types && types->array())
        return listContains(*types->array(), {"Video", "MPEG1 Muxed"});
    if (const auto tree = properties.valueForKey(vexo::kMDItemContentTypeTree); tree && tree->array())
        return listContains(*tree->array(), {"public.video", "public.movie"});
    return false;
}

platform::CalendarDateRef clipDateOf(VXReelixPlugin& plugin, const std::string& clip) {
    if (auto date = plugin._dateFromExtendedFileAttributeAtPath(clip))
        return date;
    return PathDate::_vxMBCalendarDateFromFileName(path::lastComponent(clip), plugin);
}

std::string clipName(const VXReelixPlugin& plugin, const platform::CalendarDateRef& date,
                     const std::string& fileName) {
    if (!date)
        return path::withoutExtension(fileName);
    const std::string format = plugin.localizedString("ReelixClipNameDisplayFormat").value_or("");
    return date->descriptionWithCalendarFormat(format, platform::Locale::current());
}

int clipYear(const platform::CalendarDateRef& clipDate, const platform::DateRef& creationDate) {
    if (clipDate && 0 <= clipDate->yearOfCommonEra() && clipDate->yearOfCommonEra() <= 9999)
        return clipDate->yearOfCommonEra();
    return creationDate ? platform::yearInCurrentCalendar(*creationDate) : yearWithoutCreationDate;
}

}  // namespace

VXReelixPlugin::Group VXReelixPlugin::_createReelixEventsFolderForPath(
    const std::optional<std::string>& path) {
    if (!path)
        return nullptr;
    const std::vector<std::string> names = namesIn(*path);
    if (names.empty())
        return nullptr;

    const Group library =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixEventLibraryGroupTypeIdentifier, *path);
    library->setName(localizedString("ReelixEventLibrary"));
    library->setParentID(*path);
    library->setModificationDate(vexo::VXMediaGroup::modDateForFile(*path));
    library->setIcon(iconCache().calendarIcon.get());
    library->setPath(*path);

    for (const std::string& name : names) {
        const std::string folder = path::appending(*path, name);
        if (isHiddenName(name) || decidingFlags(folder) != platform::itemIsContainer)
            continue;
        const std::vector<std::string> clipNames = namesIn(folder);
        if (clipNames.empty())
            continue;

        const Group event = eventGroupForFolder(folder, *path);
        _flatEventGroupsList->push_back(event);  // also when it turns out to hold no clip
        EventYears years;
        scanEventFolder(event, clipNames, years);
        if (event->mediaObjects().empty())
            continue;
        writeEventAttributes(event, years);
        library->addChildGroup(event);
    }
    return library;
}

VXReelixPlugin::Group VXReelixPlugin::eventGroupForFolder(const std::string& folder,
                                                          const std::string& libraryFolder) {
    const Group event = newMediaGroupWithTypeIdentifier(vexo::VXReelixEventGroupTypeIdentifier, folder);
    event->setName(path::lastComponent(folder));
    event->setParentID(libraryFolder);
    event->setModificationDate(vexo::VXMediaGroup::modDateForFile(folder));
    event->setIcon(iconCache().eventIcon.get());
    event->setPath(folder);
    return event;
}

void VXReelixPlugin::scanEventFolder(const Group& event, const std::vector<std::string>& names,
                                     EventYears& years) {
    const std::string folder = event->path().value_or("");
    for (const std::string& name : names) {
        const std::optional<ScannedClip> clip = clipForFile(folder, name);
        if (!clip)
            continue;
        years.add(*clip);
        event->setMediaObjects(event->mediaObjects().appending(clip->mediaObject));
    }
    if (!years.lowestDate)
        years.lowestDate = years.highestDate;
}

// A file that is a movie only by its metadata gets its item before its date is known, and keeps its whole
// name for that reason. That is deliberate.
std::optional<VXReelixPlugin::ScannedClip> VXReelixPlugin::clipForFile(const std::string& eventFolder,
                                                                       const std::string& name) {
    const std::string clip = path::appending(eventFolder, name);
    if (isHiddenName(name) || decidingFlags(clip) != 0)
        return std::nullopt;

    Object mediaObject;
    if (!vexo::VXMediaBrowserUtilities::supportedMovieFile(clip)) {
        if (!isMovieByMetadata(*vexo::VXMediaObject::spotlightProperties(clip)))
            return std::nullopt;
        mediaObject = newMediaObjectWithType(vexo::VXMediaTypeMovie, name, clip);
    }
    const auto fileAttributes = platform::services().fileManager.attributesOfItemAtPath(clip);
    if (!fileAttributes)
        return std::nullopt;
    const platform::CalendarDateRef clipDate = clipDateOf(*this, clip);
    if (!mediaObject)
        mediaObject = newMediaObjectWithType(vexo::VXMediaTypeMovie, clipName(*this, clipDate, name), clip);

    mediaObject->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    mediaObject->setPath(clip);
    mediaObject->setSpotlightProperties(vexo::VXMediaObject::spotlightProperties(clip));
    mediaObject->setAttribute(eventFolder, vexo::VXReelixProjectPathKey);
    mediaObject->setIcon(iconCache().smallApplicationIcon.get());

    const platform::DateRef date = clipDate ? platform::DateRef(clipDate) : fileAttributes->creationDate;
    return ScannedClip{mediaObject, clipYear(clipDate, fileAttributes->creationDate), date};
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
