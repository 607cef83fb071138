// Ends the wait of a thread in poll(2). Thread-safe.
#pragma once

#include "platform/linux/FileDescriptor.h"

namespace vexo {

class WakeSignal {
  public:
    WakeSignal();

    // Readable from a call of raise until the next call of clear.
    int descriptor() const { return counter_.number(); }
    void raise() const;
    void clear() const;

  private:
    const platform::FileDescriptor counter_;
};

}  // namespace vexo
