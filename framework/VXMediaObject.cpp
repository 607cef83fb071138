#include "host/VXMediaObject.h"

#include <algorithm>
#include <set>
#include <utility>
#include <vector>

#include "framework/HostServices.h"
#include "framework/MetadataProvider.h"
#include "framework/ThumbnailProvider.h"
#include "host/VXConstants.h"
#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {
namespace {

using platform::Locked;

// The texts of keys, each once for all items. Keys are names that programs use, so they are few.
class KeyTexts {
  public:
    std::string_view lasting(std::string_view key) VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        const auto known = texts_.find(key);
        return known != texts_.end() ? *known : *texts_.emplace(key).first;
    }

  private:
    platform::Mutex mutex_;
    std::set<std::string, std::less<>> texts_ VX_GUARDED_BY(mutex_);
};

// Each thread remembers the texts that it has used, so that threads which make items wait for none.
std::string_view lastingText(std::string_view key) {
    static auto& texts = *new KeyTexts;  // never freed: items may outlive everything else
    thread_local std::vector<std::string_view> used;
    const auto known = std::find(used.begin(), used.end(), key);
    return known != used.end() ? *known : used.emplace_back(texts.lasting(key));
}

// Of a file that nobody reads any more, because the item's host has ended.
class NoProperties final : public VXMetadataProperties {
  public:
    std::optional<platform::Value> valueForKey(std::string_view) const override { return std::nullopt; }
    platform::Dictionary allValues() const override { return {}; }
};

std::optional<platform::Size> resolutionOf(const VXMetadataProperties& properties) {
    const auto width = properties.valueForKey(kMDItemPixelWidth);
    const auto height = properties.valueForKey(kMDItemPixelHeight);
    if (!width || !height)
        return std::nullopt;
    return platform::Size{width->doubleValue().value_or(0), height->doubleValue().value_or(0)};
}

}  // namespace

VXMediaObject::VXMediaObject(int mediaType, std::string name, std::string objectID)
    : ID_(std::move(objectID)), mediaType_(mediaType), name_(std::move(name)) {}

std::string VXMediaObject::name() const {
    Locked lock(mutex_);
    return name_;
}

void VXMediaObject::setName(std::string name) {
    Locked lock(mutex_);
    name_.swap(name);
}

std::optional<std::string> VXMediaObject::path() const {
    Locked lock(mutex_);
    if (pathIsID_)
        return ID_;
    return rare_ ? rare_->otherPath : std::nullopt;
}

void VXMediaObject::setPath(std::string_view path) {
    const bool isID = path == ID_;
    auto other = isID ? std::nullopt : std::optional<std::string>(path);
    Locked lock(mutex_);
    pathIsID_ = isID;
    if (rare_ || other)
        rare().otherPath.swap(other);
}

std::optional<platform::URL> VXMediaObject::URL() const {
    std::optional<std::string> itemPath = path();
    if (!itemPath)
        return std::nullopt;
    return platform::URL::fileURLWithPath(std::move(*itemPath));
}

int VXMediaObject::mediaSourceType() const {
    Locked lock(mutex_);
    return mediaSourceType_;
}

void VXMediaObject::setMediaSourceType(int mediaSourceType) {
    Locked lock(mutex_);
    mediaSourceType_ = mediaSourceType;
}

double VXMediaObject::duration() const {
    const auto duration = attributeForKey(VXMediaObjectDurationKey);
    return duration ? duration->doubleValue().value_or(0) : 0;
}

platform::ImageRef VXMediaObject::icon() const {
    Locked lock(mutex_);
    return icon_;
}

void VXMediaObject::setIcon(platform::ImageRef icon) {
    Locked lock(mutex_);
    icon_.swap(icon);
}

platform::ImageRef VXMediaObject::thumbnailImage() const {
    {
        Locked lock(mutex_);
        if (rare_ && rare_->thumbnailImage)
            return rare_->thumbnailImage;
    }
    const std::optional<std::string> file = path();
    const HostServices* const host = hostServicesIfAny();
    if (!file || !host)
        return nullptr;
    const platform::ImageRef image = host->thumbnails.thumbnailOfFile(*file);
    Locked lock(mutex_);
    if (!rare().thumbnailImage)  // else another thread was first
        rare().thumbnailImage = image;
    return rare().thumbnailImage;
}

void VXMediaObject::setThumbnailImage(platform::ImageRef image) {
    const platform::ImageRef shown = image;
    {
        Locked lock(mutex_);
        rare().thumbnailImage.swap(image);
    }
    const bool isItsOwn = shown && shown == image;
    if (isItsOwn && shown->picture())
        shown->picture()->refresh();
}

