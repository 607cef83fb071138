// Dependencies run one way: each folder includes only what lies beneath it.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>

namespace {

namespace fs = std::filesystem;

struct Include {
    std::string name;
    bool quoted;
};

std::vector<Include> includesOf(const fs::path& file) {
    static const std::regex pattern(R"re(^\s*#include\s+([<"])([^>"]+)[>"])re");
    std::vector<Include> includes;
    std::ifstream stream(file);
    for (std::string line; std::getline(stream, line);) {
        std::smatch match;
        if (std::regex_search(line, match, pattern))
            includes.push_back({match[2], match[1] == "\""});
    }
    return includes;
}

std::vector<fs::path> sourcesIn(const fs::path& folder) {
    std::vector<fs::path> sources;
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        if (entry.path().extension() == ".h" || entry.path().extension() == ".cpp")
            sources.push_back(entry.path());
    }
    return sources;
}

// The folder that a path begins with, of those that have rules of their own.
std::string folderOf(const std::string& path) {
    for (const char* folder : {"platform/linux/drawing", "platform/linux"}) {
        if (path.starts_with(std::string(folder) + "/"))
            return folder;
    }
    return path.substr(0, path.find('/'));
}

const std::set<std::string> plugin{"core", "projects", "events", "watching", "browser", "host", "platform"};

// What each folder may include of ours.
const std::map<std::string, std::set<std::string>> allowed{
    {"platform", {"platform"}},
    {"platform/linux", {"platform", "platform/linux"}},
    {"platform/linux/drawing", {"platform", "platform/linux", "platform/linux/drawing"}},
    {"host", {"host", "platform"}},
    {"framework", {"framework", "host", "platform", "platform/linux"}},
    {"core", plugin},
    {"projects", plugin},
    {"events", plugin},
    {"watching", plugin},
    {"browser", plugin},
    {"apps", {"apps", "framework", "host", "platform", "platform/linux"}},
};

// Headers of the C++ standard library and of C; no other library may appear where only these are allowed.
bool isStandardHeader(const std::string& name) {
    return name.find('/') == std::string::npos && name.find(".h") == std::string::npos;
}

class DependencyDirectionTest : public testing::TestWithParam<std::string> {};

TEST_P(DependencyDirectionTest, AFolderIncludesOnlyWhatLiesBeneathIt) {
    const std::string folder = GetParam();
    int checked = 0;
    for (const fs::path& source : sourcesIn(fs::path(VEXO_SOURCE_DIR) / folder)) {
        if (folderOf(source.lexically_relative(VEXO_SOURCE_DIR)) != folderOf(folder + "/"))
            continue;
        for (const Include& include : includesOf(source)) {
            if (!include.quoted)
                continue;
            EXPECT_TRUE(allowed.at(folder).contains(folderOf(include.name)))
                << source << " includes " << include.name;
            ++checked;
        }
    }
    EXPECT_GT(checked, 0);
}

INSTANTIATE_TEST_SUITE_P(Folders, DependencyDirectionTest,
                         testing::Values("platform", "platform/linux", "platform/linux/drawing", "host",
                                         "framework", "core", "projects", "events", "watching", "browser",
                                         "apps"),
                         [](const auto& folder) {
                             std::string name = folder.param;
                             std::replace(name.begin(), name.end(), '/', '_');
                             return name;
                         });

TEST(DependencyDirectionTest, ThePluginAndTheContractsUseNoLibrary) {
    for (const char* folder : {"core", "projects", "events", "watching", "browser", "host"}) {
        for (const fs::path& source : sourcesIn(fs::path(VEXO_SOURCE_DIR) / folder)) {
            for (const Include& include : includesOf(source)) {
                EXPECT_TRUE(include.quoted || isStandardHeader(include.name))
                    << source << " includes " << include.name;
            }
        }
    }
}

TEST(DependencyDirectionTest, FFmpegIsIncludedByHelperProgramsOnly) {
    for (const char* folder : {"platform", "host", "framework", "core", "apps/vexo"}) {
        for (const fs::path& source : sourcesIn(fs::path(VEXO_SOURCE_DIR) / folder)) {
            for (const Include& include : includesOf(source))
                EXPECT_FALSE(include.name.starts_with("libav")) << source << " includes " << include.name;
        }
    }
}

}  // namespace
