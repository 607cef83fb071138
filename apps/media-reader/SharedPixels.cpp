#include "apps/media-reader/SharedPixels.h"

#include <sys/mman.h>

#include "apps/media-reader/MediaFile.h"
#include "framework/metadata/ReaderMessage.h"

namespace reader {

SharedPixels::SharedPixels(const platform::FileDescriptor& memory, int longestSide) {
    const std::size_t bytes = vexo::bytesOfFrame(longestSide);
    void* address = mmap(nullptr, bytes, PROT_READ | PROT_WRITE, MAP_SHARED, memory.number(), 0);
    if (address == MAP_FAILED)
        throw MediaError("there is no memory for a frame");
    pixels_ = {static_cast<std::uint32_t*>(address), bytes / sizeof(std::uint32_t)};
}

SharedPixels::~SharedPixels() {
    munmap(pixels_.data(), pixels_.size_bytes());
}

}  // namespace reader
