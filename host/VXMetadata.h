// The metadata properties of a file, by their keys ("kMDItemPixelWidth", …).
//
// Holding properties costs nothing: a file is looked at when a property is first asked for.
// Thread-safe.
#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include "platform/Value.h"

namespace vexo {

class VXMetadataProperties {
  public:
    virtual ~VXMetadataProperties() = default;

    // nil when the file has no such property or could not be read. May read the file, and wait for it.
    virtual std::optional<platform::Value> valueForKey(std::string_view key) const = 0;
    // Every property there is.
    virtual platform::Dictionary allValues() const = 0;
};
using VXMetadataPropertiesRef = std::shared_ptr<const VXMetadataProperties>;

inline constexpr std::string_view kMDItemMediaTypes = "kMDItemMediaTypes";
inline constexpr std::string_view kMDItemContentType = "kMDItemContentType";
inline constexpr std::string_view kMDItemContentTypeTree = "kMDItemContentTypeTree";
inline constexpr std::string_view kMDItemKind = "kMDItemKind";
inline constexpr std::string_view kMDItemFSName = "kMDItemFSName";
inline constexpr std::string_view kMDItemFSSize = "kMDItemFSSize";
inline constexpr std::string_view kMDItemPixelWidth = "kMDItemPixelWidth";
inline constexpr std::string_view kMDItemPixelHeight = "kMDItemPixelHeight";
inline constexpr std::string_view kMDItemDurationSeconds = "kMDItemDurationSeconds";
inline constexpr std::string_view kMDItemCodecs = "kMDItemCodecs";
inline constexpr std::string_view kMDItemContentCreationDate = "kMDItemContentCreationDate";
inline constexpr std::string_view kMDItemFSCreationDate = "kMDItemFSCreationDate";
inline constexpr std::string_view kMDItemFSContentChangeDate = "kMDItemFSContentChangeDate";
inline constexpr std::string_view kMDItemPath = "kMDItemPath";
inline constexpr std::string_view kMDItemVideoFrameRate = "kMDItemVideoFrameRate";  // frames a second
inline constexpr std::string_view kMDItemAudioChannelCount = "kMDItemAudioChannelCount";
inline constexpr std::string_view kMDItemAudioSampleRate = "kMDItemAudioSampleRate";  // hertz
inline constexpr std::string_view kMDItemTotalBitRate = "kMDItemTotalBitRate";        // bits a second
inline constexpr std::string_view kMDItemTitle = "kMDItemTitle";
inline constexpr std::string_view kMDItemAcquisitionMake = "kMDItemAcquisitionMake";
inline constexpr std::string_view kMDItemAcquisitionModel = "kMDItemAcquisitionModel";

}  // namespace vexo
