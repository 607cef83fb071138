#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <thread>

#include "framework/GuardedWork.h"
#include "platform/KeyedUnarchiver.h"
#include "projects/QNPlaceholder.h"
#include "tests/projects/ProjectsTest.h"
#include "tests/support/OpenDescriptors.h"

using namespace testing_support;
using platform::ArchiveError;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

std::string sample(const std::string& name) {
    std::ifstream file(VEXO_SAMPLES_DIR "/archives/" + name + ".plist", std::ios::binary);
    std::string bytes{std::istreambuf_iterator<char>(file), {}};
    EXPECT_FALSE(bytes.empty()) << name;
    return bytes;
}

class ProjectDocument : public ProjectsTest {
  protected:
    const std::string package = home().makeFolder("A.qnproject");
    const std::string document = package + "/Project";

    void write(std::string_view content) { home().writeFile("A.qnproject/Project", content); }
    bool isTrailer(std::string_view content) {
        write(content);
        return plugin()._isTrailer(package);
    }
    // The text of the error that the document raises.
    std::string errorOf(std::string_view content) {
        try {
            return isTrailer(content) ? "trailer" : "no trailer";
        } catch (const ArchiveError& error) {
            EXPECT_EQ(error.sourceName(), document);
            return error.what();
        }
    }
};

TEST_F(ProjectDocument, ATrailerIsToldByAnEntryOfTheEditInformation) {
    EXPECT_TRUE(isTrailer(trailerDocument()));
    EXPECT_TRUE(isTrailer(sample("with-trailer")));
    EXPECT_TRUE(isTrailer(sample("with-trailer-xml")));
    EXPECT_FALSE(isTrailer(plainDocument()));
    EXPECT_FALSE(isTrailer(sample("without-trailer")));
}

TEST_F(ProjectDocument, AnyValueMakesATrailer) {
    EXPECT_TRUE(isTrailer(documentWithTrailer(false)));
    EXPECT_TRUE(isTrailer(documentWithTrailer(0)));
    EXPECT_TRUE(isTrailer(documentWithTrailer("")));
    EXPECT_TRUE(isTrailer(documentWithTrailer(archivedDictionary({}, {}))));
    EXPECT_TRUE(isTrailer(documentWithTrailer(archivedUnknown())));
}

TEST_F(ProjectDocument, AnEntryThatIsNilIsNoTrailer) {
    EXPECT_FALSE(isTrailer(sample("nil-trailer")));
    EXPECT_FALSE(isTrailer(archiveOf({archivedDictionary({uid(4)}, {uid(0)}), "editInfo"})));
}

TEST_F(ProjectDocument, AMissingRootOrEditInformationIsNoTrailer) {
    EXPECT_FALSE(isTrailer(archiveOf({"text"}, "another key")));
    EXPECT_FALSE(isTrailer(archiveOf({archivedDictionary({}, {})})));
    EXPECT_FALSE(isTrailer(archiveOf({archivedDictionary({uid(4)}, {uid(4)}), "trailer"})));
    EXPECT_FALSE(isTrailer(sample("cyclic")));
    EXPECT_FALSE(isTrailer(sample("shared")));
}

TEST_F(ProjectDocument, KeysOfOtherCaseDoNotCount) {
    EXPECT_FALSE(isTrailer(archiveOf({archivedDictionary({uid(4)}, {uid(5)}), "EditInfo",
                                      archivedDictionary({uid(6)}, {uid(6)}), "trailer"})));
    EXPECT_FALSE(isTrailer(archiveOf({archivedDictionary({uid(4)}, {uid(5)}), "editInfo",
                                      archivedDictionary({uid(6)}, {uid(6)}), "Trailer"})));
}

TEST_F(ProjectDocument, NoFileIsNoTrailer) {
    EXPECT_FALSE(plugin()._isTrailer(package));
    EXPECT_FALSE(plugin()._isTrailer(home().path("missing.qnproject")));
    EXPECT_FALSE(plugin()._isTrailer(""));
}

TEST_F(ProjectDocument, ThePathIsThePackageWithSlashProject) {
    write(trailerDocument());
    plugin();
    files.forget();
    plugin()._isTrailer(package);
    plugin()._isTrailer(package + "/");
    plugin()._isTrailer("");
    EXPECT_THAT(files.opened, ElementsAre(document, package + "//Project", "/Project"));
    EXPECT_TRUE(plugin()._isTrailer(package + "/"));
}

