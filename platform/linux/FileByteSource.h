// The bytes of an open plain file.
#pragma once

#include <string>

#include "platform/ByteSource.h"
#include "platform/linux/PlainFile.h"

namespace platform {

class FileByteSource final : public ByteSource {
  public:
    FileByteSource(PlainFile file, std::string path) : file_(std::move(file)), path_(std::move(path)) {}

    std::uint64_t size() const override { return file_.size; }
    std::string name() const override { return path_; }
    bool read(std::uint64_t offset, std::span<std::byte> buffer) override {
        if (offset > file_.size || buffer.size() > file_.size - offset)
            return false;
        return readAt(file_.descriptor, offset, buffer.data(), buffer.size()) ==
               static_cast<std::ptrdiff_t>(buffer.size());
    }

  private:
    const PlainFile file_;
    const std::string path_;
};

}  // namespace platform
