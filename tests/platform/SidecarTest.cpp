#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/AppleDouble.h"
#include "tests/platform/SidecarBytes.h"

using platform::appleDoublePath;
using platform::attributeInAppleDouble;
using testing::Eq;
using testing::Optional;
using testing_support::bigEndian;
using testing_support::SidecarAttributes;
using testing_support::sidecarWithAttributes;

namespace {

std::optional<std::string> attribute(const std::string& file, std::string_view name) {
    const auto bytes = std::as_bytes(std::span(file));
    platform::MemoryByteSource source({bytes.begin(), bytes.end()});
    return attributeInAppleDouble(source, name);
}

const SidecarAttributes twoAttributes = {{"com.example.tags", "red"}, {"date", "2009-03-01 12:00:00"}};

constexpr std::size_t firstEntryOffset = 26;
constexpr std::size_t attributesOffset = 84;
constexpr std::size_t firstAttributeOffset = 120;

std::string with(std::string file, std::size_t offset, const std::string& bytes) {
    return file.replace(offset, bytes.size(), bytes);
}

}  // namespace

TEST(Sidecar, GivesEachAttribute) {
    const auto file = sidecarWithAttributes(twoAttributes);
    EXPECT_THAT(attribute(file, "com.example.tags"), Optional(Eq("red")));
    EXPECT_THAT(attribute(file, "date"), Optional(Eq("2009-03-01 12:00:00")));
}

TEST(Sidecar, AnAttributeMayBeEmpty) {
    EXPECT_THAT(attribute(sidecarWithAttributes({{"date", ""}}), "date"), Optional(Eq("")));
}

TEST(Sidecar, OtherNamesAreMissing) {
    const auto file = sidecarWithAttributes(twoAttributes);
    EXPECT_EQ(attribute(file, "dat"), std::nullopt);
    EXPECT_EQ(attribute(file, "dates"), std::nullopt);
    EXPECT_EQ(attribute(file, ""), std::nullopt);
    EXPECT_EQ(attribute(sidecarWithAttributes({}), "date"), std::nullopt);
}

TEST(Sidecar, OtherFilesHaveNoAttributes) {
    const auto file = sidecarWithAttributes(twoAttributes);
    EXPECT_EQ(attribute("", "date"), std::nullopt);
    EXPECT_EQ(attribute("just some text", "date"), std::nullopt);
    EXPECT_EQ(attribute(with(file, 0, bigEndian(0x00051600, 4)), "date"), std::nullopt);
    EXPECT_EQ(attribute(with(file, 4, bigEndian(0x00030000, 4)), "date"), std::nullopt);
    EXPECT_EQ(attribute(with(file, attributesOffset, "RTTA"), "date"), std::nullopt);
}

TEST(Sidecar, TheFinderInformationMayBeAnyEntry) {
    const auto file = sidecarWithAttributes(twoAttributes);
    const auto first = file.substr(firstEntryOffset, 12), second = file.substr(firstEntryOffset + 12, 12);
    EXPECT_THAT(attribute(with(file, firstEntryOffset, second + first), "date"),
                Optional(Eq("2009-03-01 12:00:00")));
}

TEST(Sidecar, EveryTruncationIsHarmless) {
    const auto file = sidecarWithAttributes(twoAttributes);
    for (std::size_t length = 0; length < file.size(); ++length)
        EXPECT_EQ(attribute(file.substr(0, length), "date"), std::nullopt) << length;
}

TEST(Sidecar, PlacesOutsideTheFileCountAsMissing) {
    const auto file = sidecarWithAttributes({{"date", "2009"}});
    EXPECT_EQ(attribute(with(file, firstAttributeOffset, bigEndian(0xFFFFFFFF, 4)), "date"), std::nullopt);
    EXPECT_EQ(attribute(with(file, firstAttributeOffset + 4, bigEndian(0xFFFFFFFF, 4)), "date"),
              std::nullopt);
    EXPECT_EQ(attribute(with(file, firstAttributeOffset + 4, bigEndian(5, 4)), "date"), std::nullopt);
    EXPECT_EQ(attribute(with(file, firstEntryOffset + 4, bigEndian(0xFFFFFFF0, 4)), "date"), std::nullopt);
}

TEST(Sidecar, ClaimsOfMoreEntriesThanThereAreEndAtTheFirstMissingOne) {
    const auto file = sidecarWithAttributes(twoAttributes);
    constexpr std::size_t attributeCountOffset = attributesOffset + 34;
    EXPECT_EQ(attribute(with(file, attributeCountOffset, bigEndian(0xFFFF, 2)), "absent"), std::nullopt);
    EXPECT_THAT(attribute(with(file, attributeCountOffset, bigEndian(0xFFFF, 2)), "date"),
                Optional(Eq("2009-03-01 12:00:00")));
}

TEST(Sidecar, AValueLargerThanTheFormatAllowsIsRefused) {
    const std::string largest(128 * 1024, 'x');
    EXPECT_THAT(attribute(sidecarWithAttributes({{"date", largest}}), "date"), Optional(Eq(largest)));
    EXPECT_EQ(attribute(sidecarWithAttributes({{"date", largest + "x"}}), "date"), std::nullopt);
}

TEST(Sidecar, LiesBesideItsFile) {
    EXPECT_EQ(appleDoublePath("/media/card/clip.mov"), "/media/card/._clip.mov");
    EXPECT_EQ(appleDoublePath("/clip.mov"), "/._clip.mov");
}
