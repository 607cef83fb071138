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

VXReelixPlugin::EventLibraryScan::Events VXReelixPlugin::EventLibraryScan::takeEvents() {
    Locked lock(mutex_);
    Events events;
    for (ScannedFolder& folder : folders_) {
        if (!folder.event)
            continue;
        events.all.push_back(folder.event->event);
        if (folder.hasClips)
            events.withClips.push_back(std::move(*folder.event));
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
// through by each thread on its own. What is open comes before what is not: few folders are open at a time.
std::optional<VXReelixPlugin::EventLibraryScan::Piece> VXReelixPlugin::EventLibraryScan::takePiece() {
    ScannedFolder* folder = nullptr;
    const platform::Folder* library = nullptr;
    {
        Locked lock(mutex_);
        if (!isOpened_)
            openLibrary();
        while (pieces_.empty() && nextFolder_ == folders_.size() && foldersBeingRead_ > 0)
            pieceIsReady_.wait(mutex_);
        if (!pieces_.empty()) {
            Piece piece = std::move(pieces_.front());
            pieces_.pop_front();
            return piece;
        }
        if (nextFolder_ == folders_.size())
            return std::nullopt;
        folder = &folders_[nextFolder_++];
        ++foldersBeingRead_;
        library = library_.get();
    }
    return readFolder(*library, *folder);
}

void VXReelixPlugin::EventLibraryScan::openLibrary() {
    isOpened_ = true;
    library_ = platform::services().fileManager.openFolderAtPath(libraryFolder_);
    const auto items = library_ ? library_->allItems() : std::nullopt;
    if (!items)
        return closeLibraryWhenDone();
    hasEntries_ = !items->empty();
    for (const platform::FolderItem& item : *items) {
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

// Who waits for pieces hears that there are no more of this folder, also when reading it raises.
VXReelixPlugin::EventLibraryScan::Piece VXReelixPlugin::EventLibraryScan::readFolder(
    const platform::Folder& library, ScannedFolder& folder) {
    std::optional<Piece> last;
    std::exception_ptr failure;
    try {
        last = readPieces(library, folder);
    } catch (...) {
        failure = std::current_exception();
    }
    Locked lock(mutex_);
    --foldersBeingRead_;
    closeLibraryWhenDone();
    pieceIsReady_.notify_all();
    if (failure)
        std::rethrow_exception(failure);
    return std::move(*last);
}

// At one go, while others scan what has been read: what is renamed between two readings may be told of twice.
VXReelixPlugin::EventLibraryScan::Piece VXReelixPlugin::EventLibraryScan::readPieces(
    const platform::Folder& library, ScannedFolder& folder) {
    folder.open = library.openFolder(folder.item);
    while (folder.open) {
        auto items = folder.open->nextItems();
        folder.isEvent = items && (folder.isEvent || !items->empty());
        if (!items)
            break;
        Piece piece = newPiece(folder, std::move(*items));
        if (!folder.open->mayHaveMoreItems())
            return piece;
        ++folder.unfinishedPieces;
        Locked lock(mutex_);
        pieces_.push_back(std::move(piece));
        pieceIsReady_.notify_one();
    }
    return newPiece(folder, {});
}

VXReelixPlugin::EventLibraryScan::Piece VXReelixPlugin::EventLibraryScan::newPiece(
    ScannedFolder& folder, std::vector<platform::FolderItem> items) {
    folder.files.push_back({folder.path, countedApart(iconCache().smallApplicationIcon.get()), {}, {}});
    return {&folder, std::move(items), &folder.files.back()};
}

void VXReelixPlugin::EventLibraryScan::finishPiece(ScannedFolder& folder) const {
    if (--folder.unfinishedPieces > 0)
        return;
    if (folder.isEvent)
        makeEvent(folder);
    folder.files.clear();
    folder.open = nullptr;
}

// Its year is by the order of this moment. When the order changes, all is read again.
void VXReelixPlugin::EventLibraryScan::makeEvent(ScannedFolder& folder) const {
    const auto attributes = folder.open->attributes();
    const Group event = plugin_.eventGroupForFolder(folder.path, libraryFolder_,
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
    folder.hasClips = !clips.empty();
    if (folder.hasClips) {
        clips.shrink_to_fit();
        event->setMediaObjects(vexo::VXMediaObjectList(std::move(clips)));
        if (!years.lowestDate)
            years.lowestDate = years.highestDate;
        plugin_.writeEventAttributes(event, years);
    }
    folder.event.emplace(event);
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
