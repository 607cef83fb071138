// A mount whose server never answers: whoever looks at it waits until the mount goes.
#pragma once

#include <string>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {

class DeadMount {
  public:
    // Requires: reasonAgainstMounting answered nil. Raises std::runtime_error when it can't be mounted.
    explicit DeadMount(const std::string& mountPoint);
    ~DeadMount();
    DeadMount(const DeadMount&) = delete;
    DeadMount& operator=(const DeadMount&) = delete;

    // Waits until somebody waits for the server.
    void awaitRequest() const;

  private:
    void greet() const;

    const std::string mountPoint_;
    platform::FileDescriptor server_;
};

}  // namespace testing_support
