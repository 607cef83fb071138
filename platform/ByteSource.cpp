#include "platform/ByteSource.h"

#include <algorithm>

namespace platform {

namespace {

bool isInside(std::uint64_t offset, std::size_t count, std::uint64_t size) {
    return offset <= size && count <= size - offset;
}

}  // namespace

bool BorrowedByteSource::read(std::uint64_t offset, std::span<std::byte> buffer) {
    if (!isInside(offset, buffer.size(), bytes_.size()))
        return false;
    std::ranges::copy(bytes_.subspan(offset, buffer.size()), buffer.begin());
    return true;
}

bool MemoryByteSource::read(std::uint64_t offset, std::span<std::byte> buffer) {
    return BorrowedByteSource(bytes_).read(offset, buffer);
}

PageCache::PageCache(ByteSource& source) : source_(source), size_(source.size()) {}

bool PageCache::read(std::uint64_t offset, std::span<std::byte> buffer) {
    if (!isInside(offset, buffer.size(), size_))
        return false;
    if (buffer.size() >= pageSize)
        return source_.read(offset, buffer);
    while (!buffer.empty()) {
        if (!fetch(offset / pageSize))
            return false;
        const std::size_t start = offset % pageSize;
        const std::size_t count = std::min(buffer.size(), pageSize - start);
        std::copy_n(latest_->bytes.data() + start, count, buffer.data());
        offset += count;
        buffer = buffer.subspan(count);
    }
    return true;
}

bool PageCache::fetch(std::uint64_t number) {
    if (latest_ && latest_->number == number)
        return true;
    const auto known = std::ranges::find(pages_, number, &Page::number);
    const bool isKnown = known != pages_.end();
    if (isKnown)
        latest_ = &*known;
    else if (pages_.size() < pageCount)
        latest_ = &pages_.emplace_back();
    else
        latest_ = &*std::ranges::min_element(pages_, {}, &Page::lastUse);
    latest_->lastUse = ++uses_;
    return isKnown || load(*latest_, number);
}

bool PageCache::load(Page& page, std::uint64_t number) {
    const std::uint64_t offset = number * pageSize;
    const std::size_t count = std::min<std::uint64_t>(pageSize, size_ - offset);
    const bool isRead = source_.read(offset, std::span(page.bytes).first(count));
    page.number = isRead ? number : Page::none;
    return isRead;
}

}  // namespace platform
