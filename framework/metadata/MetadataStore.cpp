#include "framework/metadata/MetadataStore.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <system_error>

#include "framework/metadata/ContentType.h"
#include "framework/metadata/FileTypes.h"
#include "framework/metadata/MetadataCache.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

using platform::Dictionary;
using platform::Value;

constexpr std::array typeKeys{kMDItemContentType, kMDItemContentTypeTree, kMDItemKind};

bool isTypeKey(std::string_view key) {
    return std::find(typeKeys.begin(), typeKeys.end(), key) != typeKeys.end();
}

// A file at the moment it was looked at.
struct FoundFile {
    std::string path;      // as it was asked for
    std::string realPath;  // by which the system's calls know it
    struct statx status;
};

std::optional<std::string> realPathOf(const std::string& path) {
    if (!path.starts_with("/Volumes/"))
        return path;
    return platform::services().fileManager.resolvedPath(path);
}

// nil for what is not there or out of reach; `errno` then says why. Follows links.
std::optional<FoundFile> foundFile(const std::string& path) {
    auto real = realPathOf(path);
    if (!real || !platform::services().fileManager.isInReach(*real)) {
        errno = real ? ETIMEDOUT : ENOENT;
        return std::nullopt;
    }
    FoundFile file{path, std::move(*real), {}};
    const int result = platform::uninterrupted([&file] {
        return statx(AT_FDCWD, file.realPath.c_str(), 0, STATX_BASIC_STATS | STATX_BTIME, &file.status);
    });
    return result == 0 ? std::optional(std::move(file)) : std::nullopt;
}

bool isFolder(const FoundFile& file) {
    return S_ISDIR(file.status.stx_mode);
}

bool isPlainFile(const FoundFile& file) {
    return S_ISREG(file.status.stx_mode);
}

// Opens the file only where its extension tells no type. A pipe, a socket or a device holds nothing that a
// name could tell.
const FileType& typeOf(const FoundFile& file) {
    const std::string name = platform::path::lastComponent(file.path);
    if (isFolder(file))
        return typeOfFolder(name);
    if (!isPlainFile(file))
        return typeOfFile("");
    if (!typeForExtension(platform::path::extension(name)))
        if (const FileType* type = typeOfContentOfFile(file.realPath))
            return *type;
    return typeOfFile(name);
}

// Of what has no type of its own the reader may know more than the table of types.
bool mayBeMovie(const FileType& type) {
    return type.isMovie || type.contentType == "public.data";
}

// What is known to be neither movie nor sound is not worth starting the reader for.
bool mayBeMedia(const FileType& type) {
    return mayBeMovie(type) || type.isSound;
}

Value arrayOf(const std::vector<std::string>& texts) {
    return platform::Array(texts.begin(), texts.end());
}

Value dateOf(const statx_timestamp& time) {
    return platform::Date::since1970(static_cast<double>(time.tv_sec) + time.tv_nsec / 1e9);
}

Dictionary typeValues(const FoundFile& file) {
    const FileType& type = typeOf(file);
    return {
        {std::string(kMDItemContentType), type.contentType},
        {std::string(kMDItemContentTypeTree), arrayOf(type.contentTypeTree)},
        {std::string(kMDItemKind), type.kind},
    };
}

// From the file's name and status alone.
Dictionary statusValues(const FoundFile& file) {
    Dictionary values;
    values.emplace(kMDItemPath, file.path);
    values.emplace(kMDItemFSName, platform::path::lastComponent(file.path));
    values.emplace(kMDItemFSContentChangeDate, dateOf(file.status.stx_mtime));
    if (file.status.stx_mask & STATX_BTIME)
        values.emplace(kMDItemFSCreationDate, dateOf(file.status.stx_btime));
    if (isPlainFile(file))
        values.emplace(kMDItemFSSize, static_cast<std::int64_t>(file.status.stx_size));
    return values;
}

