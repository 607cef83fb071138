#include "framework/metadata/FrameMemory.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <span>

#include "platform/linux/PlainFile.h"

namespace vexo {

namespace {

constexpr std::uint32_t opaque = 0xFF000000;

bool hasFixedSize(int memory, std::size_t size) {
    return ftruncate(memory, static_cast<off_t>(size)) == 0 &&
           fcntl(memory, F_ADD_SEALS, F_SEAL_GROW | F_SEAL_SHRINK | F_SEAL_SEAL) == 0;
}

}  // namespace

FrameMemory::FrameMemory(int longestSide)
    : memory_(memfd_create("vexo-frame", MFD_CLOEXEC | MFD_ALLOW_SEALING)) {
    if (memory_ && !hasFixedSize(memory_.number(), bytesOfFrame(longestSide)))
        memory_ = platform::FileDescriptor();
}

MediaFrameAnswer FrameMemory::frame(FrameSize size) const {
    platform::Bitmap bitmap{size.width, size.height, {}};
    bitmap.pixels.resize(static_cast<std::size_t>(size.width) * static_cast<std::size_t>(size.height));
    const std::span<std::byte> bytes = std::as_writable_bytes(std::span(bitmap.pixels));
    if (platform::readAt(memory_, 0, bytes.data(), bytes.size()) != std::ssize(bytes))
        return MediaFailure{"the frame cannot be read from memory", FailureCause::elsewhere};
    for (std::uint32_t& pixel : bitmap.pixels)
        pixel |= opaque;
    return bitmap;
}

}  // namespace vexo
