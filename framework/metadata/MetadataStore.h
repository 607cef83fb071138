// The metadata properties of files: from their names and sizes, from the index, and from the media reader for
// what the index does not know yet. Callable from any thread.
//
// Handing out properties touches nothing. A file is looked at when a property is asked for, and read at most
// once for as long as it stays the same; an object that has read its file keeps what it found. Only plain
// files are ever opened, and of those only what may be a movie or sound.
//
// Properties may outlive the store; they then know only what needs no reading, and what they have read.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "framework/MetadataProvider.h"
#include "framework/metadata/MediaReader.h"
#include "host/VXMetadata.h"

namespace vexo {

class MetadataCache;

class MetadataStore final : public MetadataProvider {
  public:
    // `indexPath`: where the index lies, MetadataIndex::defaultPath() as a rule; nil for one in memory.
    MetadataStore(const std::optional<std::string>& indexPath, std::shared_ptr<MediaReader> reader);
    ~MetadataStore() override;
    MetadataStore(const MetadataStore&) = delete;
    MetadataStore& operator=(const MetadataStore&) = delete;

    // Never nil. Paths under /Volumes are understood, wherever the platform's services are in place.
    VXMetadataPropertiesRef propertiesForFile(const std::string& path) const override;

    // Whether the file is of a movie type by its extension, and a plain file; links are followed. Does not
    // open it.
    bool supportedMovieFile(const std::string& path) const override;

    // The index's file; empty while it lives in memory.
    std::string indexPath() const;

  private:
    const std::shared_ptr<MetadataCache> cache_;
};

}  // namespace vexo
