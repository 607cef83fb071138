#include "platform/ByteSource.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace platform;
using testing::ElementsAre;

namespace {

constexpr std::size_t pageSize = PageCache::pageSize;

std::byte byteAt(std::size_t offset) {
    return static_cast<std::byte>(offset % 251);
}

// Remembers where it was read, and fails while it is told to.
class RecordingSource final : public ByteSource {
  public:
    explicit RecordingSource(std::uint64_t size) : size_(size) {}

    std::uint64_t size() const override { return size_; }
    [[nodiscard]] bool read(std::uint64_t offset, std::span<std::byte> buffer) override {
        offsets.push_back(offset);
        for (std::size_t i = 0; i < buffer.size(); ++i)
            buffer[i] = byteAt(offset + i);
        return !fails && offset + buffer.size() <= size_;
    }

    std::vector<std::uint64_t> offsets;
    bool fails = false;

  private:
    const std::uint64_t size_;
};

// Whether `count` bytes at `offset` can be had, and are the right ones.
bool readsRight(PageCache& cache, std::uint64_t offset, std::size_t count) {
    std::vector<std::byte> buffer(count);
    if (!cache.read(offset, buffer))
        return false;
    for (std::size_t i = 0; i < count; ++i)
        EXPECT_EQ(buffer[i], byteAt(offset + i));
    return true;
}

}  // namespace

TEST(MemoryByteSource, ReadsNothingBeyondItsEnd) {
    MemoryByteSource source({std::byte{1}, std::byte{2}, std::byte{3}}, "name");
    std::vector<std::byte> buffer(2);
    EXPECT_TRUE(source.read(1, buffer));
    EXPECT_THAT(buffer, ElementsAre(std::byte{2}, std::byte{3}));
    EXPECT_FALSE(source.read(2, buffer));
    EXPECT_FALSE(source.read(4, {}));
    EXPECT_TRUE(source.read(3, {}));
    EXPECT_FALSE(source.read(~std::uint64_t{0}, buffer));
    EXPECT_EQ(source.name(), "name");
}

TEST(PageCache, ReadsOfOnePageReachTheSourceOnce) {
    RecordingSource source(10 * pageSize);
    PageCache cache(source);
    for (std::size_t offset = 0; offset < pageSize; offset += 8)
        EXPECT_TRUE(readsRight(cache, pageSize + offset, 8));
    EXPECT_THAT(source.offsets, ElementsAre(pageSize));
}

TEST(PageCache, ReadsMayCrossPagesAndEndInAShortOne) {
    RecordingSource source(2 * pageSize + 5);
    PageCache cache(source);
    EXPECT_TRUE(readsRight(cache, pageSize - 3, 8));
    EXPECT_TRUE(readsRight(cache, 2 * pageSize - 1, 6));
    EXPECT_FALSE(readsRight(cache, 2 * pageSize, 6));
    EXPECT_THAT(source.offsets, ElementsAre(0, pageSize, 2 * pageSize));
}

TEST(PageCache, LongReadsGoStraightThrough) {
    RecordingSource source(10 * pageSize);
    PageCache cache(source);
    EXPECT_TRUE(readsRight(cache, 7, 3 * pageSize));
    EXPECT_THAT(source.offsets, ElementsAre(7));
}

TEST(PageCache, ThePageUsedLongestAgoGivesWay) {
    RecordingSource source(100 * pageSize);
    PageCache cache(source);
    for (std::size_t page = 0; page < PageCache::pageCount; ++page)
        EXPECT_TRUE(readsRight(cache, page * pageSize, 1));
    EXPECT_TRUE(readsRight(cache, 0, 1));
    EXPECT_TRUE(readsRight(cache, 50 * pageSize, 1));
    source.offsets.clear();
    EXPECT_TRUE(readsRight(cache, 0, 1));
    EXPECT_TRUE(readsRight(cache, 1 * pageSize, 1));
    EXPECT_THAT(source.offsets, ElementsAre(pageSize));
}

TEST(PageCache, AFailedReadIsNotRemembered) {
    RecordingSource source(pageSize);
    PageCache cache(source);
    source.fails = true;
    EXPECT_FALSE(readsRight(cache, 0, 1));
    source.fails = false;
    EXPECT_TRUE(readsRight(cache, 0, 1));
}
