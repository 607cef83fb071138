// Bytes that are read where they are needed, so that a large file costs no more than the part that is used.
//
// Files are read in place through their descriptor instead of being mapped into memory: a file that is
// truncated while it is mapped kills the process, a read that comes up short is an ordinary failure.
#pragma once

#include <cstddef>
#include <cstdint>
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

}  // namespace platform
