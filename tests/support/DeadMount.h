// A mount whose server never answers: whoever looks at it waits until the mount goes.
#pragma once

#include <chrono>
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

    // Whether somebody waits for the server, but for those whose requests were taken.
    bool hasRequest() const;
    // Waits until somebody waits for the server, and raises std::runtime_error when nobody does for a minute.
    void awaitRequest() const;
    // Waits for a request as well, and takes it without ever answering, as a server does that waits for
    // another machine. The kernel lets nobody go who waits for that, not even when it is killed.
    void takeRequest() const;

  private:
    void greet() const;
    bool isAsked(std::chrono::milliseconds wait) const;

    const std::string mountPoint_;
    platform::FileDescriptor server_;
};

}  // namespace testing_support
