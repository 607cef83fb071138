// A new folder that appears under its name when it is complete, and not at all when something fails before.
#pragma once

#include <optional>
#include <string>

namespace vexo {

class DemoStaging {
  public:
    // Makes a hidden folder on the same file system in which to build `destination`, which may exist if it is
    // an empty folder. See `problem`.
    explicit DemoStaging(const std::string& destination);
    // Removes what was not published.
    ~DemoStaging();
    DemoStaging(const DemoStaging&) = delete;
    DemoStaging& operator=(const DemoStaging&) = delete;

    // Why `destination` cannot be made.
    const std::optional<std::string>& problem() const { return problem_; }
    // The folder to fill; there is none when there is a problem.
    std::string path() const { return hidden_ + "/home"; }
    // Moves what was built into place. Replaces nothing that holds anything.
    std::optional<std::string> publish() const;

  private:
    void begin();

    std::string destination_;  // absolute
    bool destinationExists_ = false;
    std::string hidden_;  // empty until it is made
    std::optional<std::string> problem_;
};

}  // namespace vexo
