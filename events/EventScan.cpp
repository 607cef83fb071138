// Turns one event library folder into its events and their clips.
#include <deque>

#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "events/SharedWork.h"
#include "host/VXMediaBrowserUtilities.h"
#include "platform/Dispatcher.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"

namespace reelix {

// A clip's item, with what its event needs to know of it.
struct VXReelixPlugin::ScannedClip {
    Object mediaObject;
    int year;
    platform::DateRef date;  // may be nil
};

// An event folder and what was found in it.
struct VXReelixPlugin::ScannedEvent {
    platform::Value folder;  // its path, one text for all its clips
    Group event;
    std::vector<std::optional<ScannedClip>>
        clips;  // one for each name in the folder, nil for what is no clip
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

// Whether the entry is there and of the flags that decide has these alone.
bool hasFlags(const std::optional<platform::FolderEntry>& entry, std::uint32_t decidingFlags) {
    return entry && (entry->flags & containerOrInvisible) == decidingFlags;
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

bool isSupportedMovie(const std::string& clip, const platform::FolderEntry& entry) {
    return entry.isPlainFile ? vexo::VXMediaBrowserUtilities::supportedPlainFile(clip)
                             : vexo::VXMediaBrowserUtilities::supportedMovieFile(clip);
}

platform::CalendarDateRef dateInAttribute(const platform::Folder& folder, const std::string& name,
                                          const platform::FolderEntry& entry) {
    ClipDateValue value;
    if (folder.extendedAttribute(name, entry, clipDateAttribute, value.room()) <= 0)
        return nullptr;
    return value.date();
}

int clipYear(const platform::CalendarDateRef& clipDate, const platform::DateRef& creationDate) {
    if (clipDate && 0 <= clipDate->yearOfCommonEra() && clipDate->yearOfCommonEra() <= 9999)
        return clipDate->yearOfCommonEra();
    return creationDate ? platform::yearInCurrentCalendar(*creationDate) : yearWithoutCreationDate;
}

// The paths of the folders in a library that may be events.
std::vector<std::string> eventFolders(const platform::Folder& library, const std::string& libraryFolder) {
    std::vector<std::string> folders;
    for (const std::string& name : library.names()) {
        if (!isHiddenName(name) && hasFlags(library.entryNamed(name), platform::itemIsContainer))
            folders.push_back(path::appending(libraryFolder, name));
    }
    return folders;
}

}  // namespace

// Goes through the event folders of one library, a few clips at a time, on any number of threads. The events
// are those in listing order, and so are their clips.
class VXReelixPlugin::EventLibraryScan {
  public:
    EventLibraryScan(VXReelixPlugin& plugin, std::string libraryFolder, std::vector<std::string> folders)
        : plugin_(plugin),
          texts_(plugin),
          locale_(platform::Locale::current()),
          libraryFolder_(std::move(libraryFolder)),
          folders_(std::move(folders)) {}

    // False when everything has been taken.
    bool scanNextClips() VX_EXCLUDES(mutex_) {
        const std::optional<Piece> piece = takePiece();
        if (!piece)
            return false;
        for (std::size_t i = piece->begin; i < piece->end; ++i)
            piece->event->clips[i] = clipForFile(*piece->folder, piece->event->folder, i);
        return true;
    }

    // Requires: nothing is being scanned any more.
    const std::deque<ScannedEvent>& events() const VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        return events_;
    }

  private:
    static constexpr std::size_t clipsAPiece = 64;

    // Names of one event folder, which stays open as long as some of them are being looked at.
    struct Piece {
        std::shared_ptr<const platform::Folder> folder;
        ScannedEvent* event;
        std::size_t begin;
        std::size_t end;
    };

    std::optional<Piece> takePiece() VX_EXCLUDES(mutex_);
    void openNextFolder() VX_REQUIRES(mutex_);
    std::optional<ScannedClip> clipForFile(const platform::Folder& folder, const platform::Value& eventFolder,
                                           std::size_t index) const;
    Object newClip(const std::string& name, const std::string& clip) const;
    std::string clipName(const platform::CalendarDateRef& date, const std::string& fileName) const;

    VXReelixPlugin& plugin_;
    const ClipNameTexts texts_;
    const platform::Locale locale_;
    const std::string libraryFolder_;
    const std::vector<std::string> folders_;

