// Each single call to the system that the metadata of a movie take fails once.
#include <gmock/gmock.h>

#include <cerrno>

#include "framework/metadata/MetadataStore.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/HostEnvironment.h"

namespace testing_support {
namespace {

using namespace std::string_literals;
using platform::Dictionary;

class OneMovieReader final : public vexo::MediaReader {
  public:
    vexo::MediaReaderAnswer read(int) override {
        vexo::MediaProperties movie{{"Video"}};
        movie.pixelWidth = 640;
        return movie;
    }
    vexo::MediaFrameAnswer frame(int, int) override { return vexo::MediaFailure{"no picture"}; }
};

class FailedMetadata : public testing::Test {
  protected:
    Dictionary values() const { return newStore()->propertiesForFile(movie)->allValues(); }

    // nil when there are fewer calls.
    std::optional<Dictionary> valuesWithFailureAt(std::size_t index, int error) {
        const auto store = newStore();
        SystemCalls calls(environment.home.path());
        calls.failAt(index, error);
        Dictionary found = store->propertiesForFile(movie)->allValues();
        if (calls.calls().size() <= index)
            return std::nullopt;
        failed = std::to_string(index) + ": " + calls.calls()[index].function;
        return found;
    }

    const HostEnvironment environment;
    // Its name tells no type, so that it is opened for that as well.
    const std::string movie =
        environment.home.writeFile("movie", "\0\0\0\x14"s + "ftypqt  \0\0\0\0\0\0\0\0"s);
    std::string failed;

  private:
    static std::unique_ptr<vexo::MetadataStore> newStore() {
        return std::make_unique<vexo::MetadataStore>(std::nullopt, std::make_shared<OneMovieReader>());
    }
};

TEST_F(FailedMetadata, AreThereWhenTheCallWasOnlyInterrupted) {
    const Dictionary whole = values();
    EXPECT_TRUE(whole.contains(vexo::kMDItemPixelWidth));
    std::size_t index = 0;
    for (; const auto found = valuesWithFailureAt(index, EINTR); ++index)
        EXPECT_EQ(*found, whole) << failed;
    EXPECT_GT(index, 5u);
}

// Without its content a file that no name tells the type of is data.
TEST_F(FailedMetadata, AreNotMadeUp) {
    const Dictionary whole = values();
    for (const int error : {EIO, EACCES, ENOENT, ELOOP, ENAMETOOLONG, EMFILE, ENOMEM, ESTALE}) {
        for (std::size_t index = 0; const auto found = valuesWithFailureAt(index, error); ++index) {
            SCOPED_TRACE(failed + " with " + std::to_string(error));
            for (const auto& [key, value] : *found) {
                const bool isOfType = key.starts_with("kMDItemContentType") || key == "kMDItemKind";
                const platform::Value* const known = platform::find(whole, key);
                EXPECT_TRUE(isOfType || (known && *known == value)) << key;
            }
            EXPECT_EQ(values(), whole);
        }
    }
}

}  // namespace
}  // namespace testing_support
