// Bytes that are read where they are needed, so that a large file costs no more than the part that is used.
//
// Files are read in place through their descriptor instead of being mapped into memory: a file that is
// truncated while it is mapped kills the process, a read that comes up short is an ordinary failure.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <list>
#include <span>
#include <string>
#include <vector>

namespace platform {

// Not thread-safe: one source belongs to one reader.
class ByteSource {
  public:
    virtual ~ByteSource() = default;

    // The number of bytes when the source was opened.
    virtual std::uint64_t size() const = 0;
    // Fills `buffer` with the bytes from `offset` on. False when any of them can't be had; the content of
    // `buffer` is then unspecified.
    [[nodiscard]] virtual bool read(std::uint64_t offset, std::span<std::byte> buffer) = 0;
    // What to call the source in a message: a path, or empty.
    virtual std::string name() const { return {}; }
};

// Bytes that somebody else keeps alive for as long as the source is used.
class BorrowedByteSource final : public ByteSource {
  public:
    explicit BorrowedByteSource(std::span<const std::byte> bytes) : bytes_(bytes) {}

    std::uint64_t size() const override { return bytes_.size(); }
    [[nodiscard]] bool read(std::uint64_t offset, std::span<std::byte> buffer) override;

  private:
    const std::span<const std::byte> bytes_;
};

class MemoryByteSource final : public ByteSource {
  public:
    explicit MemoryByteSource(std::vector<std::byte> bytes, std::string name = {})
        : bytes_(std::move(bytes)), name_(std::move(name)) {}

    std::uint64_t size() const override { return bytes_.size(); }
    [[nodiscard]] bool read(std::uint64_t offset, std::span<std::byte> buffer) override;
    std::string name() const override { return name_; }

  private:
    const std::vector<std::byte> bytes_;
    const std::string name_;
};

// Keeps the pages of a source that were read last, so that many small reads near one another cost one read of
// the source. Reads of a page's size and more go straight through. Not thread-safe.
class PageCache {
  public:
    static constexpr std::size_t pageSize = 4096;
    static constexpr std::size_t pageCount = 16;

    // `source` is not owned.
    explicit PageCache(ByteSource& source);
    PageCache(const PageCache&) = delete;
    PageCache& operator=(const PageCache&) = delete;

    std::uint64_t size() const { return size_; }
    // As ByteSource::read.
    [[nodiscard]] bool read(std::uint64_t offset, std::span<std::byte> buffer);
    // The bytes themselves, where the page that was used last holds them all: most reads are of a few bytes
    // near the last. nil elsewhere. Valid until the next read.
    const std::byte* inLatestPage(std::uint64_t offset, std::size_t count) const {
        const std::size_t start = offset % pageSize;
        const bool isThere = latest_ && latest_->number == offset / pageSize && count <= pageSize - start &&
                             offset < size_ && count <= size_ - offset;
        return isThere ? latest_->bytes.data() + start : nullptr;
    }

  private:
    struct Page {
        static constexpr std::uint64_t none = ~std::uint64_t{0};
        std::uint64_t number = none;
        std::uint64_t lastUse = 0;
        std::array<std::byte, pageSize> bytes;
    };

    // Makes a page the latest; false when it can't be read.
    bool fetch(std::uint64_t number);
    bool load(Page& page, std::uint64_t number);

    ByteSource& source_;
    const std::uint64_t size_;
    std::list<Page> pages_;  // made as they are needed: most documents are done with after one or two
    Page* latest_ = nullptr;
    std::uint64_t uses_ = 0;
};

}  // namespace platform
