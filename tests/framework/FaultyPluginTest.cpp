// A host beside whose plug-in others are broken: it says what is wrong and goes on with the healthy one.
#include <elf.h>
#include <gmock/gmock.h>

#include <chrono>
#include <filesystem>

#include "framework/Host.h"
#include "tests/faultyplugin/MadeBundle.h"
#include "tests/support/FileContent.h"

namespace vexo {
namespace {

using namespace std::chrono_literals;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;
using testing_support::BundleParts;
using testing_support::ScopedEnvironment;

class FaultyPluginTest : public testing::Test {
  protected:
    // Makes a host that finds the bundle of the test and, after it, the healthy one.
    void findPlugins() {
        host.emplace(HostOptions{.homeDirectory = home.path()});
        EXPECT_EQ(host->loadPlugins(), std::nullopt);
    }
    std::vector<std::string> identifiers() const {
        std::vector<std::string> identifiers;
        for (const LoadedPlugin& plugin : host->plugins())
            identifiers.push_back(plugin.bundle->identifier());
        return identifiers;
    }
    void makeBundle(const BundleParts& parts) const {
        testing_support::makeBundle(home, "plugins/Faulty.vxplugin", parts);
    }
    std::string moduleForAnotherMachine() const {
        std::string module = testing_support::contentOf(FAULTY_PLUGIN_MODULE);
        module[offsetof(Elf64_Ehdr, e_machine)] ^= 3;  // at the same place in modules of 32 bits
        return home.writeFile("other.so", module);
    }
    // What the host warns of while it finds the plug-ins, with the healthy one at hand.
    std::vector<std::string> warningsOfFinding() {
        findPlugins();
        EXPECT_THAT(identifiers(), ElementsAre(healthy));
        return host->diagnostics().warnings();
    }

