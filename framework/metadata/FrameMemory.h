// Memory that is shared with the media reader for the pixels of one frame.
//
// The reader gets a descriptor of it and may write into it at any time, even when it should not: the size
// can't be changed by anybody, and what lies in it is copied out once and taken for hostile. Belongs to one
// thread.
#pragma once

#include "framework/metadata/MediaProperties.h"
#include "framework/metadata/ReaderMessage.h"
#include "platform/linux/FileDescriptor.h"

namespace vexo {

class FrameMemory {
  public:
    // For a frame of at most `longestSide` pixels a side. False afterwards when the system gives no memory.
    explicit FrameMemory(int longestSide);

    explicit operator bool() const { return static_cast<bool>(memory_); }
    int descriptor() const { return memory_.number(); }

    // A copy of the frame, made opaque: so no colour exceeds its alpha, whatever the reader has written. The
    // size must be within that of the memory.
    MediaFrameAnswer frame(FrameSize size) const;

  private:
    platform::FileDescriptor memory_;
};

}  // namespace vexo
