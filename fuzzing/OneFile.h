// A platform on which every file has the same content and nothing else is there: how a target gives its input
// to code that reads files by path.
#pragma once

#include <span>
#include <vector>

#include "tests/platform/StandInServices.h"

class OneFile final : public platform::StandInFileManager {
  public:
    explicit OneFile(std::span<const std::uint8_t> content) : content_(std::as_bytes(content)) {}

    std::unique_ptr<platform::ByteSource> openFileAtPath(const std::string&) const override {
        return std::make_unique<platform::MemoryByteSource>(
            std::vector<std::byte>(content_.begin(), content_.end()));
    }

  private:
    const std::span<const std::byte> content_;
};

class PlatformWithOneFile {
  public:
    explicit PlatformWithOneFile(std::span<const std::uint8_t> content) : files_(content) {}

  private:
    platform::StandInServices others_;
    OneFile files_;
    const platform::ServicesScope scope_{platform::Services{files_, others_.workspace, others_.userDefaults,
                                                            others_.dispatcher, others_.notificationCenter,
                                                            others_.systemLog}};
};
