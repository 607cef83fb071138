#include "host/VXMediaObject.h"

#include "framework/HostServices.h"
#include "framework/MetadataProvider.h"
#include "framework/ThumbnailProvider.h"
#include "host/VXConstants.h"
#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {
namespace {

using platform::Locked;

std::optional<platform::Size> resolutionOf(const VXMetadataProperties& properties) {
    const auto width = properties.valueForKey(kMDItemPixelWidth);
    const auto height = properties.valueForKey(kMDItemPixelHeight);
    if (!width || !height)
        return std::nullopt;
    return platform::Size{width->doubleValue().value_or(0), height->doubleValue().value_or(0)};
}

}  // namespace

VXMediaObject::VXMediaObject(int mediaType, std::string name, std::string objectID)
    : mediaType_(mediaType), ID_(std::move(objectID)), name_(std::move(name)) {}

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
    return path_;
}

void VXMediaObject::setPath(std::string path) {
    Locked lock(mutex_);
    path_ = std::move(path);
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
    std::optional<std::string> file;
    {
        Locked lock(mutex_);
        if (thumbnailImage_ || !path_)
            return thumbnailImage_;
        file = path_;
    }
    const platform::ImageRef image = hostServices().thumbnails.thumbnailOfFile(*file);
    Locked lock(mutex_);
    if (!thumbnailImage_)  // else another thread was first
        thumbnailImage_ = image;
    return thumbnailImage_;
}

void VXMediaObject::setThumbnailImage(platform::ImageRef image) {
    const platform::ImageRef shown = image;
    {
        Locked lock(mutex_);
        thumbnailImage_.swap(image);
    }
    const bool isItsOwn = shown && shown == image;
    if (isItsOwn && shown->picture())
        shown->picture()->refresh();
}

std::optional<platform::Value> VXMediaObject::attributeForKey(std::string_view key) const {
    {
        Locked lock(mutex_);
        if (const platform::Value* value = platform::find(attributes_, key))
            return *value;
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
    Locked lock(mutex_);
    attributes_.insert_or_assign(std::string(forKey), std::move(attribute));
}

platform::Dictionary VXMediaObject::attributes() const {
    Locked lock(mutex_);
    return attributes_;
}

void VXMediaObject::setSpotlightProperties(VXMetadataPropertiesRef properties) {
    Locked lock(mutex_);
    spotlightProperties_.swap(properties);
}

VXMetadataPropertiesRef VXMediaObject::spotlightProperties() const {
    Locked lock(mutex_);
    return spotlightProperties_;
}

VXMetadataPropertiesRef VXMediaObject::spotlightProperties(const std::string& path) {
    return hostServices().metadata.propertiesForFile(path);
}

std::optional<std::string> VXMediaObject::aliasResolvedPath() const {
    const std::optional<std::string> itemPath = path();
    if (!itemPath)
        return std::nullopt;
    return platform::services().fileManager.resolvedPath(*itemPath);
}

std::string VXMediaObject::aliasResolvedPath(const std::string& path) {
    return platform::services().fileManager.resolvedPath(path).value_or(path);
}

}  // namespace vexo