TEST_F(ProjectDocument, WhatIsNoPlainFileIsNoTrailerAndBlocksNobody) {
    home().makeFifo("Fifo.qnproject/Project");
    home().makeFolder("Folder.qnproject/Project");
    home().makeLink("Dangling.qnproject/Project", "nowhere");
    home().makeLink("Loop.qnproject/Project", "Project");
    home().makeLink("Endless.qnproject/Project", "/dev/zero");
    home().makeLink("LinkToFifo.qnproject/Project", home().path("Fifo.qnproject/Project"));
    for (const char* name : {"Fifo", "Folder", "Dangling", "Loop", "Endless", "LinkToFifo"})
        EXPECT_FALSE(plugin()._isTrailer(home().path(std::string(name) + ".qnproject"))) << name;
}

TEST_F(ProjectDocument, ASocketIsNoTrailer) {
    const int listener = socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    ASSERT_LT(document.size(), sizeof address.sun_path);
    document.copy(address.sun_path, document.size());
    ASSERT_EQ(bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    EXPECT_FALSE(plugin()._isTrailer(package));
    close(listener);
}

TEST_F(ProjectDocument, LinksToDocumentsAreFollowed) {
    home().writeFile("elsewhere", trailerDocument());
    home().makeLink("Linked.qnproject/Project", "../elsewhere");
    EXPECT_TRUE(plugin()._isTrailer(home().path("Linked.qnproject")));
}

TEST_F(ProjectDocument, ADocumentThatIsNoArchiveRaisesNamingTheFile) {
    for (const std::string& content :
         {std::string(), std::string("garbage"), std::string(64, '\0'), std::string("bplist00"),
          sample("truncated"), sample("other-archiver"), sample("other-version"), sample("self-reference")})
        EXPECT_THAT(errorOf(content), HasSubstr(document + ": ")) << content;
}

TEST_F(ProjectDocument, ARootThatIsNoDictionaryRaisesNamingTheFile) {
    EXPECT_THAT(errorOf(sample("root-is-text")), HasSubstr(document));
    EXPECT_THAT(errorOf(archiveOf({1.5})), HasSubstr(document));
}

TEST_F(ProjectDocument, EditInformationThatIsNoDictionaryRaisesNamingTheFile) {
    EXPECT_THAT(errorOf(archiveOf({archivedDictionary({uid(4)}, {uid(4)}), "editInfo"})),
                HasSubstr(document));
}

TEST_F(ProjectDocument, AnObjectOfAnUnknownClassHasNoEntries) {
    EXPECT_THAT(errorOf(archiveOf({archivedUnknown()})), HasSubstr(document));
    EXPECT_THAT(errorOf(archiveOf({archivedDictionary({uid(4)}, {uid(5)}), "editInfo", archivedUnknown()})),
                HasSubstr(document));
}

TEST_F(ProjectDocument, ObjectsOfUnknownClassesElsewhereDoNoHarm) {
    const auto documentBeside = [](const platform::Value& unknown) {
        return archiveOf({archivedDictionary({uid(8), uid(4)}, {uid(9), uid(5)}), "editInfo",
                          archivedDictionary({uid(6)}, {uid(7)}), "trailer", 1, "model", unknown});
    };
    EXPECT_TRUE(isTrailer(documentBeside(archivedUnknown())));
    EXPECT_FALSE(isTrailer(sample("unknown-class")));
}

TEST_F(ProjectDocument, UnknownClassesBecomePlaceholdersThatSaySo) {
    platform::KeyedUnarchiver unarchiver(
        files.openFileAtPath(VEXO_SAMPLES_DIR "/archives/unknown-class.plist"), &plugin());
    const auto root = unarchiver.decodeObjectForKey("root");
    ASSERT_TRUE(root);
    EXPECT_EQ(root->objectForKey("thing")->description(), "QN_PLACEHOLDER");
    EXPECT_EQ(root->objectForKey("plain")->description(), "plain");
}

TEST_F(ProjectDocument, EveryClassNameIsAnsweredWithThePlaceholder) {
    platform::KeyedUnarchiver unarchiver(
        files.openFileAtPath(VEXO_SAMPLES_DIR "/archives/with-trailer.plist"), &plugin());
    for (const char* name : {"RLXProject", "NSDictionary", "", "a\nb"})
        EXPECT_EQ(plugin().cannotDecodeObjectOfClassName(unarchiver, name, {}),
                  &reelix::QNPlaceholder::initWithCoder)
            << name;
    const auto one = reelix::QNPlaceholder::initWithCoder(unarchiver);
    const auto other = reelix::QNPlaceholder::initWithCoder(unarchiver);
    EXPECT_NE(one, other);
    EXPECT_EQ(one->description(), "QN_PLACEHOLDER");
}

TEST_F(ProjectDocument, FilesAreClosedAgainWhateverTheyHold) {
    plugin();
    const std::ptrdiff_t before = openDescriptors();
    isTrailer(trailerDocument());
    errorOf(sample("truncated"));
    errorOf(sample("root-is-text"));
    EXPECT_EQ(openDescriptors(), before);
}

TEST_F(ProjectDocument, DamageToAnyByteIsAnAnswerOrAnArchiveError) {
    const std::string sound = trailerDocument();
    int rejected = 0;
    for (std::size_t i = 0; i < sound.size(); ++i) {
        for (const unsigned char change : {0x01, 0x80, 0xff}) {
            std::string damaged = sound;
            damaged[i] = static_cast<char>(damaged[i] ^ change);
            rejected += errorOf(damaged).starts_with(document) ? 1 : 0;
        }
    }
    EXPECT_GT(rejected, 0);
}

TEST_F(ProjectDocument, ADocumentCutAnywhereIsRejected) {
    const std::string sound = trailerDocument();
    for (std::size_t length = 0; length < sound.size(); ++length)
        EXPECT_THAT(errorOf(sound.substr(0, length)), HasSubstr(document)) << length;
}

TEST_F(ProjectDocument, ADocumentThatShrinksWhileItIsReadIsRejected) {
    write(trailerDocument());
    plugin();
    files.afterOpening = [](const std::string& file) { std::filesystem::resize_file(file, 16); };
    EXPECT_THROW(plugin()._isTrailer(package), ArchiveError);
}

TEST_F(ProjectDocument, OfALargeDocumentOnlyAFewEntriesAreDecoded) {
    platform::Array objects{archivedDictionary({uid(4)}, {uid(5)}), "editInfo",
                            archivedDictionary({uid(6)}, {uid(7)}), "trailer", "Adventure"};
    for (int i = 0; i < 20000; ++i)
        objects.push_back(archivedUnknown());
    int asked = 0;
    class Counting : public ExposedPlugin {
      public:
        Counting(vexo::VXBundleRef bundle, int& count) : ExposedPlugin(std::move(bundle)), count_(count) {}
        platform::ArchivedClass cannotDecodeObjectOfClassName(
            platform::KeyedUnarchiver& unarchiver, std::string_view className,
            const std::vector<std::string>& originalClasses) override {
            ++count_;
            return ExposedPlugin::cannotDecodeObjectOfClassName(unarchiver, className, originalClasses);
        }

      private:
        int& count_;
    };
    const auto counting = std::make_shared<Counting>(environment.bundle, asked);
    counting->init();
    write(archiveOf(objects));
    EXPECT_TRUE(counting->_isTrailer(package));
    EXPECT_EQ(asked, 0);
}

// --- At the host's boundary --------------------------------------------------------------------------------

class BrokenDocument : public ProjectsTest {
  protected:
    const std::string library = home().makeFolder("Movies/Reelix Projects");

    BrokenDocument() {
        makeProject("Movies/Reelix Projects/Before.qnproject", {"b.mov"});
        makeProject("Movies/Reelix Projects/Broken.qnproject", {"x.mov"});
        makeProject("Movies/Reelix Projects/Later.qnproject", {"l.mov"});
        home().writeFile("Movies/Reelix Projects/Later.qnproject/Project", trailerDocument());
    }
    std::string breakWith(std::string_view content) {
        return home().writeFile("Movies/Reelix Projects/Broken.qnproject/Project", content);
    }
    // Loads as the host does; the block of the load thread runs on this one.
    void loadByTheHost() {
        plugin().loadData();
        environment.dispatcher.runDueBlocks();
    }
    Strings childNames() {
        const Group root = plugin().rootMediaGroup();
        return root ? namesOf(root->childGroups()) : Strings{"<no tree>"};
    }
};

TEST_F(BrokenDocument, ItsErrorLeavesTheScan) {
    breakWith("garbage");
    EXPECT_THROW(scan(library), ArchiveError);
}

TEST_F(BrokenDocument, TheScanLeavesTheMonitorFree) {
    breakWith("garbage");
    setSearchPaths({library});
    EXPECT_THROW(plugin()._reloadReelixProjects(false), ArchiveError);
    EXPECT_THROW(plugin()._reloadReelixProjects(), ArchiveError);
    EXPECT_THROW(plugin().performLoadData(), ArchiveError);

    // A monitor still held by this thread would keep another one waiting for ever.
    std::size_t groups = 0;
    std::thread other([&] { groups = plugin().mediaGroups().size(); });
    other.join();
    EXPECT_EQ(groups, 2u);  // those scanned until the error
    EXPECT_FALSE(plugin()._poolingProjectsReload);
    EXPECT_EQ(plugin().rootMediaGroup(), nullptr);
}

TEST_F(BrokenDocument, TheRestOfTheLibraryAppearsWithOneWarningNamingTheFile) {
    const std::string broken = breakWith(sample("truncated"));
    loadByTheHost();
    EXPECT_THAT(childNames(), ElementsAre("Before", "Broken", "Later"));
    ASSERT_EQ(environment.diagnostics.warnings().size(), 1u);
    EXPECT_THAT(environment.diagnostics.warnings().front(), HasSubstr(broken));
}

TEST_F(BrokenDocument, ARootThatIsNoDictionaryOrOfAnUnknownClassIsWarnedOfAlike) {
    for (const std::string& content : {sample("root-is-text"), archiveOf({archivedUnknown()}),
                                       archiveOf({archivedDictionary({uid(4)}, {uid(4)}), "editInfo"})}) {
        dropPlugin();
        const std::size_t before = environment.diagnostics.warnings().size();
        const std::string broken = breakWith(content);
        loadByTheHost();
        EXPECT_THAT(childNames(), ElementsAre("Before", "Broken", "Later"));
        const auto warnings = environment.diagnostics.warnings();
        EXPECT_LE(warnings.size(), before + 1);
        ASSERT_FALSE(warnings.empty());
        EXPECT_THAT(warnings.back(), HasSubstr(broken));
    }
}

TEST_F(BrokenDocument, ItStandsForAProjectThatIsNoTrailer) {
    breakWith("garbage");
    loadByTheHost();
    const auto children = plugin().rootMediaGroup()->childGroups();
    ASSERT_EQ(children.size(), 3u);
    EXPECT_EQ(children[1]->icon(), reelix::iconCache().projectIcon.get());
    EXPECT_EQ(children[2]->icon(), reelix::iconCache().trailerIcon.get());
    EXPECT_THAT(inHome(idsOf(plugin().rootMediaGroup()->mediaObjects())),
                ElementsAre("home/Movies/Reelix Projects/Before.qnproject/Movies/b.mov",
                            "home/Movies/Reelix Projects/Broken.qnproject/Movies/x.mov",
                            "home/Movies/Reelix Projects/Later.qnproject/Movies/l.mov"));
}

TEST_F(BrokenDocument, EachOfSeveralIsWarnedOf) {
    breakWith("garbage");
    home().writeFile("Movies/Reelix Projects/Before.qnproject/Project", "garbage");
    loadByTheHost();
    EXPECT_THAT(childNames(), ElementsAre("Before", "Broken", "Later"));
    EXPECT_THAT(environment.diagnostics.warnings(),
                ElementsAre(HasSubstr("/Before.qnproject/Project"), HasSubstr("/Broken.qnproject/Project")));
}

TEST_F(BrokenDocument, ALaterReloadWarnsOfItAndShowsTheRest) {
    loadByTheHost();
    EXPECT_THAT(environment.diagnostics.warnings(), IsEmpty());
    const std::string broken = breakWith("garbage");
    makeProject("Movies/Reelix Projects/Added.qnproject");
    EXPECT_TRUE(vexo::runGuarded([&] { plugin()._reloadReelixProjects(); }));
    EXPECT_THAT(childNames(), ElementsAre("Added", "Before", "Broken", "Later"));
    EXPECT_THAT(environment.diagnostics.warnings(), ElementsAre(HasSubstr(broken)));
}

}  // namespace
