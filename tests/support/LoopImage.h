// Real mounts for tests, in a mount table that only this process and its children see: nothing that a test
// mounts shows elsewhere, and nothing is left when it crashes.
#pragma once

#include <optional>
#include <string>

namespace testing_support {

// Why this process can't mount anything; nil when it can. The first call gives the process its own mount
// table, so it comes before anything that reads the table. A test skips with the reason:
//   if (const auto reason = reasonAgainstMounting()) GTEST_SKIP() << *reason;
std::optional<std::string> reasonAgainstMounting();
// The same for a file system that the machine may not have: its kernel part, or the program that makes it.
std::optional<std::string> reasonAgainstMounting(const std::string& fileSystem);

// Something mounted at an existing folder or file for the length of a scope.
class ScopedMount {
  public:
    // Shows `source`, a folder or file, at `mountPoint` as well.
    static ScopedMount bind(const std::string& source, const std::string& mountPoint);
    // An empty file system in memory, of the kind (ramfs) that keeps no extended attributes.
    static ScopedMount memory(const std::string& mountPoint);

    ScopedMount(ScopedMount&& other) noexcept;
    ScopedMount& operator=(ScopedMount&&) = delete;
    ~ScopedMount();

    const std::string& mountPoint() const { return mountPoint_; }

  private:
    friend class LoopImage;
    explicit ScopedMount(std::string mountPoint) : mountPoint_(std::move(mountPoint)) {}
    std::string mountPoint_;  // empty when moved from
};

// A disk in a file.
class LoopImage {
  public:
    // Makes the file with an empty file system, "ext4" or "vfat", under a label.
    LoopImage(std::string path, const std::string& label, std::string fileSystem = "ext4");

    [[nodiscard]] ScopedMount mountAt(const std::string& mountPoint) const;

  private:
    const std::string path_;
    const std::string fileSystem_;
};

}  // namespace testing_support
