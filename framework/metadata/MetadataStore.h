// The metadata properties of files: from the file system, from the index, and from the media reader for what
// the index does not know yet. Callable from any thread.
//
// Handing out properties touches nothing. A file is looked at when a property is asked for, and read at most
// once for as long as it stays the same; an object that has read its file keeps what it found. Only plain
// files are ever opened: those that may be a movie or sound, and those whose name does not tell their type.
//
// Properties may outlive the store; they then know only what needs no reading, and what they have read.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

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

    // Whether the file is a plain file of a movie type; links are followed. The extension decides, and where
    // it tells no type the beginning of the content: whether the rest can be read is not asked.
    bool supportedMovieFile(const std::string& path) const override;
    bool supportedPlainFile(const std::string& path) const override;

    // Why the file is no movie that can be read, in words for people and without its path: "it is a folder",
    // "Plain text document, no movie", the reader's reason. nil for a movie whose content was read. Reads
    // what may be a movie by its type, and waits for it; sound by its type is no movie and not read.
    std::optional<std::string> problemWithFile(const std::string& path) const;

    // The index's file; empty while it lives in memory.
    std::string indexPath() const;

  private:
    const std::shared_ptr<MetadataCache> cache_;
};

}  // namespace vexo
