// Decodes single frames of one track. For one thread.
#pragma once

#include <chrono>
#include <cstdint>

#include "apps/media-reader/LibraryObjects.h"
#include "apps/media-reader/MediaFile.h"

namespace reader {

class FrameDecoder {
  public:
    using Deadline = std::chrono::steady_clock::time_point;

    // Raises MediaError when the track cannot be decoded. The track is one of the file's, which must outlive
    // the object. No more frames come after the deadline.
    FrameDecoder(MediaFile& file, AVStream& track, Deadline deadline);

    // Goes on with the last key frame before a time in the track's own units. Where that can't be found, the
    // file is read on from where it stands.
    void seek(std::int64_t time);

    // Goes on with the first byte of the file, in formats in which that is possible.
    void restart();

    // The next frame that could be decoded; nil at the end. It stays as it is until there is another one.
    const AVFrame* next();

  private:
    bool isOver() const { return std::chrono::steady_clock::now() >= deadline_; }
    void feed();
    bool readPacket();

    AVFormatContext& format_;
    AVStream& track_;
    const Deadline deadline_;
    Owned<AVCodecContext> decoder_;
    Owned<AVPacket> packet_;
    Owned<AVFrame> frame_;     // the last one that was answered
    Owned<AVFrame> upcoming_;  // what the decoder gives out, which is nothing at times
};

}  // namespace reader
