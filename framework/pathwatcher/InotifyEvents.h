// The queue of events that inotify keeps for this process.
//
// Opened with the first folder, because a user may have few of them (max_user_instances).
#pragma once

#include <deque>
#include <memory>

#include "framework/pathwatcher/FileEvents.h"
#include "platform/linux/FileDescriptor.h"

namespace vexo {

class InotifyEvents final : public FileEvents {
  public:
    int descriptor() const override { return queue_.number(); }
    WatchResult add(const std::string& folder, std::uint32_t kinds) override;
    void remove(int watch) override;
    std::optional<FileEvent> next() override;
    void reopen() override;

  private:
    struct Batch {
        std::unique_ptr<char[]> bytes;
        std::size_t size = 0;
    };
    bool refill();
    bool readInto(Batch& batch) const;
    void drain();

    platform::FileDescriptor queue_;
    Batch batch_;  // what was read at once, of which `position_` bytes are handed out
    std::size_t position_ = 0;
    std::deque<Batch> drained_;  // what comes after the batch
    int removals_ = 0;           // since the queue was last emptied
};

}  // namespace vexo