template <typename Content>
std::optional<Value> valueOf(const std::optional<Content>& content) {
    return content ? std::optional<Value>(*content) : std::nullopt;
}

std::optional<Value> valueOf(const std::vector<std::string>& texts) {
    return texts.empty() ? std::nullopt : std::optional(arrayOf(texts));
}

template <auto Member>
std::optional<Value> valueIn(const MediaProperties& properties) {
    return valueOf(properties.*Member);
}

std::optional<Value> contentCreationDateIn(const MediaProperties& properties) {
    const std::optional<double>& seconds = properties.contentCreationDate;
    return seconds ? std::optional<Value>(platform::Date::since1970(*seconds)) : std::nullopt;
}

// A property that a file's content tells.
struct MediaKey {
    std::string_view key;
    std::optional<Value> (*valueIn)(const MediaProperties& properties);
};

constexpr std::array mediaKeys{
    MediaKey{kMDItemMediaTypes, valueIn<&MediaProperties::mediaTypes>},
    MediaKey{kMDItemCodecs, valueIn<&MediaProperties::codecs>},
    MediaKey{kMDItemPixelWidth, valueIn<&MediaProperties::pixelWidth>},
    MediaKey{kMDItemPixelHeight, valueIn<&MediaProperties::pixelHeight>},
    MediaKey{kMDItemDurationSeconds, valueIn<&MediaProperties::durationSeconds>},
    MediaKey{kMDItemContentCreationDate, contentCreationDateIn},
    MediaKey{kMDItemVideoFrameRate, valueIn<&MediaProperties::frameRate>},
    MediaKey{kMDItemAudioChannelCount, valueIn<&MediaProperties::audioChannelCount>},
    MediaKey{kMDItemAudioSampleRate, valueIn<&MediaProperties::audioSampleRate>},
    MediaKey{kMDItemTotalBitRate, valueIn<&MediaProperties::totalBitRate>},
    MediaKey{kMDItemTitle, valueIn<&MediaProperties::title>},
    MediaKey{kMDItemAcquisitionMake, valueIn<&MediaProperties::acquisitionMake>},
    MediaKey{kMDItemAcquisitionModel, valueIn<&MediaProperties::acquisitionModel>},
};

// nil for a key of another kind.
const MediaKey* mediaKey(std::string_view key) {
    const auto found = std::find_if(mediaKeys.begin(), mediaKeys.end(),
                                    [key](const MediaKey& each) { return each.key == key; });
    return found == mediaKeys.end() ? nullptr : &*found;
}

// From the file's content.
Dictionary mediaValues(const MediaProperties& properties) {
    Dictionary values;
    for (const MediaKey& each : mediaKeys)
        if (auto value = each.valueIn(properties))
            values.emplace(each.key, *std::move(value));
    return values;
}

constexpr const char* soundAlone = "sound without a picture, no movie";

// nil for a movie.
std::optional<std::string> problemWith(const MediaReaderAnswer& answer) {
    if (const auto* failure = std::get_if<MediaFailure>(&answer))
        return failure->reason;
    const auto& types = std::get<MediaProperties>(answer).mediaTypes;
    const bool isSoundAlone =
        std::all_of(types.begin(), types.end(), [](const std::string& type) { return type == "Sound"; });
    return isSoundAlone ? std::optional<std::string>(soundAlone) : std::nullopt;
}

const MediaProperties nothing;

// Items of a tree hold one each, once somebody asked for it, so it is small: the content's properties are
// held apart, once they are known.
class FileMetadata final : public VXMetadataProperties {
  public:
    FileMetadata(std::weak_ptr<MetadataCache> cache, std::string path)
        : cache_(std::move(cache)), path_(std::move(path)) {}
    ~FileMetadata() override { dispose(media_); }
    FileMetadata(const FileMetadata&) = delete;
    FileMetadata& operator=(const FileMetadata&) = delete;

