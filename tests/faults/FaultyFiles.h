// The environment's file system with something that happens before each operation, and that can make it fail.
// Looks at the entries of an open folder and reads of an open file are operations like the others.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/FileManager.h"
#include "tests/support/HostEnvironment.h"

namespace testing_support {

class FaultyFiles final : public platform::FileManager {
  public:
    // The path is the one that the operation is about. False makes it fail.
    using BeforeOperation = std::function<bool(const std::string& path)>;

    explicit FaultyFiles(HostEnvironment& environment) : environment_(environment) {}

    BeforeOperation beforeOperation;

    // Not an operation: the home is known from the beginning.
    std::optional<std::string> homeDirectory() const override;
    std::optional<platform::FileKind> kindOfItemAtPath(const std::string& path) const override;
    std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(const std::string& path) const override;
    std::unique_ptr<platform::Folder> openFolderAtPath(const std::string& path) const override;
    std::optional<platform::FileAttributes> attributesOfItemAtPath(const std::string& path) const override;
    std::optional<std::uint32_t> itemFlagsAtPath(const std::string& path) const override;
    std::optional<std::string> displayNameAtPath(const std::string& path) const override;
    std::ptrdiff_t extendedAttribute(const std::string& path, std::string_view name,
                                     std::span<char> buffer) const override;
    std::optional<std::string> fileSystemTypeNameAtPath(const std::string& path) const override;
    std::unique_ptr<platform::ByteSource> openFileAtPath(const std::string& path) const override;
    std::optional<std::string> resolvedPath(const std::string& path) const override;

  private:
    const platform::FileManager& real() const { return environment_.files(); }

    HostEnvironment& environment_;
};

}  // namespace testing_support
