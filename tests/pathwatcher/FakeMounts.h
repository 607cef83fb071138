// A mount table as a test sets it.
#pragma once

#include <utility>
#include <vector>

#include "framework/pathwatcher/MountChanges.h"

namespace testing_support {

class FakeMounts final : public vexo::MountChanges {
  public:
    // What the seams own forwards to what the test holds.
    struct Table {
        std::vector<platform::MountEntry> entries = {{"/", "/dev/disk", "ext4", "/"}};
        bool changed = false;

        void add(const std::string& path, const std::string& fileSystem,
                 const std::string& device = "device") {
            entries.push_back({path, device, fileSystem, "/"});
            changed = true;
        }
        void remove(const std::string& path) {
            std::erase_if(entries, [&](const auto& entry) { return entry.path == path; });
            changed = true;
        }
    };

    explicit FakeMounts(Table& table) : table_(table) {}

    int descriptor() const override { return -1; }
    bool happened() override { return std::exchange(table_.changed, false); }
    vexo::MountKinds table() const override { return vexo::MountKinds(table_.entries); }

  private:
    Table& table_;
};

}  // namespace testing_support