    std::optional<Value> valueForKey(std::string_view key) const override {
        if (const MediaKey* found = mediaKey(key))
            return found->valueIn(media());
        const Dictionary values = fileValues(key);
        const Value* value = platform::find(values, key);
        return value ? std::optional(*value) : std::nullopt;
    }

    Dictionary allValues() const override {
        Dictionary values = mediaValues(media());
        if (const auto file = fileWhileKept()) {
            values.merge(typeValues(*file));
            values.merge(statusValues(*file));
        }
        return values;
    }

  private:
    // nil once the cache is gone as well: what finds a file on a volume has gone with it.
    std::optional<FoundFile> fileWhileKept() const {
        const auto cache = cache_.lock();
        return cache ? foundFile(path_) : std::nullopt;
    }

    // The values among which that for `key` would be.
    Dictionary fileValues(std::string_view key) const {
        const auto file = fileWhileKept();
        if (!file)
            return {};
        return isTypeKey(key) ? typeValues(*file) : statusValues(*file);
    }

    static void dispose(const MediaProperties* media) {
        if (media != &nothing)
            delete media;
    }

    const MediaProperties& media() const {
        if (const MediaProperties* known = media_)
            return *known;
        const auto cache = cache_.lock();
        if (!cache)
            return nothing;
        return keep(read(*cache));
    }

    // nil for nothing at all.
    std::unique_ptr<const MediaProperties> read(MetadataCache& cache) const {
        const auto file = foundFile(path_);
        if (!file || !mayBeMedia(typeOf(*file)))
            return nullptr;
        const MediaReaderAnswer answer = cache.answerForFile(file->realPath);
        const auto* properties = std::get_if<MediaProperties>(&answer);
        return properties ? std::make_unique<const MediaProperties>(*properties) : nullptr;
    }

    // Of several threads that read at once the first one's finding stays, so references to it stay valid.
    const MediaProperties& keep(std::unique_ptr<const MediaProperties> found) const {
        const MediaProperties* media = found ? found.release() : &nothing;
        const MediaProperties* before = nullptr;
        if (media_.compare_exchange_strong(before, media))
            return *media;
        dispose(media);
        return *before;
    }

    const std::weak_ptr<MetadataCache> cache_;
    const std::string path_;
    mutable std::atomic<const MediaProperties*> media_{nullptr};  // owned, unless it is `nothing`
};
static_assert(sizeof(FileMetadata) <= 64);

}  // namespace

MetadataStore::MetadataStore(const std::optional<std::string>& indexPath, std::shared_ptr<MediaReader> reader)
    : cache_(std::make_shared<MetadataCache>(indexPath, std::move(reader))) {}

MetadataStore::~MetadataStore() = default;

VXMetadataPropertiesRef MetadataStore::propertiesForFile(const std::string& path) const {
    return std::make_shared<FileMetadata>(cache_, path);
}

bool MetadataStore::supportedMovieFile(const std::string& path) const {
    const auto file = foundFile(path);
    return file && isPlainFile(*file) && typeOf(*file).isMovie;
}

bool MetadataStore::supportedPlainFile(const std::string& path) const {
    const FileType* type = typeForExtension(platform::path::extension(path));
    return type ? type->isMovie && !type->isPackage : supportedMovieFile(path);
}

std::optional<std::string> MetadataStore::problemWithFile(const std::string& path) const {
    const auto file = foundFile(path);
    if (!file)
        return std::generic_category().message(errno);
    const FileType& type = typeOf(*file);
    if (type.isPackage)
        return "it is a package";
    if (isPlainFile(*file) && type.isSound)
        return soundAlone;
    if (isPlainFile(*file) && !mayBeMovie(type))
        return type.kind + ", no movie";
    return problemWith(cache_->answerForFile(file->realPath));
}

std::string MetadataStore::indexPath() const {
    return cache_->indexPath();
}

}  // namespace vexo
