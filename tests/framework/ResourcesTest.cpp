// The icons and texts that ship, in the plug-in's bundle and in the framework.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>

#include "framework/BundleStrings.h"
#include "framework/FrameworkResources.h"
#include "host/VXMediaBrowserUtilities.h"
#include "platform/CalendarDate.h"
#include "platform/Image.h"
#include "tests/support/TemporaryFolder.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;
using testing::UnorderedElementsAre;
using testing_support::ScopedEnvironment;

const fs::path bundleResources = fs::path(VEXO_SOURCE_DIR) / "resources/Resources";
const fs::path frameworkResources = fs::path(VEXO_SOURCE_DIR) / "framework/resources";

std::string contentsOf(const fs::path& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

using Pictures = std::map<std::string, std::shared_ptr<const platform::Picture>>;

std::shared_ptr<const platform::Picture> pictureInFile(const fs::path& path) {
    const std::string data = contentsOf(path);
    return platform::pictureWithData(std::as_bytes(std::span(data)));
}

Pictures allPictures() {
    Pictures pictures;
    for (const auto& folder : {bundleResources / "Icons", frameworkResources / "icons"}) {
        for (const auto& entry : fs::directory_iterator(folder))
            pictures[entry.path().stem()] = pictureInFile(entry.path());
    }
    return pictures;
}

std::vector<std::string> namesOf(const Pictures& pictures) {
    std::vector<std::string> names;
    for (const auto& [name, picture] : pictures)
        names.push_back(name);
    return names;
}

// Whether two pixels are told apart by eye: unlike by a quarter of a channel's range.
bool areUnlike(std::uint32_t one, std::uint32_t other) {
    for (int shift = 0; shift < 32; shift += 8) {
        if (std::abs(int(one >> shift & 255) - int(other >> shift & 255)) > 64)
            return true;
    }
    return false;
}

int unlikePixels(const platform::Bitmap& one, const platform::Bitmap& other) {
    int count = 0;
    for (std::size_t i = 0; i < one.pixels.size(); ++i)
        count += areUnlike(one.pixels[i], other.pixels[i]);
    return count;
}

constexpr int sizesInUse[] = {16, 20, 32, 96};

TEST(Icons, AreComplete) {
    EXPECT_THAT(namesOf(allPictures()),
                UnorderedElementsAre("Reelix-icon-calendar", "Reelix-icon-event", "Reelix-icon-project",
                                     "Reelix-icon-trailer", "List-Icons-Library", "MBReelixAppIconSmall",
                                     "MBReelixIcon", "folder", "movie", "package", "document", "volume"));
}

TEST(Icons, AreThirtyTwoPointsAndThoseOfListsSixteen) {
    for (const auto& [name, picture] : allPictures()) {
        const double side = name.starts_with("List-") ? 16 : 32;
        EXPECT_EQ(picture->naturalSize(), (platform::Size{side, side})) << name;
    }
}

TEST(Icons, CoverMuchOfTheirSquareAtEverySize) {
    for (const auto& [name, picture] : allPictures()) {
        for (int size : sizesInUse) {
            const auto bitmap = picture->draw(size, size);
            ASSERT_TRUE(bitmap) << name;
            const auto covered = std::count_if(bitmap->pixels.begin(), bitmap->pixels.end(),
                                               [](std::uint32_t pixel) { return pixel >> 24 > 127; });
            EXPECT_GT(covered, size * size * 2 / 5) << name << " at " << size;
        }
    }
}

TEST(Icons, LeaveTheCornersOfTheirSquareFree) {
    for (const auto& [name, picture] : allPictures()) {
        const auto bitmap = picture->draw(96, 96);
        ASSERT_TRUE(bitmap) << name;
        EXPECT_EQ(bitmap->pixels.front(), 0u) << name;
        EXPECT_EQ(bitmap->pixels.back(), 0u) << name;
    }
}

TEST(Icons, DifferFromEachOtherAtEverySize) {
    for (int size : sizesInUse) {
        std::map<std::string, platform::Bitmap> drawn;
        for (const auto& [name, picture] : allPictures())
            drawn[name] = picture->draw(size, size).value();
        for (auto one = drawn.begin(); one != drawn.end(); ++one) {
            for (auto other = std::next(one); other != drawn.end(); ++other)
                EXPECT_GT(unlikePixels(one->second, other->second), size * size / 5)
                    << one->first << ", " << other->first << " at " << size;
        }
    }
}

TEST(FrameworkResources, AreTheFilesOfTheSources) {
    for (const auto& entry : fs::recursive_directory_iterator(frameworkResources)) {
        if (!entry.is_regular_file())
            continue;
        EXPECT_EQ(frameworkResource(fs::relative(entry.path(), frameworkResources).string()),
                  contentsOf(entry));
    }
    EXPECT_EQ(frameworkResource("icons/missing.svg"), std::nullopt);
    EXPECT_EQ(frameworkResource(""), std::nullopt);
}

TEST(FrameworkStrings, AreFoundByKeyElseTheGivenTextIsAnswered) {
    const ScopedEnvironment language("LANGUAGE", "en");
    EXPECT_EQ(VXMediaBrowserUtilities::localizedStringForKey("DurationString", "DurationString"),
              "%ld:%02ld");
    EXPECT_EQ(VXMediaBrowserUtilities::localizedStringForKey("missing", "the text"), "the text");
    EXPECT_EQ(VXMediaBrowserUtilities::localizedStringForKey("", ""), "");
}

const std::set<std::string> languages{"de", "es", "fr", "it", "ja", "nl", "pt_BR"};
// These appear in the names of files, which are the same in every language.
const std::set<std::string> untranslatedKeys{"ReelixClipNamePrefix", "ReelixClipNameFormat"};

// The languages in which each key of the bundle's texts is written, beside English.
std::map<std::string, std::set<std::string>> translationsByKey() {
    std::map<std::string, std::set<std::string>> translations;
    std::ifstream file(bundleResources / "Strings.ini");
    for (std::string line; std::getline(file, line);) {
        if (line.empty() || line[0] == '#' || line == "[Strings]")
            continue;
        const std::string name = line.substr(0, line.find('='));
        const std::size_t bracket = name.find('[');
        auto& languagesOfKey = translations[name.substr(0, bracket)];
        if (bracket != std::string::npos)
            languagesOfKey.insert(name.substr(bracket + 1, name.size() - bracket - 2));
    }
    return translations;
}

BundleStrings bundleStrings() {
    return BundleStrings::withData(contentsOf(bundleResources / "Strings.ini"), "Strings.ini");
}

TEST(Strings, AreCompleteInEnglish) {
    const ScopedEnvironment language("LANGUAGE", "en");
    const BundleStrings strings = bundleStrings();
    EXPECT_EQ(strings.warning(), "");
    for (const char* key :
         {"ReelixProjectLibrary", "ReelixEventLibrary", "ReelixTrailerNotReady", "ReelixProjectNotReady",
          "OpenInReelix", "OpenReelix", "RevealInFinder", "ReelixClipNamePrefix", "ReelixClipNameFormat",
          "ReelixClipNameDisplayFormat", "VXPluginDefaultLoadingStringKey", "VXPluginDefaultNoDataStringKey"})
        EXPECT_TRUE(strings.stringForKey(key)) << key;
    EXPECT_EQ(translationsByKey().size(), 12u);
}

TEST(Strings, AreTranslatedInEveryLanguageButForFileNames) {
    for (const auto& [key, translated] : translationsByKey())
        EXPECT_EQ(translated, untranslatedKeys.contains(key) ? std::set<std::string>() : languages) << key;
}

TEST(Strings, ClipFileNamesAreTheSameInEveryLanguage) {
    const BundleStrings strings = bundleStrings();
    for (const std::string& language : languages) {
        const ScopedEnvironment environment("LANGUAGE", language.c_str());
        EXPECT_EQ(strings.stringForKey("ReelixClipNamePrefix"), "clip");
        EXPECT_EQ(strings.stringForKey("ReelixClipNameFormat"), "%Y-%m-%d %H;%M;%S");
    }
}

// The letters after the percent signs of a calendar format.
std::string conversionsOf(const std::string& format) {
    std::string letters;
    for (std::size_t at = format.find('%'); at != std::string::npos; at = format.find('%', at + 2))
        letters += format.substr(at + 1, 1);
    return letters;
}

TEST(Strings, ClipDatesAreShownInEveryLanguageByKnownConversionsToTheSecond) {
    const BundleStrings strings = bundleStrings();
    for (const std::string& language : languages) {
        const ScopedEnvironment environment("LANGUAGE", language.c_str());
        const std::string conversions =
            conversionsOf(strings.stringForKey("ReelixClipNameDisplayFormat").value_or(""));
        EXPECT_EQ(conversions.find_first_not_of("YymdeHIMSpaAbB"), std::string::npos) << language;
        EXPECT_THAT(conversions, testing::HasSubstr("Y")) << language;
        EXPECT_THAT(conversions, testing::EndsWith("HMS")) << language;
    }
}

TEST(Strings, ClipDatesReadAsTheyAreWrittenInFileNames) {
    const std::string format = bundleStrings().stringForKey("ReelixClipNameFormat").value_or("");
    const auto date = platform::CalendarDate::dateWithString("2011-03-09 17;05;08", format);
    ASSERT_TRUE(date);
    EXPECT_EQ(date->descriptionWithCalendarFormat(format, {"en_US_POSIX"}), "2011-03-09 17;05;08");
}

TEST(Strings, ClipDatesLookNaturalInEveryLanguage) {
    const auto date = platform::CalendarDate::dateWithString("2011-03-09 17;05;08", "%Y-%m-%d %H;%M;%S");
    ASSERT_TRUE(date);
    std::map<std::string, std::string> shown;
    const BundleStrings strings = bundleStrings();
    for (const char* language : {"en", "de", "es", "fr", "it", "ja", "nl", "pt_BR"}) {
        const ScopedEnvironment environment("LANGUAGE", language);
        const std::string format = strings.stringForKey("ReelixClipNameDisplayFormat").value_or("");
        shown[language] = date->descriptionWithCalendarFormat(format, {language});
    }
    EXPECT_THAT(shown, testing::ElementsAre(testing::Pair("de", "9. März 2011, 17:05:08"),
                                            testing::Pair("en", "Mar 9, 2011, 17:05:08"),
                                            testing::Pair("es", "9 de marzo de 2011, 17:05:08"),
                                            testing::Pair("fr", "9 mars 2011 à 17:05:08"),
                                            testing::Pair("it", "9 marzo 2011, 17:05:08"),
                                            testing::Pair("ja", "2011年03月09日 17:05:08"),
                                            testing::Pair("nl", "9 maart 2011, 17:05:08"),
                                            testing::Pair("pt_BR", "9 de março de 2011, 17:05:08")));
}

}  // namespace
}  // namespace vexo