std::optional<platform::Value> VXMediaObject::attributeForKey(std::string_view key) const {
    {
        Locked lock(mutex_);
        if (const platform::Value* attribute = ownAttributeForKey(key))
            return *attribute;
    }
    return metadataAttributeForKey(key);
}

std::optional<platform::Value> VXMediaObject::metadataAttributeForKey(std::string_view key) const {
    const VXMetadataPropertiesRef properties = spotlightProperties();
    if (!properties)
        return std::nullopt;
    if (key == VXMediaObjectDurationKey)
        return properties->valueForKey(kMDItemDurationSeconds);
    if (key != VXMediaObjectResolutionKey && key != VXMediaObjectResolutionStringKey)
        return std::nullopt;

    const std::optional<platform::Size> resolution = resolutionOf(*properties);
    if (!resolution)
        return std::nullopt;
    if (key == VXMediaObjectResolutionStringKey)
        return platform::Value(platform::stringFromSize(*resolution));
    return platform::Value(*resolution);
}

void VXMediaObject::setAttribute(platform::Value attribute, std::string_view forKey) {
    const std::string_view key = lastingText(forKey);
    Locked lock(mutex_);
    if (!firstAttribute_ || firstAttribute_->key == key) {
        firstAttribute_ = {key, std::move(attribute)};
        return;
    }
    std::vector<Attribute>& further = rare().furtherAttributes;
    std::erase_if(further, [&](const Attribute& other) { return other.key == key; });
    further.push_back({key, std::move(attribute)});
}

platform::Dictionary VXMediaObject::attributes() const {
    Locked lock(mutex_);
    platform::Dictionary dictionary;
    if (firstAttribute_)
        dictionary.emplace(firstAttribute_->key, firstAttribute_->value);
    if (rare_) {
        for (const auto& [key, value] : rare_->furtherAttributes)
            dictionary.emplace(key, value);
    }
    return dictionary;
}

const platform::Value* VXMediaObject::ownAttributeForKey(std::string_view key) const {
    if (firstAttribute_ && firstAttribute_->key == key)
        return &firstAttribute_->value;
    if (!rare_)
        return nullptr;
    const auto found = std::ranges::find(rare_->furtherAttributes, key, &Attribute::key);
    return found != rare_->furtherAttributes.end() ? &found->value : nullptr;
}

VXMediaObject::Rare& VXMediaObject::rare() const {
    if (!rare_)
        rare_ = std::make_unique<Rare>();
    return *rare_;
}

void VXMediaObject::setSpotlightProperties(VXMetadataPropertiesRef properties) {
    Locked lock(mutex_);
    propertiesAreOfID_ = false;
    rare().spotlightProperties.swap(properties);
}

void VXMediaObject::setSpotlightPropertiesOfFile(const std::string& path) {
    const bool areOfID = path == ID_;
    VXMetadataPropertiesRef properties = areOfID ? nullptr : spotlightProperties(path);
    Locked lock(mutex_);
    propertiesAreOfID_ = areOfID;
    if (rare_ || properties)
        rare().spotlightProperties.swap(properties);
}

VXMetadataPropertiesRef VXMediaObject::spotlightProperties() const {
    {
        Locked lock(mutex_);
        if (!propertiesAreOfID_)
            return rare_ ? rare_->spotlightProperties : nullptr;
    }
    VXMetadataPropertiesRef ofID = spotlightProperties(ID_);
    Locked lock(mutex_);
    if (std::exchange(propertiesAreOfID_, false))  // else another thread was first
        rare().spotlightProperties.swap(ofID);
    return rare_ ? rare_->spotlightProperties : nullptr;
}

VXMetadataPropertiesRef VXMediaObject::spotlightProperties(const std::string& path) {
    if (const HostServices* const host = hostServicesIfAny())
        return host->metadata.propertiesForFile(path);
    return std::make_shared<NoProperties>();
}

std::optional<std::string> VXMediaObject::aliasResolvedPath() const {
    const std::optional<std::string> itemPath = path();
    if (!itemPath || !hostServicesIfAny())
        return itemPath;
    return platform::services().fileManager.resolvedPath(*itemPath);
}

std::string VXMediaObject::aliasResolvedPath(const std::string& path) {
    if (!hostServicesIfAny())  // which come after the platform's and go before them
        return path;
    return platform::services().fileManager.resolvedPath(path).value_or(path);
}

}  // namespace vexo
