#include "framework/pathwatcher/InotifyEvents.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace vexo {

namespace {

constexpr std::size_t batchSize = 256 * 1024;

// Each removal puts an event in the queue. Left there, those of one big folder would fill it.
constexpr int mostRemovalsInQueue = 4096;
constexpr int mostBatchesDrained = 16;

// Appends what one read gives; false when nothing waits.
bool readMore(int queue, std::vector<char>& bytes) {
    const std::size_t size = bytes.size();
    bytes.resize(size + batchSize);
    const ssize_t count = read(queue, bytes.data() + size, batchSize);
    bytes.resize(size + static_cast<std::size_t>(count > 0 ? count : 0));
    return count > 0;
}

}  // namespace

WatchResult InotifyEvents::add(const std::string& folder, std::uint32_t kinds) {
    if (!queue_)
        queue_ = platform::FileDescriptor(inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
    if (!queue_)
        return {-1, errno};
    const int watch = inotify_add_watch(queue_.number(), folder.c_str(),
                                        kinds | IN_ONLYDIR | IN_DONT_FOLLOW | IN_MASK_ADD | IN_EXCL_UNLINK);
    return watch >= 0 ? WatchResult{watch, 0} : WatchResult{-1, errno};
}

void InotifyEvents::remove(int watch) {
    inotify_rm_watch(queue_.number(), watch);
    if (++removals_ >= mostRemovalsInQueue)
        drain();
}

std::optional<FileEvent> InotifyEvents::next() {
    if (position_ == batch_.size() && !refill())
        return std::nullopt;
    const auto* const event = reinterpret_cast<const inotify_event*>(batch_.data() + position_);
    position_ += sizeof(inotify_event) + event->len;
    const std::string_view name(event->name, event->len > 0 ? strnlen(event->name, event->len) : 0);
    return FileEvent{event->wd, event->mask, name};
}

void InotifyEvents::reopen() {
    *this = InotifyEvents();
}

bool InotifyEvents::refill() {
    position_ = 0;
    batch_.clear();
    if (!drained_.empty()) {
        std::swap(batch_, drained_);
        return true;
    }
    removals_ = 0;
    return queue_ && readMore(queue_.number(), batch_);
}

// The batch stays as it is, because a name in it may be in use.
void InotifyEvents::drain() {
    removals_ = 0;
    for (int i = 0; i < mostBatchesDrained; ++i)
        if (!readMore(queue_.number(), drained_))
            return;
}

}  // namespace vexo
