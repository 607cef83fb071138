// Tells how much there is to see in a frame. For one thread.
#pragma once

#include "apps/media-reader/LibraryObjects.h"

namespace reader {

struct FrameScore {
    double value = 0;     // more is better, never negative
    bool isGood = false;  // neither too dark, nor too bright, nor flat
};

class FrameJudge {
  public:
    FrameJudge();

    // Raises MediaError for a frame whose pixels cannot be understood.
    FrameScore scoreOf(const AVFrame& frame);

  private:
    Owned<AVFrame> grey_;  // a small copy of the last frame
    Owned<SwsContext> scaler_;
};

}  // namespace reader
