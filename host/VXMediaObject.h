// One item of a tree: a movie file, or a movie that stands for a project.
//
// Items have identity and are shared. Every operation is callable from any thread; a reader sees either the
// old or the new value of a field that is being set.
//
// A library holds hundreds of thousands of them, so an item is small: what follows from its ID is not stored
// a second time.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/VXMetadata.h"
#include "platform/Image.h"
#include "platform/SmallMutex.h"
#include "platform/SnapshotList.h"
#include "platform/URL.h"
#include "platform/Value.h"

namespace vexo {

class VXMediaObject;
using VXMediaObjectRef = std::shared_ptr<VXMediaObject>;

class VXMediaObject final {
  public:
    // Items are made by VXMediaManager::newMediaObjectWithType, nothing else needs this.
    VXMediaObject(int mediaType, std::string name, std::string objectID);

    int mediaType() const { return mediaType_; }
    const std::string& ID() const { return ID_; }

    std::string name() const VX_EXCLUDES(mutex_);
    void setName(std::string name) VX_EXCLUDES(mutex_);
    std::optional<std::string> path() const VX_EXCLUDES(mutex_);
    void setPath(std::string_view path) VX_EXCLUDES(mutex_);
    std::optional<platform::URL> URL() const;  // of the path; nil without one
    int mediaSourceType() const VX_EXCLUDES(mutex_);
    void setMediaSourceType(int mediaSourceType) VX_EXCLUDES(mutex_);

    // Seconds; 0 when unknown. Waits for the file's metadata where the attribute is not set.
    double duration() const;

    platform::ImageRef icon() const VX_EXCLUDES(mutex_);
    void setIcon(platform::ImageRef icon) VX_EXCLUDES(mutex_);
    // What the movie shows, the same image each time; nil without a path. Answers at once: the image shows a
    // stand-in until it is first drawn and its picture has been found or made, of which its observers are
    // told.
    platform::ImageRef thumbnailImage() const VX_EXCLUDES(mutex_);
    // Setting an item's own thumbnail again makes it look at the file anew, and the host redraw it.
    void setThumbnailImage(platform::ImageRef image) VX_EXCLUDES(mutex_);

    // attributeForKey:. What is not set falls back on the file's metadata properties for the duration, the
    // resolution and its text, and may then wait for the file.
    std::optional<platform::Value> attributeForKey(std::string_view key) const VX_EXCLUDES(mutex_);
    // setAttribute:forKey:
    void setAttribute(platform::Value attribute, std::string_view forKey) VX_EXCLUDES(mutex_);
    // What was set, without the fallback.
    platform::Dictionary attributes() const VX_EXCLUDES(mutex_);

    // setSpotlightProperties:
    void setSpotlightProperties(VXMetadataPropertiesRef properties) VX_EXCLUDES(mutex_);
    // The same with the properties of the file at `path`, which are made only when they are asked for where
    // the ID names that file.
    void setSpotlightPropertiesOfFile(const std::string& path) VX_EXCLUDES(mutex_);
    // nil when none were set; else the same object each time.
    VXMetadataPropertiesRef spotlightProperties() const VX_EXCLUDES(mutex_);
    // spotlightProperties:; the properties of the file at `path`, never nil.
    static VXMetadataPropertiesRef spotlightProperties(const std::string& path);

    // The path as other programs know it; nil without a path or where its volume is gone.
    std::optional<std::string> aliasResolvedPath() const;
    // aliasResolvedPath:; `path` with aliases resolved. Links are followed by the file system itself, so a
    // library that is a link keeps its own path; a name under /Volumes becomes the real path, where the
    // volume is there, and stays as it is where not.
    static std::string aliasResolvedPath(const std::string& path);

  private:
    struct Attribute {
        std::string_view key;  // lives as long as the process
        platform::Value value;
    };
    // What most items of a loaded library don't have, or not before somebody looks at them.
    struct Rare {
        std::optional<std::string> otherPath;  // nil when the path is the ID, and without one
        std::vector<Attribute> furtherAttributes;
        platform::ImageRef thumbnailImage;  // made when first asked for
        VXMetadataPropertiesRef spotlightProperties;
    };

    const platform::Value* ownAttributeForKey(std::string_view key) const VX_REQUIRES(mutex_);
    std::optional<platform::Value> metadataAttributeForKey(std::string_view key) const;
    Rare& rare() const VX_REQUIRES(mutex_);

    const std::string ID_;
    const int mediaType_;
    mutable platform::SmallMutex mutex_;
    int mediaSourceType_ VX_GUARDED_BY(mutex_) = 0;
    bool pathIsID_ VX_GUARDED_BY(mutex_) = false;
    // Whether the properties are those of the file that the ID names, until somebody asks for them.
    mutable bool propertiesAreOfID_ VX_GUARDED_BY(mutex_) = false;
    std::string name_ VX_GUARDED_BY(mutex_);
    std::optional<Attribute> firstAttribute_ VX_GUARDED_BY(mutex_);  // a clip has one only
    platform::ImageRef icon_ VX_GUARDED_BY(mutex_);
    mutable std::unique_ptr<Rare> rare_ VX_GUARDED_BY(mutex_);  // nil until it is needed
};

using VXMediaObjectList = platform::SnapshotList<VXMediaObjectRef>;

}  // namespace vexo
