// A system log that keeps its lines for a test to read.
#pragma once

#include <string>
#include <vector>

#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"

class CollectedLog final : public platform::SystemLog {
  public:
    void log(std::string_view line) override {
        platform::Locked lock(mutex_);
        lines_.emplace_back(line);
    }
    std::vector<std::string> lines() const {
        platform::Locked lock(mutex_);
        return lines_;
    }

  private:
    mutable platform::Mutex mutex_;
    std::vector<std::string> lines_ VX_GUARDED_BY(mutex_);
};
