// An immutable list with a cheap append: `appending` answers a new list and leaves the old one as it was.
//
// Lists that grow from one another share one buffer. The buffer remembers how far it is filled, so only
// the first append to a given list may write into it; any other append copies. Growing a list one element
// at a time therefore costs amortised constant time, and a reader that holds an older list never sees it
// change.
//
// A list that joins others holds these and copies none of their elements: the root of a tree lists all that
// its branches list.
//
// A list object is as thread-safe as an int: copies may be used on different threads at once, one object
// may not be assigned while another thread reads it.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <initializer_list>
#include <iterator>
#include <memory>
#include <span>
#include <utility>
#include <vector>

namespace platform {

template <typename T>
class SnapshotList {
  public:
    using value_type = T;
    class const_iterator;

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
        const auto filled = std::ranges::find_if_not(lists, &SnapshotList::empty);
        if (filled == lists.end())
            return {};
        if (std::all_of(filled + 1, lists.end(), [](const SnapshotList& list) { return list.empty(); }))
            return *filled;
        auto parts = std::make_unique<Parts>();
        for (const SnapshotList& list : lists)
            parts->add(list);
        SnapshotList joined;
        joined.count_ = parts->ends.back();
        joined.buffer_ = std::make_shared<Buffer>(std::move(parts));
        return joined;
    }

    std::size_t size() const { return count_; }
    bool empty() const { return count_ == 0; }
    // In time that grows with the logarithm of the number of lists that were joined.
    const T& operator[](std::size_t index) const {
        return parts() ? parts()->element(index) : buffer_->slots[index];
    }
    const T& front() const { return (*this)[0]; }
    const T& back() const { return (*this)[count_ - 1]; }
    // Valid as long as the list or a copy of it lives.
    const_iterator begin() const {
        return parts() ? const_iterator(*parts(), 0) : const_iterator(elements());
    }
    const_iterator end() const {
        return parts() ? const_iterator(*parts(), parts()->lists.size()) : const_iterator(elements().last(0));
    }

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
    struct Parts;

    struct Buffer {
        explicit Buffer(std::size_t room) : slots(room) {}
        explicit Buffer(std::vector<T> elements) : slots(std::move(elements)) {}
        explicit Buffer(std::unique_ptr<const Parts> joined) : parts(std::move(joined)) {}
        std::vector<T> slots;  // never grows
        std::atomic<std::size_t> filled{0};
        const std::unique_ptr<const Parts> parts;  // of a joined list, which has no slots
    };

    // Lists with slots of their own, none of them empty.
    struct Parts {
        void add(const SnapshotList& list) {
            if (list.parts()) {
                for (const SnapshotList& part : list.parts()->lists)
                    add(part);
            } else if (!list.empty()) {
                lists.push_back(list);
                ends.push_back((ends.empty() ? 0 : ends.back()) + list.size());
            }
        }
        const T& element(std::size_t index) const {
            const auto part = static_cast<std::size_t>(std::ranges::upper_bound(ends, index) - ends.begin());
            return lists[part][part == 0 ? index : index - ends[part - 1]];
        }

        std::vector<SnapshotList> lists;
        std::vector<std::size_t> ends;  // how many elements there are up to the end of each
    };

    const Parts* parts() const { return buffer_ ? buffer_->parts.get() : nullptr; }
    std::span<const T> elements() const {
        return buffer_ ? std::span(std::as_const(buffer_->slots)).first(count_) : std::span<const T>();
    }

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

template <typename T>
class SnapshotList<T>::const_iterator {
  public:
    using iterator_category = std::forward_iterator_tag;
    using value_type = T;
    using difference_type = std::ptrdiff_t;
    using pointer = const T*;
    using reference = const T&;

    const_iterator() = default;

    reference operator*() const { return *element_; }
    pointer operator->() const { return element_; }
    const_iterator& operator++() {
        if (++element_ == end_ && parts_)
            *this = const_iterator(*parts_, part_ + 1);
        return *this;
    }
    const_iterator operator++(int) {
        const const_iterator before = *this;
        ++*this;
        return before;
    }
    // Two parts may show one buffer, so that an element alone does not tell the place.
    bool operator==(const const_iterator& other) const {
        return element_ == other.element_ && part_ == other.part_;
    }

  private:
    friend SnapshotList;

    explicit const_iterator(std::span<const T> elements)
        : element_(elements.data()), end_(elements.data() + elements.size()) {}
    // At the beginning of a part, or behind the last.
    const_iterator(const Parts& parts, std::size_t part)
        : const_iterator(part < parts.lists.size() ? parts.lists[part].elements() : std::span<const T>()) {
        parts_ = &parts;
        part_ = part;
    }

    const T* element_ = nullptr;
    const T* end_ = nullptr;  // of the part
    const Parts* parts_ = nullptr;
    std::size_t part_ = 0;
};

}  // namespace platform
