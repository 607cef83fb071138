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

// The folder a quoted include names: "platform/linux" is one of its own.
std::string folderOf(const std::string& include) {
    if (include.starts_with("platform/linux/"))
        return "platform/linux";
    return include.substr(0, include.find('/'));
}

const std::set<std::string> plugin{"core", "projects", "events", "watching", "browser", "host", "platform"};

// What each folder may include of ours.
const std::map<std::string, std::set<std::string>> allowed{
    {"platform", {"platform"}},
    {"platform/linux", {"platform", "platform/linux"}},
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
        if (folder == "platform" && source.string().find("/platform/linux/") != std::string::npos)
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
                         testing::Values("platform", "platform/linux", "host", "framework", "core",
                                         "projects", "events", "watching", "browser", "apps"),
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
