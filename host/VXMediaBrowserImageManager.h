// The process's icons of files, one shared image for each kind of file. Callable from any thread.
#pragma once

#include <string>

#include "platform/Image.h"

namespace vexo {

class VXMediaBrowserImageManager {
  public:
    virtual ~VXMediaBrowserImageManager() = default;

    static VXMediaBrowserImageManager& sharedInstance();

    // iconForFile:; never nil for something that exists, whatever it is.
    virtual platform::ImageRef iconForFile(const std::string& path) = 0;
};

}  // namespace vexo
