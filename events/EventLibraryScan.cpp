#include "events/EventLibraryScan.h"

#include <algorithm>
#include <exception>
#include <iterator>

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

VXReelixPlugin::Groups VXReelixPlugin::EventLibraryScan::events() const {
    Locked lock(mutex_);
    Groups events;
    for (const ScannedFolder& folder : folders_) {
        if (folder.event)
            events.push_back(folder.event);
    }
    return events;
}

bool VXReelixPlugin::EventLibraryScan::scanNextClips() {
    const std::optional<Piece> piece = takePiece();
    if (!piece)
        return false;
    Objects& clips = piece->found->clips;
    clips.reserve(piece->items.size());
    for (const platform::FolderItem& item : piece->items) {
        if (Object clip = clipForFile(item, *piece))
            clips.push_back(std::move(clip));
    }
    finishPiece(*piece->folder);
    return true;
}

// Folders are opened and read without the lock, so that small ones, where that is most of the work, are gone
// through by each thread on its own.
std::optional<VXReelixPlugin::EventLibraryScan::Piece> VXReelixPlugin::EventLibraryScan::takePiece() {
    ScannedFolder* folder = nullptr;
    const platform::Folder* library = nullptr;
    {
        Locked lock(mutex_);
        if (!isOpened_)
            openLibrary();
        while (!(folder = takeFolder()) && foldersBeingRead_ > 0)
            folderRead_.wait(mutex_);
        if (!folder)
            return std::nullopt;
        ++foldersBeingRead_;
        library = library_.get();
    }
    return readPiece(library, *folder);
}

void VXReelixPlugin::EventLibraryScan::openLibrary() {
    isOpened_ = true;
    library_ = platform::services().fileManager.openFolderAtPath(libraryFolder_);
    const auto items = library_ ? library_->allItems() : std::nullopt;
    hasEntries_ = items && !items->empty();
    for (const platform::FolderItem& item : items.value_or(std::vector<platform::FolderItem>{})) {
        if (!isHiddenName(item.name) && hasFlags(library_->flagsOf(item), platform::itemIsContainer))
            folders_.emplace_back(path::appending(libraryFolder_, item.name), item);
    }
    closeLibraryWhenDone();
}

// An open folder keeps its volume from being unmounted.
void VXReelixPlugin::EventLibraryScan::closeLibraryWhenDone() {
    if (nextFolder_ == folders_.size() && foldersBeingRead_ == 0)
        library_ = nullptr;
}

// What is open comes before what is not: few folders are open at a time.
VXReelixPlugin::EventLibraryScan::ScannedFolder* VXReelixPlugin::EventLibraryScan::takeFolder() {
    if (!foldersToReadOn_.empty()) {
        ScannedFolder* const folder = foldersToReadOn_.front();
        foldersToReadOn_.pop_front();
        return folder;
    }
    return nextFolder_ < folders_.size() ? &folders_[nextFolder_++] : nullptr;
}

// Who waits for the folder hears that it was read, also when that raises.
VXReelixPlugin::EventLibraryScan::Piece VXReelixPlugin::EventLibraryScan::readPiece(
    const platform::Folder* library, ScannedFolder& folder) {
    std::optional<std::vector<platform::FolderItem>> items;
    std::list<ScannedFiles> found;
    std::exception_ptr failure;
    try {
        items = nextItems(library, folder);
        found.push_back({folder.path, countedApart(iconCache().smallApplicationIcon.get()), {}, {}});
    } catch (...) {
        failure = std::current_exception();
    }
    Locked lock(mutex_);
    --foldersBeingRead_;
    closeLibraryWhenDone();
    folderRead_.notify_all();
    if (failure)
        std::rethrow_exception(failure);
    folder.isEvent = items && (folder.isEvent || !items->empty());
    if (items && folder.open->mayHaveMoreItems()) {
        ++folder.unfinishedPieces;
        foldersToReadOn_.push_back(&folder);
    }
    folder.files.splice(folder.files.end(), found);
    return {&folder, std::move(items).value_or(std::vector<platform::FolderItem>{}), &folder.files.back()};
}

std::optional<std::vector<platform::FolderItem>> VXReelixPlugin::EventLibraryScan::nextItems(
    const platform::Folder* library, ScannedFolder& folder) {
    if (!folder.open)
        folder.open = library->openFolder(folder.item);
    return folder.open ? folder.open->nextItems() : std::nullopt;
}

void VXReelixPlugin::EventLibraryScan::finishPiece(ScannedFolder& folder) const {
    if (--folder.unfinishedPieces > 0)
        return;
    if (folder.isEvent)
        makeEvent(folder);
    folder.files.clear();
    folder.open = nullptr;
}

void VXReelixPlugin::EventLibraryScan::makeEvent(ScannedFolder& folder) const {
    const auto attributes = folder.open->attributes();
    folder.event = plugin_.eventGroupForFolder(folder.path, libraryFolder_,
                                               attributes ? attributes->modificationDate : nullptr);
    Objects clips;
    EventYears years;
    for (ScannedFiles& files : folder.files) {
        years.add(files.years);
        if (clips.empty())
            clips = std::move(files.clips);
        else
            std::ranges::move(files.clips, std::back_inserter(clips));
    }
    if (clips.empty())
        return;
    clips.shrink_to_fit();
    folder.event->setMediaObjects(vexo::VXMediaObjectList(std::move(clips)));
    if (!years.lowestDate)
        years.lowestDate = years.highestDate;
    plugin_.writeEventAttributes(folder.event, years);
}

// A file that is a movie only by its metadata gets its item before its date is known, and keeps its whole
// name for that reason. That is deliberate.
VXReelixPlugin::Object VXReelixPlugin::EventLibraryScan::clipForFile(const platform::FolderItem& item,
                                                                     const Piece& piece) const {
    const platform::Folder& folder = *piece.folder->open;
    if (isHiddenName(item.name) || !hasFlags(folder.flagsOf(item), 0))
        return nullptr;
    std::string clip = path::appending(piece.folder->path, item.name);
    Object mediaObject;
    if (!isSupportedMovie(clip, folder.isPlainFile(item))) {
        if (!isMovieByMetadata(*vexo::VXMediaObject::spotlightProperties(clip)))
            return nullptr;
        mediaObject = newClip(std::string(item.name), std::move(clip), *piece.found);
    }
    const auto dates = datesOfClip(folder, item);
    if (!dates)
        return nullptr;
    if (!mediaObject)
        mediaObject = newClip(clipName(dates->own, item.name), std::move(clip), *piece.found);
    piece.found->years.add(dates->year, dates->own ? dates->own : dates->creation);
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
                                                                 const ScannedFiles& files) const {
    const Object mediaObject =
        plugin_.newMediaObjectWithType(vexo::VXMediaTypeMovie, std::move(name), std::move(clip));
    mediaObject->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    mediaObject->setPath(mediaObject->ID());
    mediaObject->setSpotlightPropertiesOfFile(mediaObject->ID());
    mediaObject->setAttribute(files.folder, vexo::VXReelixProjectPathKey);
    mediaObject->setIcon(files.clipIcon);
    return mediaObject;
}

std::string VXReelixPlugin::EventLibraryScan::clipName(const platform::CalendarDateRef& date,
                                                       std::string_view fileName) const {
    return date ? date->descriptionWithCalendarFormat(texts_.displayFormat, locale_)
                : path::withoutExtension(fileName);
}

}  // namespace reelix
