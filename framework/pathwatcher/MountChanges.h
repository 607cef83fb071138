// The mount table, and word of its changes.
#pragma once

#include "framework/pathwatcher/MountKinds.h"
#include "platform/linux/FileDescriptor.h"

namespace vexo {

class MountChanges {
  public:
    virtual ~MountChanges() = default;

    // What poll(2) finds to have urgent data (POLLPRI) or an error after a change; negative when there is
    // none. Whoever polls it is told of a change once.
    virtual int descriptor() const = 0;
    // Whether the table changed since this was last asked, or since somebody polled the descriptor.
    virtual bool happened() = 0;
    virtual MountKinds table() const = 0;
};

class SystemMountChanges final : public MountChanges {
  public:
    SystemMountChanges();

    int descriptor() const override { return changes_.number(); }
    bool happened() override;
    MountKinds table() const override;

  private:
    const platform::FileDescriptor changes_;
};

}  // namespace vexo