    const testing_support::TemporaryFolder home;
    const std::string healthy = "com.vexo.plugin.reelix";
    const std::string faulty = home.path("plugins/Faulty.vxplugin");
    const ScopedEnvironment cache{"XDG_CACHE_HOME", home.makeFolder("cache").c_str()};
    const ScopedEnvironment data{"XDG_DATA_HOME", home.makeFolder("data").c_str()};
    const ScopedEnvironment path{"VEXO_PLUGIN_PATH", (home.path("plugins") + ":" REELIX_BUNDLE_DIR).c_str()};
    std::optional<Host> host;
};

TEST_F(FaultyPluginTest, WithoutAFaultItIsAPluginLikeOthers) {
    makeBundle({});
    findPlugins();
    EXPECT_THAT(identifiers(), ElementsAre("test.faulty", healthy));
    host->startLoading();
    ASSERT_TRUE(host->waitUntilLoaded(60s));
    for (const LoadedPlugin& plugin : host->plugins())
        EXPECT_NE(plugin.manager->rootMediaGroup(), nullptr) << plugin.bundle->path();
    EXPECT_THAT(host->diagnostics().warnings(), IsEmpty());
}

// Each in a folder of its own: the loader knows a module by its path as long as the process lives.
TEST_F(FaultyPluginTest, BundlesWithoutAPieceAreLeftOut) {
    const std::pair<BundleParts, std::string> broken[] = {
        {{.module = ""}, "' cannot be loaded: it cannot be read: No such file"},
        {{.module = "/etc/passwd"}, "' cannot be loaded: it is no module"},
        {{.module = home.makeFifo("pipe")}, "' cannot be loaded: it cannot be read"},
        {{.module = EMPTY_MODULE}, "' is no plug-in's: it exports no VXPluginPrincipalClass"},
        {{.module = moduleForAnotherMachine()},
         "' cannot be loaded: it was built for another kind of machine"},
        {{.module = UNRESOLVED_MODULE}, "aFunctionThatNoLibraryHas"},
        {{.principalClass = "Nobody"}, "' has no principal class named 'Nobody'"},
    };
    for (const auto& [parts, warning] : broken) {
        const testing_support::TemporaryFolder folder;
        const ScopedEnvironment plugins("VEXO_PLUGIN_PATH", (folder.path() + ":" REELIX_BUNDLE_DIR).c_str());
        const std::string bundle = testing_support::makeBundle(folder, "Faulty.vxplugin", parts);
        EXPECT_THAT(warningsOfFinding(),
                    ElementsAre(AllOf(StartsWith("the code of '" + bundle), HasSubstr(warning))));
        host.reset();
    }
}

TEST_F(FaultyPluginTest, OneForAnotherInterfaceIsLeftOut) {
    makeBundle({.interfaceVersion = 99});
    EXPECT_THAT(warningsOfFinding(),
                ElementsAre(AllOf(HasSubstr(faulty), HasSubstr("built for version 99"))));
}

TEST_F(FaultyPluginTest, OneThatDoesNotWantToBeIsLeftOut) {
    makeBundle({.principalClass = "FaultyPlugin:nil"});
    EXPECT_THAT(warningsOfFinding(), ElementsAre("the plug-in '" + faulty + "' could not be initialised"));
}

TEST_F(FaultyPluginTest, AFolderWithoutADescriptorIsLeftOut) {
    home.makeFolder("plugins/Faulty.vxplugin");
    EXPECT_THAT(warningsOfFinding(), ElementsAre(HasSubstr("'" + faulty + "' is no usable plug-in")));
}

TEST_F(FaultyPluginTest, WhatRaisesWhileItIsMadeIsLeftOut) {
    for (const std::string operation : {"VXPluginPrincipalClass", "constructor", "init"}) {
        makeBundle({.principalClass = "FaultyPlugin:" + operation});
        EXPECT_THAT(warningsOfFinding(), ElementsAre("a plug-in failed: fault in " + operation,
                                                     HasSubstr(faulty + "' could not be initialised")));
        host.reset();
        makeBundle({.principalClass = "FaultyPlugin:" + operation + ":number"});
        EXPECT_THAT(warningsOfFinding(), ElementsAre("a plug-in failed for an unknown reason",
                                                     HasSubstr(faulty + "' could not be initialised")));
        host.reset();
    }
}

TEST_F(FaultyPluginTest, WhatRaisesWhileItLoadsHasNoTreeAndTheOthersHave) {
    for (const std::string operation : {"loadData", "performLoadData"}) {
        makeBundle({.principalClass = "FaultyPlugin:" + operation});
        findPlugins();
        host->startLoading();
        ASSERT_TRUE(host->waitUntilLoaded(60s));
        EXPECT_EQ(host->plugins()[0].manager->rootMediaGroup(), nullptr);
        EXPECT_NE(host->plugins()[1].manager->rootMediaGroup(), nullptr);
        EXPECT_THAT(host->diagnostics().warnings(), ElementsAre("a plug-in failed: fault in " + operation));
        host.reset();
    }
}

// A load that ends without a word would be waited for for ever.
TEST_F(FaultyPluginTest, ALoadEndsWhateverAnObserverOfTheTreeDoes) {
    makeBundle({});
    findPlugins();
    const auto owner = std::make_shared<int>();
    host->plugins()[0].manager->addTreeObserver(
        owner, [](const VXMediaGroupRef&) { throw std::runtime_error("fault in an observer"); });
    host->startLoading();
    EXPECT_TRUE(host->waitUntilLoaded(60s));
    EXPECT_THAT(host->diagnostics().warnings(), ElementsAre("a plug-in failed: fault in an observer"));
}

TEST_F(FaultyPluginTest, BrokenTextsAreAWarningAndThePluginIsThere) {
    for (const std::string strings : {"", "no key file", "[Strings]\nName=\xff\n"}) {
        makeBundle({.strings = strings});
        findPlugins();
        EXPECT_THAT(identifiers(), ElementsAre("test.faulty", healthy));
        EXPECT_THAT(host->diagnostics().warnings(),
                    ElementsAre(HasSubstr(faulty + "/Contents/Resources/Strings.ini: ")));
        EXPECT_EQ(host->plugins()[0].manager->localizedString("Name"), std::nullopt);
        host.reset();
    }
}

TEST_F(FaultyPluginTest, ABrokenIconIsNoneAndHarmsNobody) {
    makeBundle({});
    const std::string icons = "plugins/Faulty.vxplugin/Contents/Resources/Icons/";
    home.writeFile(icons + "text.svg", "no picture");
    home.writeFile(icons + "cut.svg", "<svg xmlns='http://www.w3.org/2000/svg' width='16' height='16'");
    home.writeFile(icons + "empty.svg");
    home.makeFifo(icons + "pipe.svg");
    home.makeFolder(icons + "folder.svg");
    home.makeLink(icons + "device.svg", "/dev/zero");
    findPlugins();
    const VXMediaManager& manager = *host->plugins()[0].manager;
    for (const char* name : {"text", "cut", "empty", "pipe", "folder", "device", "missing", "", ".."}) {
        const auto icon = manager.iconNamed(name);
        EXPECT_TRUE(!icon || !icon->isValid()) << name;
    }
}

// Within what is loaded, however much information for debugging lies behind that.
TEST_F(FaultyPluginTest, AModuleThatWasCutOffIsLeftOut) {
    const std::string whole = testing_support::contentOf(FAULTY_PLUGIN_MODULE);
    makeBundle({.module = home.writeFile("cut.so", whole.substr(0, 4096))});
    EXPECT_THAT(warningsOfFinding(), ElementsAre(HasSubstr("it is cut off or damaged")));
}

TEST_F(FaultyPluginTest, AFolderOfThePathThatIsNoneHoldsNoPlugins) {
    home.makeFifo("pipe");
    home.writeFile("file.vxplugin");
    home.makeLink("loop", home.path("loop"));
    const std::string folders = "::relative:" + home.path("pipe") + ":" + home.path("loop") + ":" +
                                home.path("missing") + ":/dev/null:" + std::string(5000, 'x') +
                                ":" REELIX_BUNDLE_DIR ":";
    const ScopedEnvironment oddPath("VEXO_PLUGIN_PATH", folders.c_str());
    for (const std::string& warning : warningsOfFinding())
        EXPECT_THAT(warning, StartsWith("cannot "));
}

// The current folder is anybody's.
TEST_F(FaultyPluginTest, ARelativeDataFolderHoldsNoPlugins) {
    testing_support::makeBundle(home, "current/data/vexo/plugins/Faulty.vxplugin", {});
    const ScopedEnvironment relative("XDG_DATA_HOME", "data");
    const ScopedEnvironment noHome("HOME", home.makeFolder("nothing").c_str());
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::current_path(home.path("current"));
    EXPECT_THAT(warningsOfFinding(), IsEmpty());
    std::filesystem::current_path(before);
}

}  // namespace
}  // namespace vexo
