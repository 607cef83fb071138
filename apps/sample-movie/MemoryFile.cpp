#include "apps/sample-movie/MemoryFile.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <new>

extern "C" {
#include <libavutil/error.h>
#include <libavutil/mem.h>
}

namespace sample {

namespace {

constexpr int bufferBytes = 64 * 1024;
constexpr std::int64_t largestFile = std::int64_t{1} << 30;

}  // namespace

MemoryFile::MemoryFile() {
    auto* buffer = static_cast<unsigned char*>(av_malloc(bufferBytes));
    if (buffer)
        io_ = avio_alloc_context(buffer, bufferBytes, /*write_flag=*/1, this, nullptr, write, seek);
    if (!io_) {
        av_free(buffer);
        throw std::bad_alloc();
    }
}

MemoryFile::~MemoryFile() {
    av_freep(&io_->buffer);
    avio_context_free(&io_);
}

int MemoryFile::write(void* file, std::uint8_t* bytes, int size) {
    auto& self = *static_cast<MemoryFile*>(file);
    const std::size_t end = self.position_ + static_cast<std::size_t>(size);
    if (end > static_cast<std::size_t>(largestFile))
        return AVERROR(EFBIG);
    self.content_.resize(std::max(self.content_.size(), end));
    std::memcpy(self.content_.data() + self.position_, bytes, static_cast<std::size_t>(size));
    self.position_ = end;
    return size;
}

std::int64_t MemoryFile::baseOf(int whence) const {
    if (whence == SEEK_CUR)
        return static_cast<std::int64_t>(position_);
    return whence == SEEK_END ? static_cast<std::int64_t>(content_.size()) : 0;
}

std::int64_t MemoryFile::seek(void* file, std::int64_t offset, int whence) {
    auto& self = *static_cast<MemoryFile*>(file);
    if (whence & AVSEEK_SIZE)
        return static_cast<std::int64_t>(self.content_.size());
    const std::int64_t target = self.baseOf(whence) + offset;
    if (target < 0 || target > largestFile)
        return AVERROR(EINVAL);
    self.position_ = static_cast<std::size_t>(target);
    return target;
}

}  // namespace sample
