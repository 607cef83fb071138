// Closing a follower while somebody else has it watch a tree to which there is no end.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "framework/pathwatcher/ChangeFollower.h"
#include "tests/pathwatcher/FakeMounts.h"
#include "tests/pathwatcher/FakePolling.h"

namespace {

using namespace testing_support;
using namespace vexo;

// Each folder holds a folder, so many times that no test waits for the last of them.
class EndlessTree final : public FolderAccess {
  public:
    static constexpr int end = 5000;
    static constexpr int walked = 2;  // listings after which a walk is sure to be under way

    explicit EndlessTree(std::atomic<int>& listings) : listings_(listings) {}

    PathEntry look(const std::string&) const override { return {PathEntry::Kind::folder, "", 1, 1}; }
    FolderListing list(const std::string&) const override {
        const int listing = ++listings_;
        if (listing == end)
            return {};
        if (listing > walked)  // leaves the time to close, however busy the machine is
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
        return {0, /*isEmpty=*/false, {"d"}};
    }

  private:
    std::atomic<int>& listings_;
};

class WatchesWithoutEvents final : public FileEvents {
  public:
    int descriptor() const override { return -1; }
    WatchResult add(const std::string&, std::uint32_t) override { return {++lastWatch_, 0}; }
    void remove(int) override {}
    std::optional<FileEvent> next() override { return std::nullopt; }
    void reopen() override {}

  private:
    int lastWatch_ = 0;
};

TEST(ClosingAFollower, EndsAWalkThroughALargeTree) {
    std::atomic<int> listings = 0;
    FakeMounts::Table mounts;
    FakePolling::Looks looks;
    WatchSeams seams;
    seams.events = std::make_unique<WatchesWithoutEvents>();
    seams.folders = std::make_unique<EndlessTree>(listings);
    seams.mounts = std::make_unique<FakeMounts>(mounts);
    seams.polling = std::make_unique<FakePolling>(looks);
    seams.resolvedPath = [](const std::string& path) { return std::optional(path); };
    ChangeFollower follower(std::move(seams), std::make_shared<const WakeSignal>(),
                            std::make_shared<const WatchRegistrations>(), std::make_shared<ChangeDelivery>(),
                            [](const std::string&) {});

    std::thread watching([&] { follower.watch("/endless"); });
    while (listings <= EndlessTree::walked)
        std::this_thread::yield();
    follower.close();
    watching.join();
    EXPECT_LT(listings, EndlessTree::end);
}

}  // namespace
