#include "apps/vexo/TextTree.h"

#include <gtest/gtest.h>

#include <sstream>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

class TextTreeTest : public testing::Test {
  protected:
    VXMediaGroupRef group(const VXGroupTypeIdentifier& type, const std::string& name) {
        auto made = std::make_shared<VXMediaGroup>(type, name);
        made->setName(name);
        return made;
    }
    VXMediaObjectRef movie(const std::string& name, platform::Size size, double duration) {
        auto made = std::make_shared<VXMediaObject>(VXMediaTypeMovie, name, name);
        made->setAttribute(size, VXMediaObjectResolutionKey);
        made->setAttribute(duration, VXMediaObjectDurationKey);
        return made;
    }
    platform::ImageRef icon(const std::string& name) {
        return std::make_shared<platform::Image>(nullptr, name);
    }

    // A root with a trailer, a project that was never rendered, and an event.
    VXMediaGroupRef sampleRoot() {
        const auto root = group(VXReelixRootGroupTypeIdentifier, "Reelix");
        const auto trailer = group(VXReelixProjectGroupTypeIdentifier, "Coming Soon");
        trailer->setIcon(icon("Reelix-icon-trailer"));
        trailer->setModificationDate(platform::Date::since1970(1307664000));  // 2011-06-10
        trailer->setMediaObjects({movie("HD", {1280, 720}, 65), movie("Mobile", {640, 360}, 3723)});
        const auto project = group(VXReelixProjectGroupTypeIdentifier, "Rough Cut");
        project->setIcon(icon("Reelix-icon-project"));

        const auto library = group(VXReelixEventLibraryGroupTypeIdentifier, "Event Library");
        const auto year = group(VXReelixEventCalendarGroupTypeIdentifier, "2008");
        const auto event = group(VXReelixEventGroupTypeIdentifier, "New Year");
        event->setMediaObjects({movie("fireworks", {640, 480}, 10)});
        event->setAttributes({{"ReelixEventCreationYear", 2008},
                              {"ReelixEventOldestClipDate", platform::Date::since1970(1230768000 - 1)},
                              {"ReelixEventNewestClipDate", platform::Date::since1970(1230768000)}});
        year->addChildGroup(event);
        library->addChildGroup(year);
        for (const auto& child : {trailer, project, library})
            root->addChildGroup(child);
        return root;
    }
    std::string text(const VXMediaGroupRef& root, TextTreeOptions options = {}, OutputStyle style = {}) {
        std::ostringstream out;
        TextTree(root, options).print(out, style);
        return out.str();
    }

    testing_support::HostEnvironment environment;
};

TEST_F(TextTreeTest, ShowsNamesAtTheLeftAndWhatTheyAreAtTheRight) {
    EXPECT_EQ(text(sampleRoot()),
              "Reelix                     2 projects, 1 event, 1 clip\n"
              "├── Coming Soon            trailer · 2 movies           2011-06-10\n"
              "│   ├── HD                 1280×720                     1:05\n"
              "│   └── Mobile             640×360                      1:02:03\n"
              "├── Rough Cut              project · not rendered\n"
              "└── Event Library          1 event, 1 clip\n"
              "    └── 2008               1 event, 1 clip\n"
              "        └── New Year       1 clip                       2008-12-31 – 2009-01-01\n"
              "            └── fireworks\n");
}

TEST_F(TextTreeTest, ClipsShowSizeAndLengthWithMetadata) {
    EXPECT_NE(text(sampleRoot(), {.depth = std::nullopt, .withMetadata = true}).find("fireworks  640×480"),
              std::string::npos);
}

TEST_F(TextTreeTest, DepthZeroIsTheRootAlone) {
    EXPECT_EQ(text(sampleRoot(), {.depth = 0}), "Reelix  2 projects, 1 event, 1 clip\n");
}

TEST_F(TextTreeTest, NamesAreCutToFitTheTerminal) {
    const auto root = group(VXReelixRootGroupTypeIdentifier, "Reelix");
    root->addChildGroup(group(VXReelixFolderGroupTypeIdentifier, std::string(100, 'n')));
    std::istringstream lines(text(root, {}, {.width = 40, .colors = false}));
    for (std::string line; std::getline(lines, line);)
        EXPECT_LE(displayWidth(line), 40u) << line;
}

TEST_F(TextTreeTest, WithoutATerminalNamesStayWhole) {
    const auto root = group(VXReelixRootGroupTypeIdentifier, "Reelix");
    root->addChildGroup(group(VXReelixFolderGroupTypeIdentifier, std::string(100, 'n')));
    EXPECT_NE(text(root).find(std::string(100, 'n')), std::string::npos);
}

TEST_F(TextTreeTest, ColorsAreUsedOnlyWhereTheStyleHasThem) {
    EXPECT_EQ(text(sampleRoot()).find('\033'), std::string::npos);
    EXPECT_NE(text(sampleRoot(), {}, {.width = 80, .colors = true}).find("\033["), std::string::npos);
}

TEST(TerminalTest, ControlCharactersAppearAsTheirPictures) {
    EXPECT_EQ(printable("a\033[31m\n\x7f"), "a␛[31m␊␡");
    EXPECT_EQ(printable(std::string_view("a\0b", 3)), "a␀b");
}

TEST(TerminalTest, WhatReordersTextAndWhatIsNotUTF8IsReplaced) {
    EXPECT_EQ(printable("a\u202Eb\u2066c"), "a\uFFFDb\uFFFDc");
    EXPECT_EQ(printable("a\xff"), "a\uFFFD");
    EXPECT_EQ(printable("\u0085\u2028"), "\uFFFD\uFFFD");
}

TEST(TerminalTest, WidthsCountWideAndCombiningCharacters) {
    EXPECT_EQ(displayWidth("abc"), 3u);
    EXPECT_EQ(displayWidth("映画"), 4u);
    EXPECT_EQ(displayWidth("e\u0301"), 1u);
}

TEST(TerminalTest, TextIsCutAtColumnsAndNeverInsideACharacter) {
    EXPECT_EQ(fitted("abcdef", 6), "abcdef");
    EXPECT_EQ(fitted("abcdef", 4), "abc…");
    EXPECT_EQ(fitted("映画館", 4), "映…");
    EXPECT_EQ(fitted("abc", 0), "");
}

}  // namespace
}  // namespace vexo
