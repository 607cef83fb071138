// Documents that are cut short or written anew while they are being read.
#include <gmock/gmock.h>

#include <filesystem>

#include "platform/KeyedUnarchiver.h"
#include "tests/faults/FaultsTest.h"
#include "tests/faults/SystemCalls.h"
#include "tests/projects/ProjectsTest.h"

namespace testing_support {
namespace {

using testing::Contains;
using testing::HasSubstr;

// The answer needs what lies at the beginning, in the middle and at the end of many pages.
std::string longTrailerDocument() {
    platform::Array objects{archivedDictionary({uid(4)}, {uid(5)}), "editInfo"};
    constexpr int fillers = 500;
    objects.push_back(archivedDictionary({uid(fillers + 6)}, {uid(fillers + 7)}));
    for (int i = 0; i < fillers; ++i)
        objects.push_back(std::string(200, 'x') + std::to_string(i));
    objects.push_back("trailer");
    objects.push_back("Adventure");
    return archiveOf(objects);
}

class TruncatedDocument : public FaultsTest {
  protected:
    TruncatedDocument() : FaultsTest(Documents::allWell) { restore(); }

    void restore() const { home().writeFile("Movies/Reelix Projects/Summer.qnproject/Project", content); }
    std::string path() const { return projects() + "/Summer.qnproject/Project"; }

    // Whether the call of that number, of those that read the document, was made; before it, `change` is.
    bool loadWithChangeAt(std::size_t index, const std::function<void()>& change) {
        std::size_t reads = 0;
        SystemCalls calls(path());
        calls.beforeCall = [&](const SystemCall& call) {
            if (call.function == "pread" && reads++ == index)
                change();
        };
        entries = loadTree();
        return reads > index;
    }

    const std::string content = longTrailerDocument();
    TreeEntries entries;
};

TEST_F(TruncatedDocument, HidesNothingAndIsNamedByAWarning) {
    const TreeEntries whole = loadTree();
    const std::string wholeText = tree();
    std::size_t index = 0;
    for (bool wasRead = true; wasRead; ++index) {
        for (const std::size_t size :
             {std::size_t{0}, std::size_t{100}, content.size() / 2, content.size() - 1}) {
            SCOPED_TRACE("read " + std::to_string(index) + ", " + std::to_string(size) + " bytes");
            wasRead = loadWithChangeAt(index, [&] { std::filesystem::resize_file(path(), size); });
            EXPECT_EQ(entries, whole);
            if (tree() != wholeText) {
                EXPECT_THAT(environment.diagnostics.warnings(), Contains(HasSubstr(path())));
            }
            restore();
        }
    }
    EXPECT_GT(index, 3u);
    loadTree();
    EXPECT_EQ(tree(), wholeText);
}

TEST_F(TruncatedDocument, ThatGrowsOrIsAnotherOneNowHidesNothing) {
    const TreeEntries whole = loadTree();
    std::size_t index = 0;
    for (bool wasRead = true; wasRead; ++index) {
        for (const std::string& other :
             {content + content, std::string(content.size(), '\xff'), plainDocument()}) {
            SCOPED_TRACE("read " + std::to_string(index) + ", " + std::to_string(other.size()) + " bytes");
            wasRead = loadWithChangeAt(
                index, [&] { home().writeFile("Movies/Reelix Projects/Summer.qnproject/Project", other); });
            EXPECT_EQ(entries, whole);
            restore();
        }
    }
    EXPECT_GT(index, 3u);
}

}  // namespace
}  // namespace testing_support
