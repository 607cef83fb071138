// The kernel's reports of what happens in folders: one queue of them, as inotify has it.
//
// A folder is watched under a number. The same folder, by whatever path it is reached, has the same number;
// a number is not given out again while the queue is open. Not thread-safe.
#pragma once

#include <sys/inotify.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace vexo {

struct FileEvent {
    int watch = -1;           // of the folder; -1 for the event that tells of lost ones (IN_Q_OVERFLOW)
    std::uint32_t kinds = 0;  // IN_… of inotify(7)
    std::string_view name;    // of an entry of the folder, empty for the folder itself
};

struct WatchResult {
    int watch = -1;
    int error = 0;  // errno where there is no watch

    explicit operator bool() const { return watch >= 0; }
};

class FileEvents {
  public:
    virtual ~FileEvents() = default;

    // What poll(2) finds readable while events wait; negative before the first folder is added.
    virtual int descriptor() const = 0;

    // Watches a folder, and no link to one, for `kinds` besides those that it is watched for already.
    virtual WatchResult add(const std::string& folder, std::uint32_t kinds) = 0;
    // Events of the watch may still come, the last of them IN_IGNORED.
    virtual void remove(int watch) = 0;

    // The oldest event that waits, nil when none does; its name is valid until the next call.
    virtual std::optional<FileEvent> next() = 0;

    // Begins a new queue: all watches and all events that wait are gone.
    virtual void reopen() = 0;
};

}  // namespace vexo
