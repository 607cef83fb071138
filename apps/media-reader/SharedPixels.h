// The memory that the host has made for a frame, mapped for writing.
#pragma once

#include <cstdint>
#include <span>

#include "platform/linux/FileDescriptor.h"

namespace reader {

class SharedPixels {
  public:
    // Raises MediaError when the host has sent no memory for that many.
    SharedPixels(const platform::FileDescriptor& memory, int longestSide);
    ~SharedPixels();
    SharedPixels(const SharedPixels&) = delete;
    SharedPixels& operator=(const SharedPixels&) = delete;

    std::span<std::uint32_t> pixels() const { return pixels_; }

  private:
    std::span<std::uint32_t> pixels_;
};

}  // namespace reader
