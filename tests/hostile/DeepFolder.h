// A folder in a folder in a folder…, deeper than a path can name if need be. Removed with all that is in it
// when the test ends, which the usual means cannot do.
#pragma once

#include <functional>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {

class DeepFolder {
  public:
    // Below the folder `top`, which exists.
    explicit DeepFolder(std::string top);
    ~DeepFolder();
    DeepFolder(const DeepFolder&) = delete;
    DeepFolder& operator=(const DeepFolder&) = delete;

    // Makes a folder in the deepest one, `levels` times.
    void descend(int levels, const std::string& name);
    // Makes a project package in the deepest folder.
    void makeProject(const std::string& name);

  private:
    const std::string top_;
    platform::FileDescriptor deepest_;
};

}  // namespace testing_support
