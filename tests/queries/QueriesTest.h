// What the tests of queries over real folders share: a home, its metadata without a movie being read, and a
// clock that stands still.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "framework/metadata/MetadataStore.h"
#include "framework/queries/QueryExpression.h"
#include "tests/support/HostEnvironment.h"

namespace testing_support {

// As the plug-in writes them.
inline constexpr const char* projectQuery =
    "(kMDItemKind = '*Reelix Project*'cd) && (kMDItemFSName = '*.qnproject'c)";
inline constexpr const char* eventQuery = "(kMDItemContentType = 'com.norvale.framecast-movie')";

class UnwantedReader final : public vexo::MediaReader {
  public:
    vexo::MediaReaderAnswer read(int) override {
        ADD_FAILURE() << "a movie is read";
        return vexo::MediaFailure{"unwanted"};
    }
    vexo::MediaFrameAnswer frame(int, int) override { return vexo::MediaFailure{"unwanted"}; }
};

// Counts how often it is asked for the properties of a file, and does something at the first time.
class WatchedMetadata final : public vexo::MetadataProvider {
  public:
    WatchedMetadata(const vexo::MetadataProvider& metadata, std::function<void()> atFirst)
        : metadata_(metadata), atFirst_(std::move(atFirst)) {}

    vexo::VXMetadataPropertiesRef propertiesForFile(const std::string& path) const override {
        if (questions++ == 0)
            atFirst_();
        return metadata_.propertiesForFile(path);
    }
    bool supportedMovieFile(const std::string& path) const override {
        return metadata_.supportedMovieFile(path);
    }

    mutable int questions = 0;

  private:
    const vexo::MetadataProvider& metadata_;
    const std::function<void()> atFirst_;
};

inline vexo::QueryExpression expression(const std::string& text) {
    return std::get<vexo::QueryExpression>(vexo::QueryExpression::parse(text));
}

inline vexo::VXPathListRef pathList(std::vector<std::string> paths) {
    return std::make_shared<vexo::VXPathList>(std::move(paths));
}

class QueriesTest : public testing::Test {
  protected:
    TemporaryFolder& home() { return host_.home; }
    void mountArchive() {
        platform::Mount mount;
        mount.path = home().path("mnt");
        mount.displayName = "Archive";
        host_.mounts.list = {mount};
    }

    HostEnvironment host_;
    const vexo::MetadataStore metadata_{std::nullopt, std::make_shared<UnwantedReader>()};
    const platform::Date now_{0};
};

}  // namespace testing_support
