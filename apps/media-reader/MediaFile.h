// A media file that FFmpeg has opened through a descriptor. FFmpeg sees neither a name nor any other file,
// and only the formats listed here are tried.
#pragma once

#include <cstdint>
#include <memory>
#include <stdexcept>

extern "C" {
#include <libavformat/avformat.h>
}

namespace reader {

class MediaError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

class MediaFile {
  public:
    // Raises MediaError when the content is no movie or sound. The descriptor stays the caller's and must
    // stay open as long as the object lives. At most `readLimit` bytes are read.
    //
    // The size is told by the caller, because looking at a file's status is more than the reader may do.
    MediaFile(int descriptor, std::uint64_t size, std::uint64_t readLimit);
    MediaFile(const MediaFile&) = delete;
    MediaFile& operator=(const MediaFile&) = delete;

    const AVFormatContext& format() const { return *format_; }
    AVFormatContext& format() { return *format_; }

  private:
    struct CloseIO {
        void operator()(AVIOContext* io) const;
    };
    struct CloseFormat {
        void operator()(AVFormatContext* format) const;
    };

    static int readPacket(void* file, std::uint8_t* buffer, int size);
    static std::int64_t seek(void* file, std::int64_t offset, int whence);

    int read(std::uint8_t* buffer, int size);
    std::int64_t moveTo(std::int64_t offset, int whence);
    void makeContext();
    void open();

    const int descriptor_;
    const std::int64_t size_;
    std::uint64_t allowance_;  // bytes that may still be read
    std::int64_t position_ = 0;
    std::unique_ptr<AVIOContext, CloseIO> io_;
    std::unique_ptr<AVFormatContext, CloseFormat> format_;  // uses io_
};

}  // namespace reader
