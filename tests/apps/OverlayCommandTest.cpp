// Overlays from the command line: the real program and the files that it writes.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <iterator>

#include "tests/support/FileContent.h"
#include "tests/support/Program.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using namespace testing_support;
using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;
namespace fs = std::filesystem;

class OverlayCommand : public testing::Test {
  protected:
    Outcome overlay(const std::string& size, std::vector<std::string> options = {}) const {
        std::vector<std::string> arguments{"--home", home_.path(), "overlay", "--object", movie_,
                                           "--size", size,         "-o",      file_};
        arguments.insert(arguments.end(), options.begin(), options.end());
        return runVexo(arguments);
    }
    // That there is no overlay, and that what was in the file still is.
    void expectNone(const std::string& size, const std::string& reason) const {
        folder_.writeFile("overlay.png", "before");
        const Outcome outcome = overlay(size);
        EXPECT_EQ(outcome.status, 1) << size;
        EXPECT_EQ(outcome.output, "");
        EXPECT_THAT(outcome.errors, AllOf(StartsWith("vexo: "), HasSubstr(reason))) << size;
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
        EXPECT_EQ(contentOf(file_), "before");
        EXPECT_EQ(std::distance(fs::directory_iterator(folder_.path()), {}), 1);
    }
    // Width and height of the PNG in the file.
    std::string pixels() const {
        const std::string png = contentOf(file_);
        if (!png.starts_with("\x89PNG\r\n\x1a\n") || png.size() < 24)
            return "no PNG";
        const auto number = [&png](std::size_t at) {
            unsigned value = 0;
            for (std::size_t i = at; i < at + 4; ++i)
                value = value * 256 + static_cast<unsigned char>(png[i]);
            return std::to_string(value);
        };
        return number(16) + "x" + number(20);
    }

    const TemporaryFolder home_;
    const TemporaryFolder folder_;
    const std::string movie_ =
        home_.writeFile("Movies/Reelix Projects/Summer.qnproject/Movies/HD.mov", "no real movie");
    const std::string file_ = folder_.path("overlay.png");
};

TEST_F(OverlayCommand, WritesAnImageOfTheSizeInPixels) {
    const std::pair<std::vector<std::string>, std::string> sizes[] = {{{}, "81x60"},
                                                                      {{"--scale", "2"}, "161x119"},
                                                                      {{"--scale", "1.5"}, "121x90"},
                                                                      {{"--scale", "0.01"}, "1x1"}};
    for (const auto& [options, expected] : sizes) {
        const Outcome outcome = overlay("80.5x59.5", options);
        EXPECT_EQ(outcome.status, 0) << outcome.errors;
        EXPECT_EQ(outcome.output + outcome.errors, "");
        EXPECT_EQ(pixels(), expected);
    }
}

TEST_F(OverlayCommand, WritesNothingWhereThereIsNoOverlay) {
    for (const char* size : {"0x0", "40x60", "80x-5", "-80x60", "80x0"})
        expectNone(size, "no overlay");
}

TEST_F(OverlayCommand, WritesNothingThatIsTooLargeToDraw) {
    for (const char* size : {"100000x100000", "1e300x1e300", "16385x10"})
        expectNone(size, "cannot be drawn");
}

TEST_F(OverlayCommand, AnItemThatIsNotThereIsStatus1) {
    const Outcome outcome =
        runVexo({"--home", home_.path(), "overlay", "--object", "nothing", "--size", "80x60", "-o", file_});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, HasSubstr("there is no item with the ID or URL 'nothing'"));
    EXPECT_FALSE(fs::exists(file_));
}

TEST_F(OverlayCommand, AFileThatCannotBeWrittenIsStatus1) {
    const Outcome outcome = runVexo({"--home", home_.path(), "overlay", "--object", movie_, "--size", "80x60",
                                     "-o", folder_.path("missing/overlay.png")});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, HasSubstr("missing/overlay.png"));
    EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
}

TEST_F(OverlayCommand, WhatIsNoSizeIsStatus2) {
    for (const char* size :
         {"80", "x", "80x", "x60", "nanx2", "infx3", "1e999x1", "80x60x5", "80 x60", "0x10x5", ""}) {
        const Outcome outcome = overlay(size);
        EXPECT_EQ(outcome.status, 2) << size;
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
    }
    for (const char* scale : {"0", "-1", "x", "nan", "inf", ""})
        EXPECT_EQ(overlay("80x60", {"--scale", scale}).status, 2) << scale;
    EXPECT_FALSE(fs::exists(file_));
}

TEST_F(OverlayCommand, WantsAFile) {
    EXPECT_EQ(runVexo({"--home", home_.path(), "overlay", "--object", movie_, "--size", "80x60"}).status, 2);
}

class DrawingLibrary : public OverlayCommand {
  protected:
    // What the linker loaded, as it tells it.
    static bool isLoaded(const Outcome& outcome) {
        EXPECT_THAT(outcome.errors, HasSubstr("libVexoMediaBrowser"));
        const bool isLoaded = outcome.errors.find("libVexoDrawing") != std::string::npos;
        EXPECT_EQ(outcome.errors.find("libcairo") != std::string::npos, isLoaded);
        return isLoaded;
    }
};

TEST_F(DrawingLibrary, IsLoadedByWhatDrawsAlone) {
    const ScopedEnvironment told("LD_DEBUG", "files");
    const ScopedEnvironment noReader("VEXO_MEDIA_READER", "/nowhere/reader");  // which may load anything
    EXPECT_FALSE(isLoaded(runVexo({"--home", home_.path(), "tree"})));
    EXPECT_TRUE(isLoaded(overlay("80x60")));
}

TEST_F(DrawingLibrary, IsMissedByWhatDrawsAlone) {
    const TemporaryFolder installation;
    const std::string library = "libVexoMediaBrowser.so.0";
    fs::copy_file(fs::path(VEXO_BIN_DIR) / "../lib" / library, installation.path(library));
    const ScopedEnvironment libraries("LD_LIBRARY_PATH", installation.path().c_str());
    const ScopedEnvironment plugins("VEXO_PLUGIN_PATH", REELIX_BUNDLE_DIR);
    const Outcome tree = runVexo({"--home", home_.path(), "tree"});
    EXPECT_EQ(tree.status, 0);
    EXPECT_THAT(tree.output, HasSubstr("Summer"));
    EXPECT_EQ(tree.errors, "");
    const Outcome drawn = overlay("80x60");
    EXPECT_EQ(drawn.status, 1);
    EXPECT_THAT(drawn.errors, HasSubstr(installation.path("vexo/libVexoDrawing.so")));
}

}  // namespace
