#include "tests/hostile/HostileLibraryTest.h"

#include <sstream>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "framework/TreeWalk.h"
#include "host/VXConstants.h"
#include "platform/Text.h"

namespace testing_support {

using namespace vexo;

namespace {

VXMediaGroupRef rootOf(const Host& host) {
    return host.plugins().front().manager->rootMediaGroup();
}

bool isOfType(const VXMediaGroup& group, const VXGroupTypeIdentifier& type) {
    return group.typeIdentifier() == type;
}

// The rows of a printed tree: each group, and the items of those that hold no other groups.
std::size_t rowsOf(const VXMediaGroupRef& root) {
    std::size_t rows = 0;
    visitGroups(root, [&](const VXMediaGroupRef& group) {
        rows += 1 + (group->childGroups().empty() ? group->mediaObjects().size() : 0);
        return true;
    });
    return rows;
}

// Of those that no line of a text and no string in JSON may hold.
bool isControl(char byte) {
    return 0 <= byte && byte < 0x20 && byte != '\n';
}

// What else a terminal obeys or shows in another order: DEL, the C1 controls, and the marks and overrides of
// direction.
void expectNothingForATerminal(const std::string& text) {
    for (const char* const sign :
         {"\x7F", "\xC2\x80", "\xC2\x9B", "\xE2\x80\x8F", "\xE2\x80\xAA", "\xE2\x80\xAE", "\xE2\x81\xA6"})
        EXPECT_EQ(text.find(sign), text.npos) << text;
}

void expectOneRowForEachItem(Host& host) {
    std::ostringstream out;
    ASSERT_TRUE(runTree(host, {}, out).empty());
    const std::string text = out.str();
    EXPECT_TRUE(platform::isValidUTF8(text));
    EXPECT_EQ(std::count_if(text.begin(), text.end(), isControl), 0) << text;
    expectNothingForATerminal(text);
    const bool hasMessageBelow = rootOf(host)->childGroups().empty();
    if (!hasMessageBelow) {
        EXPECT_EQ(std::size_t(std::count(text.begin(), text.end(), '\n')), rowsOf(rootOf(host))) << text;
    }
}

void collectURLs(const Json& group, std::vector<std::string>& URLs) {
    for (const Json& item : group["mediaObjects"])
        URLs.push_back(item["url"]);
    for (const Json& child : group["childGroups"])
        collectURLs(child, URLs);
}

// A name as bytes, and as JSON has it.
void expectEachItemInJson(Host& host) {
    std::ostringstream out;
    ASSERT_TRUE(runTree(host, {.format = OutputFormat::json, .depth = std::nullopt}, out).empty());
    const std::string text = out.str();
    EXPECT_TRUE(platform::isValidUTF8(text));
    EXPECT_EQ(std::count_if(text.begin(), text.end(), isControl), 0);
    std::vector<std::string> printed;
    collectURLs(Json::parse(text)["plugins"][0]["root"], printed);
    std::vector<std::string> expected;
    visitGroups(rootOf(host), [&](const VXMediaGroupRef& group) {
        for (const VXMediaObjectRef& item : group->mediaObjects())
            expected.push_back(item->URL()->absoluteString());
        return true;
    });
    EXPECT_THAT(printed, testing::UnorderedElementsAreArray(expected));
}

// The path below the folder; all of it for one that lies elsewhere.
std::string below(const std::string& folder, const std::string& path) {
    return path.starts_with(folder + "/") ? path.substr(folder.size() + 1) : path;
}

}  // namespace

long FoundLibrary::warningsNaming(const std::string& path) const {
    return std::count_if(warnings.begin(), warnings.end(),
                         [&](const std::string& warning) { return warning.find(path) != std::string::npos; });
}

HostileLibraryTest::HostileLibraryTest() = default;

FoundLibrary HostileLibraryTest::load() {
    FoundLibrary library;
    withHost([&](Host& host) {
        expectOneRowForEachItem(host);
        expectEachItemInJson(host);
        library = found(host);
    });
    return library;
}

FoundLibrary HostileLibraryTest::loadUnprinted() {
    FoundLibrary library;
    withHost([&](Host& host) {
        host.startLoading();
        EXPECT_TRUE(host.waitUntilLoaded(std::chrono::minutes(5)));
        library = found(host);
    });
    return library;
}

void HostileLibraryTest::withHost(const std::function<void(Host& host)>& use) {
    Host host(options_);
    ASSERT_EQ(host.loadPlugins(), std::nullopt);
    use(host);
}

void HostileLibraryTest::makeProject(const std::string& name) const {
    home_.writeFile(project(name) + "/Movies/movie.mov", "movie");
}

void HostileLibraryTest::makeClip(const std::string& name) const {
    home_.writeFile(event(name), "clip");
}

FoundLibrary HostileLibraryTest::found(Host& host) const {
    FoundLibrary library;
    const std::string projects = home_.path(projects_), events = home_.path(events_);
    visitGroups(rootOf(host), [&](const VXMediaGroupRef& group) {
        const bool isProject = isOfType(*group, VXReelixProjectGroupTypeIdentifier);
        const bool isEvent = isOfType(*group, VXReelixEventGroupTypeIdentifier);
        if (isProject)
            library.projects.push_back(below(projects, group->path().value_or("")));
        for (const VXMediaObjectRef& item : group->mediaObjects()) {
            if (isProject)
                library.movies.push_back(below(projects, item->path().value_or("")));
            if (isEvent)
                library.clips.push_back(below(events, item->path().value_or("")));
        }
        return true;
    });
    for (auto* const list : {&library.projects, &library.movies, &library.clips})
        std::sort(list->begin(), list->end());
    for (std::string warning : host.diagnostics().warnings()) {
        if (const auto at = warning.find(home_.path()); at != warning.npos)
            warning.replace(at, home_.path().size(), "home");
        library.warnings.push_back(std::move(warning));
    }
    return library;
}

}  // namespace testing_support
