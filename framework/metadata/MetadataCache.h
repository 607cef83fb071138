// Gets a media file's answer from where it costs least: the index, else the reader, whose answer is then kept
// in the index. Callable from any thread.
#pragma once

#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "framework/metadata/MediaReader.h"
#include "framework/metadata/MetadataIndex.h"

namespace vexo {

class MetadataCache {
  public:
    MetadataCache(const std::optional<std::string>& indexPath, std::shared_ptr<MediaReader> reader);

    // The answer for the file at a real path. Waits for the reader where the index does not know the file,
    // and for nothing else that is being read.
    //
    // A failure says why there is no answer, in words to be put after the path: the system's message, or what
    // lies there instead of a plain file with a content. An answer for a file that changed while it was read
    // is given and not kept.
    MediaReaderAnswer answerForFile(const std::string& path) VX_EXCLUDES(reading_);

    std::string indexPath() { return index().path(); }

  private:
    MediaReaderAnswer read(int descriptor) VX_EXCLUDES(reading_);
    // Opens it at the first call: many programs that have a store never ask it for what a movie says.
    MetadataIndex& index();

    const std::shared_ptr<MediaReader> reader_;
    const std::optional<std::string> indexPath_;
    std::once_flag indexOpened_;
    std::optional<MetadataIndex> index_;  // use `index`
    // Held while a file is read, on purpose: whoever asks for the same file meanwhile finds it in the index.
    platform::Mutex reading_;
};

}  // namespace vexo
