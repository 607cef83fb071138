#include "framework/metadata/MetadataStore.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <atomic>

#include "framework/metadata/FileTypes.h"
#include "framework/metadata/MetadataCache.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace vexo {

namespace {

using platform::Dictionary;
using platform::Value;

constexpr std::array mediaKeys{
    kMDItemMediaTypes,       kMDItemPixelWidth,          kMDItemPixelHeight,    kMDItemDurationSeconds,
    kMDItemCodecs,           kMDItemContentCreationDate, kMDItemVideoFrameRate, kMDItemAudioChannelCount,
    kMDItemAudioSampleRate,  kMDItemTotalBitRate,        kMDItemTitle,          kMDItemAcquisitionMake,
    kMDItemAcquisitionModel,
};

bool isMediaKey(std::string_view key) {
    return std::find(mediaKeys.begin(), mediaKeys.end(), key) != mediaKeys.end();
}

// The path by which the system's calls know the file; nil where its volume is gone.
std::optional<std::string> realPath(const std::string& path) {
    if (!path.starts_with("/Volumes/"))
        return path;
    return platform::services().fileManager.resolvedPath(path);
}

std::optional<struct stat> statusOf(const std::string& path) {
    const auto real = realPath(path);
    struct stat status;
    if (!real || stat(real->c_str(), &status) != 0)
        return std::nullopt;
    return status;
}

// What is known to be neither movie nor sound is not worth starting the reader for.
bool mayBeMedia(const std::string& path) {
    const FileType* type = typeForExtension(platform::path::extension(path));
    return !type || type->isMovie || type->isSound || type->isPackage;
}

Value arrayOf(const std::vector<std::string>& texts) {
    return platform::Array(texts.begin(), texts.end());
}

// From the file's name and status alone.
Dictionary fileValues(const std::string& path) {
    const auto status = statusOf(path);
    if (!status)
        return {};
    Dictionary values;
    const std::string name = platform::path::lastComponent(path);
    const FileType& type = S_ISDIR(status->st_mode) ? typeOfFolder(name) : typeOfFile(name);
    values.emplace(kMDItemFSName, name);
    values.emplace(kMDItemContentType, type.contentType);
    values.emplace(kMDItemContentTypeTree, arrayOf(type.contentTypeTree));
    values.emplace(kMDItemKind, type.kind);
    if (S_ISREG(status->st_mode))
        values.emplace(kMDItemFSSize, std::int64_t{status->st_size});
    return values;
}

template <typename Content>
void put(Dictionary& values, std::string_view key, const std::optional<Content>& content) {
    if (content)
        values.emplace(key, *content);
}

void put(Dictionary& values, std::string_view key, const std::vector<std::string>& texts) {
    if (!texts.empty())
        values.emplace(key, arrayOf(texts));
}

std::optional<platform::DateRef> dateOf(const std::optional<double>& secondsSince1970) {
    if (!secondsSince1970)
        return std::nullopt;
    return platform::Date::since1970(*secondsSince1970);
}

// From the file's content.
Dictionary mediaValues(const MediaProperties& properties) {
    Dictionary values;
    put(values, kMDItemMediaTypes, properties.mediaTypes);
    put(values, kMDItemCodecs, properties.codecs);
    put(values, kMDItemPixelWidth, properties.pixelWidth);
    put(values, kMDItemPixelHeight, properties.pixelHeight);
    put(values, kMDItemDurationSeconds, properties.durationSeconds);
    put(values, kMDItemContentCreationDate, dateOf(properties.contentCreationDate));
    put(values, kMDItemVideoFrameRate, properties.frameRate);
    put(values, kMDItemAudioChannelCount, properties.audioChannelCount);
    put(values, kMDItemAudioSampleRate, properties.audioSampleRate);
    put(values, kMDItemTotalBitRate, properties.totalBitRate);
    put(values, kMDItemTitle, properties.title);
    put(values, kMDItemAcquisitionMake, properties.acquisitionMake);
    put(values, kMDItemAcquisitionModel, properties.acquisitionModel);
    return values;
}

const MediaProperties nothing;

// One for each item of a tree, so it is small: the content's properties are held apart, once they are known.
class FileMetadata final : public VXMetadataProperties {
  public:
    FileMetadata(std::weak_ptr<MetadataCache> cache, std::string path)
        : cache_(std::move(cache)), path_(std::move(path)) {}
    ~FileMetadata() override { dispose(media_); }
    FileMetadata(const FileMetadata&) = delete;
    FileMetadata& operator=(const FileMetadata&) = delete;

    std::optional<Value> valueForKey(std::string_view key) const override {
        const Dictionary values = isMediaKey(key) ? mediaValues(media()) : fileValues(path_);
        const auto found = values.find(key);
        return found == values.end() ? std::nullopt : std::optional(found->second);
    }

    Dictionary allValues() const override {
        Dictionary values = fileValues(path_);
        values.merge(mediaValues(media()));
        return values;
    }

  private:
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
        const auto real = mayBeMedia(path_) ? realPath(path_) : std::nullopt;
        if (!real)
            return nullptr;
        const MediaReaderAnswer answer = cache.answerForFile(*real);
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
    if (!typeOfFile(platform::path::lastComponent(path)).isMovie)
        return false;
    const auto status = statusOf(path);
    return status && S_ISREG(status->st_mode);
}

std::string MetadataStore::indexPath() const {
    return cache_->indexPath();
}

}  // namespace vexo
