#include "events/EventLibraryScan.h"

#include <algorithm>
#include <exception>

#include "core/ProcessCaches.h"
#include "host/VXMediaBrowserUtilities.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {

using platform::Locked;

namespace {

namespace path = platform::path;

constexpr int yearWithoutCreationDate = -1;

bool isHiddenName(std::string_view name) {
    return name.empty() || name.front() == '.';
}

constexpr std::uint32_t containerOrInvisible = platform::itemIsContainer | platform::itemIsInvisible;

// Whether the item is there and of the flags that decide has these alone.
bool hasFlags(const std::optional<std::uint32_t>& flags, std::uint32_t decidingFlags) {
    return flags && (*flags & containerOrInvisible) == decidingFlags;
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

bool isSupportedMovie(const std::string& clip, bool isPlainFile) {
    return isPlainFile ? vexo::VXMediaBrowserUtilities::supportedPlainFile(clip)
                       : vexo::VXMediaBrowserUtilities::supportedMovieFile(clip);
}

std::optional<int> usableYear(const platform::CalendarDateRef& date) {
    const int year = date ? date->yearOfCommonEra() : -1;
    return 0 <= year && year <= 9999 ? std::optional(year) : std::nullopt;
}

// The same image, whose owners are counted on their own: threads that count them in one place wait for each
// other at every clip.
platform::ImageRef countedApart(const platform::ImageRef& image) {
    return {std::make_shared<platform::ImageRef>(image), image.get()};
}

int creationYear(const platform::DateRef& creationDate, const platform::LocalZone& zone) {
    return creationDate ? platform::yearInCurrentCalendar(*creationDate, zone) : yearWithoutCreationDate;
}

}  // namespace

void VXReelixPlugin::EventYears::add(const EventYears& following) {
    if (following.lowest < lowest) {
        lowest = following.lowest;
        lowestDate = following.lowestDate;
    }
    if (following.highest > highest) {
        highest = following.highest;
        highestDate = following.highestDate;
    }
}

void VXReelixPlugin::EventYears::add(int year, const platform::DateRef& date) {
    if (year < lowest || year > highest)
        add({year, date, year, date});
}

VXReelixPlugin::EventLibraryScan::EventLibraryScan(VXReelixPlugin& plugin, std::string libraryFolder)
    : plugin_(plugin),
      texts_(plugin),
      locale_(platform::Locale::current()),
      zone_(platform::LocalZone::current()),
      libraryFolder_(std::move(libraryFolder)),
      work_([this] { return scanNextClips(); }) {}

bool VXReelixPlugin::EventLibraryScan::hasEntries() const {
    Locked lock(mutex_);
    return hasEntries_;
}

std::vector<VXReelixPlugin::ScannedEvent> VXReelixPlugin::EventLibraryScan::takeEvents() {
    Locked lock(mutex_);
    std::erase_if(events_, [](const ScannedEvent& scanned) { return !scanned.event; });
    return std::move(events_);
}

bool VXReelixPlugin::EventLibraryScan::scanNextClips() {
    const std::optional<Piece> piece = takePiece();
    if (!piece)
        return false;
    EventYears years;
    for (std::size_t i = piece->begin; i < piece->end; ++i)
        piece->event->clips[i] = clipForFile(*piece->folder, *piece->event, piece->folder->items()[i], years);
    piece->event->years[piece->begin / clipsAPiece] = std::move(years);
    return true;
}

// Folders are opened without the lock, so that small ones, where that is most of the work, are gone through
// by each thread on its own. What is open comes before what is not: few folders are open at a time.
std::optional<VXReelixPlugin::EventLibraryScan::Piece> VXReelixPlugin::EventLibraryScan::takePiece() {
    for (;;) {
        ScannedEvent* event = nullptr;
        const platform::Folder* library = nullptr;
        {
            Locked lock(mutex_);
            if (!isOpened_)
                openLibrary();
            waitForWork();
            if (!openFolders_.empty())
                return nextPiece();
            event = nextFolderToOpen();
            library = library_.get();
        }
        if (!event)
            return std::nullopt;
        openEvent(*library, *event);
    }
}

void VXReelixPlugin::EventLibraryScan::openLibrary() {
    isOpened_ = true;
    library_ = platform::services().fileManager.openFolderAtPath(libraryFolder_);
    if (!library_)
        return;
    hasEntries_ = !library_->items().empty();
    for (const platform::FolderItem& item : library_->items()) {
        if (!isHiddenName(item.name) && hasFlags(library_->flagsOf(item), platform::itemIsContainer))
            events_.push_back({path::appending(libraryFolder_, item.name), &item, nullptr, nullptr, {}, {}});
    }
    closeLibraryWhenDone();
}

// An open folder keeps its volume from being unmounted.
void VXReelixPlugin::EventLibraryScan::closeLibraryWhenDone() {
    if (nextEvent_ == events_.size() && foldersBeingOpened_ == 0)
        library_ = nullptr;
}

void VXReelixPlugin::EventLibraryScan::waitForWork() {
    while (openFolders_.empty() && nextEvent_ == events_.size() && foldersBeingOpened_ > 0)
        folderOpened_.wait(mutex_);
}

VXReelixPlugin::EventLibraryScan::Piece VXReelixPlugin::EventLibraryScan::nextPiece() {
    OpenFolder& open = openFolders_.front();
    const std::size_t itemCount = open.folder->items().size();
    Piece piece{open.folder, open.event, open.nextItem, std::min(open.nextItem + clipsAPiece, itemCount)};
    open.nextItem = piece.end;
    if (piece.end == itemCount)
        openFolders_.pop_front();
    return piece;
}

VXReelixPlugin::ScannedEvent* VXReelixPlugin::EventLibraryScan::nextFolderToOpen() {
    if (nextEvent_ == events_.size())
        return nullptr;
    ++foldersBeingOpened_;
    return &events_[nextEvent_++];
}

// Who waits for the folder hears that it's done, also when opening it raises.
void VXReelixPlugin::EventLibraryScan::openEvent(const platform::Folder& library, ScannedEvent& event) {
    FolderRef folder;
    std::exception_ptr failure;
    try {
        folder = folderOfEvent(library, event);
    } catch (...) {
        failure = std::current_exception();
    }
    Locked lock(mutex_);
    --foldersBeingOpened_;
    closeLibraryWhenDone();
    folderOpened_.notify_all();
    if (failure)
        std::rethrow_exception(failure);
    if (folder)
        openFolders_.push_back({std::move(folder), &event});
}

// An empty folder is no event.
VXReelixPlugin::EventLibraryScan::FolderRef VXReelixPlugin::EventLibraryScan::folderOfEvent(
    const platform::Folder& library, ScannedEvent& event) const {
    FolderRef folder = library.openFolder(*event.item);
    if (!folder || folder->items().empty())
        return nullptr;
    event.clips.resize(folder->items().size());
    event.years.resize((event.clips.size() - 1) / clipsAPiece + 1);
    event.clipIcon = countedApart(iconCache().smallApplicationIcon.get());
    const auto attributes = folder->attributes();
    event.event = plugin_.eventGroupForFolder(*event.folder.string(), libraryFolder_,
                                              attributes ? attributes->modificationDate : nullptr);
    return folder;
}

// A file that is a movie only by its metadata gets its item before its date is known, and keeps its whole
// name for that reason. That is deliberate.
VXReelixPlugin::Object VXReelixPlugin::EventLibraryScan::clipForFile(const platform::Folder& folder,
                                                                     const ScannedEvent& event,
                                                                     const platform::FolderItem& item,
                                                                     EventYears& years) const {
    if (isHiddenName(item.name) || !hasFlags(folder.flagsOf(item), 0))
        return nullptr;
    std::string clip = path::appending(*event.folder.string(), item.name);
    Object mediaObject;
    if (!isSupportedMovie(clip, folder.isPlainFile(item))) {
        if (!isMovieByMetadata(*vexo::VXMediaObject::spotlightProperties(clip)))
            return nullptr;
        mediaObject = newClip(std::string(item.name), std::move(clip), event);
    }
    const auto dates = datesOfClip(folder, item);
    if (!dates)
        return nullptr;
    if (!mediaObject)
        mediaObject = newClip(clipName(dates->own, item.name), std::move(clip), event);
    years.add(dates->year, dates->own ? dates->own : dates->creation);
    return mediaObject;
}

// The attributes of a file are read only where they are needed: for the year when the clip's own date has
// none, and to tell whether a file is there that did not show it by its extended attributes.
std::optional<VXReelixPlugin::EventLibraryScan::ClipDates> VXReelixPlugin::EventLibraryScan::datesOfClip(
    const platform::Folder& folder, const platform::FolderItem& item) const {
    ClipDateValue value;
    const auto valueSize = folder.extendedAttributeOf(item, clipDateAttribute, value.room());
    auto own = valueSize.value_or(0) > 0 ? value.date(zone_) : nullptr;
    if (!own)
        own = PathDate::dateFromFileName(item.name, texts_, zone_);
    const std::optional<int> year = usableYear(own);
    if (year && valueSize)
        return ClipDates{own, nullptr, *year};
    const auto attributes = folder.attributesOf(item);
    if (!attributes)
        return std::nullopt;
    const auto& creation = attributes->creationDate;
    return ClipDates{own, creation, year ? *year : creationYear(creation, zone_)};
}

VXReelixPlugin::Object VXReelixPlugin::EventLibraryScan::newClip(std::string name, std::string clip,
                                                                 const ScannedEvent& event) const {
    const Object mediaObject =
        plugin_.newMediaObjectWithType(vexo::VXMediaTypeMovie, std::move(name), std::move(clip));
    mediaObject->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    mediaObject->setPath(mediaObject->ID());
    mediaObject->setSpotlightPropertiesOfFile(mediaObject->ID());
    mediaObject->setAttribute(event.folder, vexo::VXReelixProjectPathKey);
    mediaObject->setIcon(event.clipIcon);
    return mediaObject;
}

std::string VXReelixPlugin::EventLibraryScan::clipName(const platform::CalendarDateRef& date,
                                                       std::string_view fileName) const {
    return date ? date->descriptionWithCalendarFormat(texts_.displayFormat, locale_)
                : path::withoutExtension(fileName);
}

}  // namespace reelix
