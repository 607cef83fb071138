// A mount whose server never answers: whoever looks at it waits until the mount goes.
#pragma once

#include <optional>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {

class DeadMount {
  public:
    // Why this process can't have one; nil when it can.
    static std::optional<std::string> reasonAgainst();

    // At a folder or a file. Requires: reasonAgainst answered nil. Raises std::runtime_error when it can't be
    // mounted.
    explicit DeadMount(const std::string& mountPoint);
    ~DeadMount();
    DeadMount(const DeadMount&) = delete;
    DeadMount& operator=(const DeadMount&) = delete;

    // Waits until somebody waits for the server, and raises std::runtime_error when nobody does for a minute.
    void awaitRequest() const;

  private:
    void greet() const;

    const std::string mountPoint_;
    platform::FileDescriptor server_;
};

}  // namespace testing_support
