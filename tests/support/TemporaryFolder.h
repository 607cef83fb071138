// A folder of a test's own, removed with everything in it when the test ends.
#pragma once

#include <string>
#include <string_view>

namespace testing_support {

class TemporaryFolder {
  public:
    TemporaryFolder();
    ~TemporaryFolder();
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;

    const std::string& path() const { return path_; }
    // The absolute path of `relative` inside the folder; `relative` may hold any bytes but NUL.
    std::string path(std::string_view relative) const { return path_ + "/" + std::string(relative); }

    // Each makes the folders above it as needed and answers the absolute path.
    std::string makeFolder(std::string_view relative) const;
    std::string writeFile(std::string_view relative, std::string_view content = "") const;
    std::string makeLink(std::string_view relative, const std::string& target) const;
    std::string makeFifo(std::string_view relative) const;

    void remove(std::string_view relative) const;

  private:
    std::string path_;
};

// Sets an extended attribute ("user.date"); fails the test where the file system keeps none.
void setExtendedAttribute(const std::string& path, const std::string& name, std::string_view value);
// Sets the modification time, seconds from 1970.
void setModificationTime(const std::string& path, double secondsSince1970);

// Sets or unsets an environment variable for the length of a scope.
class ScopedEnvironment {
  public:
    ScopedEnvironment(std::string name, const char* value);  // a nil value unsets it
    ~ScopedEnvironment();
    ScopedEnvironment(const ScopedEnvironment&) = delete;
    ScopedEnvironment& operator=(const ScopedEnvironment&) = delete;

  private:
    const std::string name_;
    std::string previous_;
    bool wasSet_;
};

}  // namespace testing_support
