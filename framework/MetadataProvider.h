// Knows files by type and by content. Callable from any thread.
#pragma once

#include <string>
#include <string_view>

#include "host/VXMetadata.h"

namespace vexo {

class MetadataProvider {
  public:
    virtual ~MetadataProvider() = default;

    // Never nil; nothing is read before a property is asked for.
    virtual VXMetadataPropertiesRef propertiesForFile(const std::string& path) const = 0;
    // Whether the file is a movie by its type. Reads no more than the beginning, where the name tells no
    // type.
    virtual bool supportedMovieFile(const std::string& path) const = 0;
    // The same of what is known to be a plain file: its status need not be asked for again.
    virtual bool supportedPlainFile(const std::string& path) const { return supportedMovieFile(path); }
};

}  // namespace vexo
