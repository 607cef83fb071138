// A mount table that a test fills in.
#pragma once

#include <vector>

#include "platform/linux/MountTable.h"

namespace testing_support {

class FakeMountTable final : public platform::MountTable {
  public:
    std::vector<platform::Mount> mounts() const override {
        ++questions;
        return list;
    }

    MountPoints servedMountPoints() const override { return served; }

    std::vector<platform::Mount> list;
    MountPoints served = std::make_shared<const std::set<std::string, std::less<>>>();
    mutable int questions = 0;
};

}  // namespace testing_support
