// A whole host with the real plug-in on a real library.
#include "framework/Host.h"

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <functional>
#include <thread>

#include "framework/metadata/MetadataStore.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using namespace std::chrono_literals;
using namespace testing_support;
using namespace vexo;

class CountingReader final : public MediaReader {
  public:
    MediaReaderAnswer read(int) override {
        ++reads;
        return MediaFailure{"not to be kept", FailureCause::elsewhere};
    }
    MediaFrameAnswer frame(int, int) override { return MediaFailure{"no picture"}; }
    int reads = 0;
};

// Fails the test when it takes more than a minute.
void waitUntil(const std::function<bool()>& condition) {
    const auto deadline = std::chrono::steady_clock::now() + 60s;
    while (!condition() && std::chrono::steady_clock::now() < deadline)
        std::this_thread::sleep_for(10ms);
    EXPECT_TRUE(condition());
}

class HostTest : public testing::Test {
  protected:
    HostTest() {
        std::filesystem::create_directories(home_.path("Movies/Reelix Events/Trip"));
        makeSampleMovie(clip_, {.size = "64x48", .seconds = 0.2});
    }

    // Whether the index knows the clip, by a store that can read nothing.
    bool isIndexed() const {
        const auto reader = std::make_shared<CountingReader>();
        const MetadataStore store(home_.path("cache/vexo/metadata.sqlite"), reader);
        return store.propertiesForFile(clip_)->valueForKey(kMDItemPixelWidth) == platform::Value(64);
    }

    TemporaryFolder home_;
    const std::string clip_ = home_.path("Movies/Reelix Events/Trip/clip.mov");
    const ScopedEnvironment cache_{"XDG_CACHE_HOME", home_.makeFolder("cache").c_str()};
    const ScopedEnvironment reader_{"VEXO_MEDIA_READER", VEXO_BIN_DIR "/vexo-media-reader"};
    HostOptions options_{.homeDirectory = home_.path(), .pluginBundles = {REELIX_BUNDLE_DIR}};
};

TEST_F(HostTest, AHostThatStaysReadsTheMoviesOfALoadedTreeAhead) {
    options_.prefetchesMetadata = true;
    Host host(options_);
    ASSERT_EQ(host.loadPlugins(), std::nullopt);
    host.startLoading();
    ASSERT_TRUE(host.waitUntilLoaded(60s));
    waitUntil([&] { return isIndexed(); });
}

TEST_F(HostTest, AHostThatDoesNotStayReadsNoClip) {
    {
        Host host(options_);
        ASSERT_EQ(host.loadPlugins(), std::nullopt);
        host.startLoading();
        ASSERT_TRUE(host.waitUntilLoaded(60s));
    }
    const HostEnvironment afterwards;
    EXPECT_FALSE(isIndexed());
}

TEST_F(HostTest, QuittingDoesNotWaitForAMovieThatIsRead) {
    const std::string started = home_.path("started");
    const std::string silent =
        home_.writeFile("silent", "#!/bin/sh\n: > '" + started + "'\nexec sleep 1000\n");
    std::filesystem::permissions(silent, std::filesystem::perms::owner_all);
    const ScopedEnvironment reader("VEXO_MEDIA_READER", silent.c_str());
    std::thread asking;
    {
        Host host(options_);
        ASSERT_EQ(host.loadPlugins(), std::nullopt);
        const auto properties = host.metadata().propertiesForFile(clip_);
        asking = std::thread([properties] { properties->valueForKey(kMDItemPixelWidth); });
        waitUntil([&] { return std::filesystem::exists(started); });
    }
    asking.join();
    const HostEnvironment afterwards;
    EXPECT_FALSE(isIndexed());
}

}  // namespace
