// Polling whose looks the test takes: it says what was found.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "framework/pathwatcher/FolderPolling.h"

namespace testing_support {

class FakePolling final : public vexo::FolderPolling {
  public:
    struct Looks {
        std::map<std::uint64_t, vexo::PolledPlace> places;
        std::vector<vexo::PollReport> reports;
        std::uint64_t lastPlace = 0;

        std::vector<std::string> paths() const {
            std::vector<std::string> paths;
            for (const auto& [number, place] : places)
                paths.push_back(place.path);
            return paths;
        }
        // A look at each place that reports every look finds nothing new.
        void nothingNew() {
            for (const auto& [number, place] : places)
                if (place.reportsEveryLook)
                    reports.push_back({number, {}});
        }
    };

    explicit FakePolling(Looks& looks) : looks_(looks) {}

    std::uint64_t add(vexo::PolledPlace place) override {
        looks_.places[++looks_.lastPlace] = std::move(place);
        return looks_.lastPlace;
    }
    void remove(std::uint64_t place) override { looks_.places.erase(place); }
    std::vector<vexo::PollReport> takeReports() override { return std::exchange(looks_.reports, {}); }
    std::chrono::milliseconds interval() const override { return std::chrono::seconds(10); }
    void close() override { looks_.places.clear(); }

  private:
    Looks& looks_;
};

}  // namespace testing_support