    mutable platform::Mutex mutex_;
    std::size_t nextFolder_ VX_GUARDED_BY(mutex_) = 0;
    std::shared_ptr<const platform::Folder> folder_ VX_GUARDED_BY(mutex_);  // the last of the events is its
    std::size_t nextName_ VX_GUARDED_BY(mutex_) = 0;
    std::deque<ScannedEvent> events_ VX_GUARDED_BY(mutex_);  // an event stays where it is
};

VXReelixPlugin::Group VXReelixPlugin::_createReelixEventsFolderForPath(
    const std::optional<std::string>& path) {
    if (!path)
        return nullptr;
    auto folder = platform::services().fileManager.openFolderAtPath(*path);
    if (!folder || folder->names().empty())
        return nullptr;

    const Group library =
        newMediaGroupWithTypeIdentifier(vexo::VXReelixEventLibraryGroupTypeIdentifier, *path);
    library->setName(localizedString("ReelixEventLibrary"));
    library->setParentID(*path);
    library->setModificationDate(vexo::VXMediaGroup::modDateForFile(*path));
    library->setIcon(iconCache().calendarIcon.get());
    library->setPath(*path);

    EventLibraryScan scan(*this, *path, eventFolders(*folder, *path));
    folder.reset();
    const auto work = std::make_shared<SharedWork>([&scan] { return scan.scanNextClips(); });
    if (isLoading())  // somebody waits for the tree
        platform::services().dispatcher.detachThread("vexo-scan", loadThreadPriority(),
                                                     [work] { work->help(); });
    work->finish();
    for (const ScannedEvent& scanned : scan.events()) {
        _flatEventGroupsList->push_back(scanned.event);  // also when it turns out to hold no clip
        if (finishEvent(scanned))
            library->addChildGroup(scanned.event);
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

std::optional<VXReelixPlugin::EventLibraryScan::Piece> VXReelixPlugin::EventLibraryScan::takePiece() {
    platform::Locked lock(mutex_);
    if (!folder_)
        openNextFolder();
    if (!folder_)
        return std::nullopt;
    const std::size_t nameCount = folder_->names().size();
    Piece piece{folder_, &events_.back(), nextName_, std::min(nextName_ + clipsAPiece, nameCount)};
    nextName_ = piece.end;
    if (nextName_ == nameCount)
        folder_.reset();
    return piece;
}

// Leaves no folder open when there is none left. An empty folder is no event. A folder counts as open last:
// should making its event raise, the other thread must not take it for that of the event before.
void VXReelixPlugin::EventLibraryScan::openNextFolder() {
    while (!folder_ && nextFolder_ < folders_.size()) {
        const std::string& path = folders_[nextFolder_++];
        auto folder = platform::services().fileManager.openFolderAtPath(path);
        if (!folder || folder->names().empty())
            continue;
        events_.push_back({path, plugin_.eventGroupForFolder(path, libraryFolder_),
                           std::vector<std::optional<ScannedClip>>(folder->names().size())});
        nextName_ = 0;
        folder_ = std::move(folder);
    }
}

// A file that is a movie only by its metadata gets its item before its date is known, and keeps its whole
// name for that reason. That is deliberate.
std::optional<VXReelixPlugin::ScannedClip> VXReelixPlugin::EventLibraryScan::clipForFile(
    const platform::Folder& folder, const platform::Value& eventFolder, std::size_t index) const {
    const std::string& name = folder.names()[index];
    if (isHiddenName(name))
        return std::nullopt;
    const auto entry = folder.entryNamed(name);
    if (!hasFlags(entry, 0))
        return std::nullopt;

    const std::string clip = path::appending(*eventFolder.string(), name);
    Object mediaObject;
    if (!isSupportedMovie(clip, *entry)) {
        if (!isMovieByMetadata(*vexo::VXMediaObject::spotlightProperties(clip)))
            return std::nullopt;
        mediaObject = newClip(name, clip);
    }
    if (!entry->hasAttributes)
        return std::nullopt;
    auto clipDate = dateInAttribute(folder, name, *entry);
    if (!clipDate)
        clipDate = PathDate::dateFromFileName(name, texts_);
    if (!mediaObject)
        mediaObject = newClip(clipName(clipDate, name), clip);
    mediaObject->setAttribute(eventFolder, vexo::VXReelixProjectPathKey);

    const auto creationDate = entry->creationTime ? platform::Date::since1970(*entry->creationTime) : nullptr;
    return ScannedClip{mediaObject, clipYear(clipDate, creationDate), clipDate ? clipDate : creationDate};
}

VXReelixPlugin::Object VXReelixPlugin::EventLibraryScan::newClip(const std::string& name,
                                                                 const std::string& clip) const {
    const Object mediaObject = plugin_.newMediaObjectWithType(vexo::VXMediaTypeMovie, name, clip);
    mediaObject->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    mediaObject->setPath(clip);
    mediaObject->setSpotlightProperties(vexo::VXMediaObject::spotlightProperties(clip));
    mediaObject->setIcon(iconCache().smallApplicationIcon.get());
    return mediaObject;
}

std::string VXReelixPlugin::EventLibraryScan::clipName(const platform::CalendarDateRef& date,
                                                       const std::string& fileName) const {
    return date ? date->descriptionWithCalendarFormat(texts_.displayFormat, locale_)
                : path::withoutExtension(fileName);
}

bool VXReelixPlugin::finishEvent(const ScannedEvent& scanned) {
    EventYears years;
    Objects clips;
    for (const std::optional<ScannedClip>& clip : scanned.clips) {
        if (!clip)
            continue;
        years.add(*clip);
        clips.push_back(clip->mediaObject);
    }
    if (clips.empty())
        return false;
    if (!years.lowestDate)
        years.lowestDate = years.highestDate;
    scanned.event->setMediaObjects(vexo::VXMediaObjectList(std::move(clips)));
    writeEventAttributes(scanned.event, years);
    return true;
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
