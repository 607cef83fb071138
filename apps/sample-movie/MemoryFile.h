// A file in memory that FFmpeg can write to and move about in.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

extern "C" {
#include <libavformat/avio.h>
}

namespace sample {

class MemoryFile {
  public:
    MemoryFile();  // raises std::bad_alloc
    ~MemoryFile();
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    AVIOContext* io() const { return io_; }
    // What was written and flushed so far.
    const std::vector<std::byte>& content() const { return content_; }

  private:
    static int write(void* file, std::uint8_t* bytes, int size);
    static std::int64_t seek(void* file, std::int64_t offset, int whence);

    std::int64_t baseOf(int whence) const;

    std::vector<std::byte> content_;
    std::size_t position_ = 0;
    AVIOContext* io_ = nullptr;
};

}  // namespace sample
