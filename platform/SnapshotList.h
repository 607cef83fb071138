// An immutable list with a cheap append: `appending` answers a new list and leaves the old one as it was.
//
// Lists that grow from one another share one buffer. The buffer remembers how far it is filled, so only
// the first append to a given list may write into it; any other append copies. Growing a list one element
// at a time therefore costs amortised constant time, and a reader that holds an older list never sees it
// change.
//
// A list object is as thread-safe as an int: copies may be used on different threads at once, one object
// may not be assigned while another thread reads it.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <initializer_list>
#include <memory>
#include <utility>
#include <vector>

namespace platform {

template <typename T>
class SnapshotList {
  public:
    using value_type = T;
    using const_iterator = const T*;

    SnapshotList() = default;
    SnapshotList(std::initializer_list<T> elements) : SnapshotList(elements.begin(), elements.end()) {}
    // Takes the elements over without copying one.
    explicit SnapshotList(std::vector<T> elements)
        : buffer_(std::make_shared<Buffer>(std::move(elements))), count_(buffer_->slots.size()) {
        buffer_->filled = count_;
    }

    template <typename Iterator>
    SnapshotList(Iterator first, Iterator last) : SnapshotList(std::vector<T>(first, last)) {}

    // The elements of all lists, one list after another. Where one alone has any it is answered itself.
    static SnapshotList joining(const std::vector<SnapshotList>& lists) {
        std::size_t count = 0;
        for (const SnapshotList& list : lists)
            count += list.size();
        const auto largest = std::ranges::max_element(lists, {}, &SnapshotList::size);
        if (largest != lists.end() && largest->size() == count)
            return *largest;
        std::vector<T> elements;
        elements.reserve(count);
        for (const SnapshotList& list : lists)
            elements.insert(elements.end(), list.begin(), list.end());
        return SnapshotList(std::move(elements));
    }

    std::size_t size() const { return count_; }
    bool empty() const { return count_ == 0; }
    const T& operator[](std::size_t index) const { return buffer_->slots[index]; }
    const T& front() const { return (*this)[0]; }
    const T& back() const { return (*this)[count_ - 1]; }
    const_iterator begin() const { return buffer_ ? buffer_->slots.data() : nullptr; }
    const_iterator end() const { return begin() + count_; }

    void swap(SnapshotList& other) noexcept {
        buffer_.swap(other.buffer_);
        std::swap(count_, other.count_);
    }

    SnapshotList appending(T element) const {
        SnapshotList longer = withRoomForOneMore();
        longer.buffer_->slots[count_] = std::move(element);
        ++longer.count_;
        return longer;
    }

  private:
    struct Buffer {
        explicit Buffer(std::size_t room) : slots(room) {}
        explicit Buffer(std::vector<T> elements) : slots(std::move(elements)) {}
        std::vector<T> slots;  // never grows
        std::atomic<std::size_t> filled{0};
    };

    // The same elements, in a buffer whose next slot belongs to the caller alone.
    SnapshotList withRoomForOneMore() const {
        std::size_t expected = count_;
        if (buffer_ && count_ < buffer_->slots.size() &&
            buffer_->filled.compare_exchange_strong(expected, count_ + 1, std::memory_order_acq_rel))
            return *this;

        SnapshotList copy;
        copy.buffer_ = std::make_shared<Buffer>(count_ == 0 ? 1 : 2 * count_);
        std::copy(begin(), end(), copy.buffer_->slots.begin());
        copy.buffer_->filled = count_ + 1;
        copy.count_ = count_;
        return copy;
    }

    std::shared_ptr<Buffer> buffer_;
    std::size_t count_ = 0;
};

}  // namespace platform
