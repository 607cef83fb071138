#include "framework/pathwatcher/InotifyEvents.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

constexpr std::size_t batchSize = 256 * 1024;

// Each removal puts an event in the queue. Left there, those of one big folder would fill it.
constexpr int mostRemovalsInQueue = 4096;
constexpr int mostBatchesDrained = 16;

}  // namespace

WatchResult InotifyEvents::add(const std::string& folder, std::uint32_t kinds) {
    if (!queue_)
        queue_ = platform::FileDescriptor(inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
    if (!queue_)
        return {-1, errno};
    const std::uint32_t mask = kinds | IN_ONLYDIR | IN_DONT_FOLLOW | IN_MASK_ADD | IN_EXCL_UNLINK;
    const int watch =
        platform::uninterrupted([&] { return inotify_add_watch(queue_.number(), folder.c_str(), mask); });
    return watch >= 0 ? WatchResult{watch, 0} : WatchResult{-1, errno};
}

void InotifyEvents::remove(int watch) {
    inotify_rm_watch(queue_.number(), watch);
    if (++removals_ >= mostRemovalsInQueue)
        drain();
}

std::optional<FileEvent> InotifyEvents::next() {
    if (position_ == batch_.size && !refill())
        return std::nullopt;
    const auto* const event = reinterpret_cast<const inotify_event*>(batch_.bytes.get() + position_);
    position_ += sizeof(inotify_event) + event->len;
    const std::string_view name(event->name, event->len > 0 ? strnlen(event->name, event->len) : 0);
    return FileEvent{event->wd, event->mask, name};
}

void InotifyEvents::reopen() {
    *this = InotifyEvents();
}

bool InotifyEvents::refill() {
    position_ = 0;
    if (!drained_.empty()) {
        batch_ = std::move(drained_.front());
        drained_.pop_front();
        return true;
    }
    removals_ = 0;
    return readInto(batch_);
}

// False when nothing waits. The bytes are reused and never cleared, which would cost more than reading.
bool InotifyEvents::readInto(Batch& batch) const {
    if (!batch.bytes)
        batch.bytes.reset(new char[batchSize]);
    const ssize_t count = queue_ ? read(queue_.number(), batch.bytes.get(), batchSize) : 0;
    batch.size = static_cast<std::size_t>(std::max<ssize_t>(count, 0));
    return batch.size > 0;
}

// The batch stays as it is, because a name in it may be in use.
void InotifyEvents::drain() {
    removals_ = 0;
    for (int i = 0; i < mostBatchesDrained; ++i) {
        Batch batch;
        if (!readInto(batch))
            return;
        drained_.push_back(std::move(batch));
    }
}

}  // namespace vexo
