// Where libraries lie, and the icons that the plug-in hangs on its groups and items.
#include <set>
#include <thread>

#include "core/VolumeFolders.h"
#include "tests/core/SmallLibrary.h"

namespace reelix {
namespace {

using platform::ImageRef;
using platform::Size;
using testing::ElementsAre;
using testing_support::ExposedPlugin;
using testing_support::newDamagedImage;
using testing_support::newImage;

// --- Default paths -----------------------------------------------------------------------------------------

class DefaultPathsTest : public testing_support::SmallLibraryTest {
  protected:
    using Paths = std::vector<std::optional<std::string>>;

    Paths allPaths() {
        return {plugin()._ReelixDefaultPath(), plugin()._ReelixDefaultPath2(),
                plugin()._oldReelixDefaultPath(), plugin()._ReelixDefaultEventsFolderPath(),
                plugin()._ReelixDefaultEventsFolderPath2()};
    }
    static Paths allPathsIn(const std::string& home) {
        return {home + "/Movies/Reelix Projects", home + "/Movies/Reelix Projects.localized",
                home + "/Movies", home + "/Movies/Reelix Events", home + "/Movies/Reelix Events.localized"};
    }
};

TEST_F(DefaultPathsTest, LieInTheMoviesFolderWhetherTheyExistOrNot) {
    environment.setHomeDirectory("/Users/editor");
    EXPECT_EQ(allPaths(), allPathsIn("/Users/editor"));
}

TEST_F(DefaultPathsTest, AreKeptOnceFound) {
    environment.setHomeDirectory("/Users/editor");
    allPaths();
    environment.setHomeDirectory("/Users/another");
    EXPECT_EQ(allPaths(), allPathsIn("/Users/editor"));
}

TEST_F(DefaultPathsTest, AreNilWithoutAHome) {
    environment.setHomeDirectory(std::nullopt);
    EXPECT_EQ(allPaths(), Paths(5, std::nullopt));
}

TEST_F(DefaultPathsTest, AreFoundByALaterCallWhenThereWasNoHomeAtFirst) {
    environment.setHomeDirectory(std::nullopt);
    allPaths();
    environment.setHomeDirectory("/Users/editor");
    EXPECT_EQ(allPaths(), allPathsIn("/Users/editor"));
}

TEST_F(DefaultPathsTest, AreSharedByAllObjectsOfTheProcess) {
    environment.setHomeDirectory("/Users/editor");
    allPaths();
    environment.setHomeDirectory("/Users/another");
    EXPECT_EQ(newPlugin()->_ReelixDefaultPath(), "/Users/editor/Movies/Reelix Projects");
}

TEST_F(DefaultPathsTest, HaveTheirAliasesResolved) {
    environment.mounts.list = {{home().path(), "/dev/sdb1", "ext4", "Portable", true}};
    environment.setHomeDirectory("/Volumes/Portable");
    EXPECT_EQ(allPaths(), allPathsIn(home().path()));
}

TEST_F(DefaultPathsTest, KeepBytesThatAreNoUTF8) {
    environment.setHomeDirectory("/home/\xff");
    EXPECT_EQ(allPaths(), allPathsIn("/home/\xff"));
}

TEST_F(DefaultPathsTest, OfALibraryThatIsALinkStayTheLinks) {
    home().makeFolder("elsewhere");
    const std::string link = home().makeLink("Movies/Reelix Projects", home().path("elsewhere"));
    EXPECT_EQ(plugin()._ReelixDefaultPath(), link);
}

// --- Folders on volumes ------------------------------------------------------------------------------------

class VolumeFoldersTest : public testing_support::SmallLibraryTest {};

TEST_F(VolumeFoldersTest, OfTheStartUpVolumeAreBothForms) {
    environment.workspace.setVolumes({"/", "/Network"});
    EXPECT_THAT(foldersOnVolumes("Reelix Events"), ElementsAre("/Reelix Events", "/Reelix Events.localized"));
}

// Only where a file system is mounted in truth has a folder a label; "/proc" is such a place on every
// machine.
TEST_F(VolumeFoldersTest, AreNamedAfterDisplayNamesBeforeTheStartUpVolumeAndRemovableMediaAfterIt) {
    const std::string stick = home().makeFolder("mnt/stick");
    environment.mounts.list = {{"/proc", "/dev/sdb1", "ext4", "Archive", false}};
    environment.workspace.setVolumes({"/", "/proc", "/Network", stick});
    environment.workspace.setRemovableMedia({stick, "/"});
    EXPECT_THAT(foldersOnVolumes("Reelix Projects"),
                ElementsAre("/Volumes/Archive/Reelix Projects", "/Volumes/Archive/Reelix Projects.localized",
                            "/Volumes/stick/Reelix Projects", "/Volumes/stick/Reelix Projects.localized",
                            "/Reelix Projects", "/Reelix Projects.localized",                  //
                            stick + "/Reelix Projects", stick + "/Reelix Projects.localized",  //
                            "/Reelix Projects", "/Reelix Projects.localized"));
}

TEST_F(VolumeFoldersTest, OnlyTheWholePathsOfTheStartUpAndNetworkVolumesAreLeftOut) {
    environment.workspace.setVolumes({"/Network/Servers", "/Networking"});
    EXPECT_THAT(
        foldersOnVolumes("Reelix Events"),
        ElementsAre("/Volumes/Servers/Reelix Events", "/Volumes/Servers/Reelix Events.localized",
                    "/Volumes/Networking/Reelix Events", "/Volumes/Networking/Reelix Events.localized",
                    "/Reelix Events", "/Reelix Events.localized"));
}

TEST_F(VolumeFoldersTest, OfAVolumeThatHasGoneAreNamedAfterItsMountPoint) {
    environment.workspace.setVolumes({home().path("gone")});
    EXPECT_EQ(foldersOnVolumes("Reelix Events")[0], "/Volumes/gone/Reelix Events");
}

TEST_F(VolumeFoldersTest, AFolderOnAVolumeIsNamedByTheDisplayNameAsItIs) {
    EXPECT_EQ(folderOnVolume("My Disk.old", "Reelix Events"), "/Volumes/My Disk.old/Reelix Events");
}

// --- Icon slots --------------------------------------------------------------------------------------------

// The bundle of the test, with a record of the icons that were asked for; one icon can be missing at first.
class AskedBundle final : public vexo::VXBundle {
  public:
    explicit AskedBundle(vexo::VXBundleRef bundle) : bundle_(std::move(bundle)) {}
    const std::string& path() const override { return bundle_->path(); }
    const std::string& identifier() const override { return bundle_->identifier(); }
    std::optional<std::string> localizedString(std::string_view key) const override {
        return bundle_->localizedString(key);
    }
    ImageRef iconNamed(std::string_view name) const override {
        const std::size_t question = noteQuestion(name);
        if (onQuestion)
            onQuestion();
        return question == 1 && firstIsMissing ? nullptr : bundle_->iconNamed(name);
    }
    std::vector<std::string> asked() const {
        platform::Locked lock(mutex_);
        return asked_;
    }

    bool firstIsMissing = false;
    std::function<void()> onQuestion;

  private:
    std::size_t noteQuestion(std::string_view name) const {
        platform::Locked lock(mutex_);
        asked_.emplace_back(name);
        return asked_.size();
    }

    const vexo::VXBundleRef bundle_;
    mutable platform::Mutex mutex_;
    mutable std::vector<std::string> asked_ VX_GUARDED_BY(mutex_);
};

class IconsTest : public testing_support::SmallLibraryTest {
  protected:
    struct Slot {
        IconSlot* slot;
        std::string icon;  // the name of its image in the bundle
    };

    // Gives the bundle images of the test's own, each of another size, and answers the one of a name.
    ImageRef replaceIcon(const std::string& name, Size size) {
        return environment.bundle->replacedIcons[name] = newImage(name, size);
    }
    std::vector<Slot> slotsAsLoaded() {
        return {{&icons.calendarIcon, "Reelix-icon-calendar"},
                {&icons.eventIcon, "Reelix-icon-event"},
                {&icons.projectIcon, "Reelix-icon-project"},
                {&icons.trailerIcon, "Reelix-icon-trailer"},
                {&icons.spareProjectIcon, "Reelix-icon-project"},
                {&icons.spareTrailerIcon, "Reelix-icon-trailer"}};
    }
    std::vector<IconSlot*> allSlots() {
        std::vector<IconSlot*> slots{&icons.smallApplicationIcon, &icons.reelixIcon};
        for (const Slot& slot : slotsAsLoaded())
            slots.push_back(slot.slot);
        return slots;
    }

    IconCache& icons = iconCache();
};

TEST_F(IconsTest, AreAskedForInOrderAndOnceEach) {
    const auto bundle = std::make_shared<AskedBundle>(environment.bundle);
    const auto made = std::make_shared<ExposedPlugin>(bundle);
    made->init();
    EXPECT_THAT(bundle->asked(),
                ElementsAre("MBReelixAppIconSmall", "Reelix-icon-calendar", "Reelix-icon-event",
                            "Reelix-icon-project", "Reelix-icon-trailer", "MBReelixIcon"));
}

TEST_F(IconsTest, OfGroupsAreCopiesAtTheirOwnSize) {
    double width = 20;
    for (const Slot& slot : slotsAsLoaded())
        replaceIcon(slot.icon, {width += 10, 40});
    plugin();
    for (const Slot& slot : slotsAsLoaded()) {
        SCOPED_TRACE(slot.icon);
        const ImageRef loaded = environment.bundle->replacedIcons[slot.icon];
        const ImageRef kept = slot.slot->get();
        ASSERT_NE(kept, nullptr);
        EXPECT_NE(kept, loaded);
        EXPECT_EQ(kept->picture(), loaded->picture());
        EXPECT_EQ(kept->name(), slot.icon);
        EXPECT_EQ(kept->size(), loaded->size());
        EXPECT_FALSE(kept->scalesWhenResized());
    }
}

TEST_F(IconsTest, TheTwoSmallOnesAreScaledToSixteenPoints) {
    const ImageRef loaded = replaceIcon("MBReelixIcon", {64, 48});
    plugin();
    const ImageRef reelixIcon = icons.reelixIcon.get();
    EXPECT_EQ(reelixIcon->picture(), loaded->picture());
    EXPECT_EQ(loaded->size(), (Size{64, 48}));
    for (const ImageRef& small : {reelixIcon, icons.smallApplicationIcon.get()}) {
        EXPECT_EQ(small->size(), (Size{16, 16}));
        EXPECT_TRUE(small->scalesWhenResized());
    }
}

TEST_F(IconsTest, AreAllDistinctObjects) {
    plugin();
    std::set<ImageRef> distinct;
    for (const IconSlot* slot : allSlots())
        distinct.insert(slot->get());
    EXPECT_EQ(distinct.size(), 8u);
    EXPECT_FALSE(distinct.contains(nullptr));
    EXPECT_FALSE(distinct.contains(plugin().rootMediaGroupIcon()));
}

TEST_F(IconsTest, OfTheBundleCanAllBeDrawn) {
    plugin();
    for (const IconSlot* slot : allSlots())
        EXPECT_TRUE(slot->get()->isValid());
}

TEST_F(IconsTest, TheSpareOnesShowThePicturesOfTheOthers) {
    plugin();
    EXPECT_EQ(icons.spareProjectIcon.get()->picture(), icons.projectIcon.get()->picture());
    EXPECT_EQ(icons.spareTrailerIcon.get()->picture(), icons.trailerIcon.get()->picture());
}

TEST_F(IconsTest, ThatAreThereStayWhenAnotherObjectIsMade) {
    plugin();
    std::vector<ImageRef> before;
    for (const IconSlot* slot : allSlots())
        before.push_back(slot->get());
    plugin()._grabReelixIcons();
    std::vector<ImageRef> after;
    for (const IconSlot* slot : allSlots())
        after.push_back(slot->get());
    EXPECT_EQ(after, before);
}

TEST_F(IconsTest, ThatCannotBeDrawnAreLoadedAgain) {
    plugin();
    for (const Slot& slot : slotsAsLoaded()) {
        SCOPED_TRACE(slot.icon);
        const ImageRef damaged = newDamagedImage(slot.icon);
        slot.slot->set(damaged);
        plugin()._grabReelixIcons();
        ASSERT_NE(slot.slot->get(), nullptr);
        EXPECT_NE(slot.slot->get(), damaged);
        EXPECT_TRUE(slot.slot->get()->isValid());
    }
}

TEST_F(IconsTest, ThatAreMissingAreLoadedAgain) {
    plugin();
    for (IconSlot* slot : allSlots()) {
        slot->clear();
        plugin()._grabReelixIcons();
        EXPECT_NE(slot->get(), nullptr);
    }
}

TEST_F(IconsTest, TheTwoSmallOnesStayEvenWhenTheyCannotBeDrawn) {
    plugin();
    for (IconSlot* slot : {&icons.smallApplicationIcon, &icons.reelixIcon}) {
        const ImageRef damaged = newDamagedImage("damaged");
        slot->set(damaged);
        plugin()._grabReelixIcons();
        EXPECT_EQ(slot->get(), damaged);
    }
}

TEST_F(IconsTest, ADamagedSpareOneIsCopiedFromTheOtherAndNotLoaded) {
    plugin();
    const ImageRef replaced = newImage("replaced");
    icons.projectIcon.set(replaced);
    icons.spareProjectIcon.set(newDamagedImage("damaged"));
    plugin()._grabReelixIcons();
    EXPECT_EQ(icons.projectIcon.get(), replaced);
    EXPECT_EQ(icons.spareProjectIcon.get()->picture(), replaced->picture());
    EXPECT_NE(icons.spareProjectIcon.get(), replaced);
}

TEST_F(IconsTest, AGoodSpareOneStaysWhenTheOtherIsLoadedAgain) {
    plugin();
    const ImageRef spare = icons.spareTrailerIcon.get();
    icons.trailerIcon.clear();
    plugin()._grabReelixIcons();
    EXPECT_EQ(icons.spareTrailerIcon.get(), spare);
}

TEST_F(IconsTest, ThatTheBundleLacksLeaveTheirSlotsEmptyUntilALaterObjectFindsThem) {
    for (const char* name : {"Reelix-icon-calendar", "Reelix-icon-event", "Reelix-icon-project",
                             "Reelix-icon-trailer", "MBReelixIcon", "MBReelixAppIconSmall"})
        environment.bundle->replacedIcons[name] = nullptr;
    plugin();
    for (const IconSlot* slot : allSlots())
        EXPECT_EQ(slot->get(), nullptr);
    environment.bundle->replacedIcons.clear();
    const auto later = newPlugin();
    for (const IconSlot* slot : allSlots())
        EXPECT_NE(slot->get(), nullptr);
}

TEST_F(IconsTest, TheSmallApplicationIconFallsBackOnACopyThatIsNotResized) {
    const ImageRef loaded = replaceIcon("MBReelixAppIconSmall", {64, 48});
    const auto bundle = std::make_shared<AskedBundle>(environment.bundle);
    bundle->firstIsMissing = true;
    const auto made = std::make_shared<ExposedPlugin>(bundle);
    made->init();
    const ImageRef small = icons.smallApplicationIcon.get();
    ASSERT_NE(small, nullptr);
    EXPECT_NE(small, loaded);
    EXPECT_EQ(small->picture(), loaded->picture());
    EXPECT_EQ(small->size(), (Size{64, 48}));
    EXPECT_FALSE(small->scalesWhenResized());
}

// --- The application icon ----------------------------------------------------------------------------------

TEST_F(IconsTest, WithoutTheApplicationTheRootIconIsTheBundlesAtSixteenPoints) {
    const ImageRef icon = plugin().rootMediaGroupIcon();
    ASSERT_NE(icon, nullptr);
    EXPECT_EQ(icon->name(), "MBReelixAppIconSmall");
    EXPECT_EQ(icon->size(), (Size{16, 16}));
    EXPECT_TRUE(icon->scalesWhenResized());
    EXPECT_EQ(environment.workspace.iconLookups(), 0);
}

TEST_F(IconsTest, TheApplicationsIconIsTheRootIconAtSixteenPoints) {
    installApplication("/opt/reelix/reelix");
    const ImageRef applicationIcon = newImage("reelix", {256, 256});
    environment.workspace.setIcon("com.norvale.ReelixApp", applicationIcon);
    const ImageRef icon = plugin().rootMediaGroupIcon();
    EXPECT_EQ(icon->picture(), applicationIcon->picture());
    EXPECT_EQ(icon->size(), (Size{16, 16}));
    EXPECT_TRUE(icon->scalesWhenResized());

    const ImageRef small = icons.smallApplicationIcon.get();
    EXPECT_EQ(small->picture(), applicationIcon->picture());
    EXPECT_NE(small, icon);
}

TEST_F(IconsTest, AnApplicationWithoutAnIconLeavesTheBundles) {
    installApplication("/opt/reelix/reelix");
    EXPECT_EQ(plugin().rootMediaGroupIcon()->name(), "MBReelixAppIconSmall");
    EXPECT_EQ(environment.workspace.iconLookups(), 1);
}

TEST_F(IconsTest, AnApplicationWithoutAPathIsNotAskedForItsIcon) {
    installApplication(std::nullopt);
    environment.workspace.setIcon("com.norvale.ReelixApp", newImage("reelix"));
    EXPECT_EQ(plugin().rootMediaGroupIcon()->name(), "MBReelixAppIconSmall");
    EXPECT_EQ(environment.workspace.iconLookups(), 0);
}

TEST_F(IconsTest, TheRootIconIsFoundOnceAndKept) {
    const ImageRef icon = plugin().rootMediaGroupIcon();
    EXPECT_EQ(plugin().rootMediaGroupIcon(), icon);
    installApplication("/opt/reelix/reelix");
    EXPECT_EQ(plugin().rootMediaGroupIcon(), icon);
    EXPECT_EQ(environment.workspace.creatorLookups(), 1);
}

TEST_F(IconsTest, WithoutAnySourceThereIsNoRootIconAndTheNextCallTriesAgain) {
    environment.bundle->replacedIcons["MBReelixAppIconSmall"] = nullptr;
    EXPECT_EQ(plugin().rootMediaGroupIcon(), nullptr);
    environment.bundle->replacedIcons.clear();
    EXPECT_NE(plugin().rootMediaGroupIcon(), nullptr);
}

TEST_F(IconsTest, EachObjectHasARootIconOfItsOwn) {
    EXPECT_NE(plugin().rootMediaGroupIcon(), newPlugin()->rootMediaGroupIcon());
}

TEST_F(IconsTest, ManyThreadsGetOneRootIconThatIsLookedForOnce) {
    const auto bundle = std::make_shared<AskedBundle>(environment.bundle);
    bundle->firstIsMissing = true;  // so that making the object finds none
    const auto made = std::make_shared<ExposedPlugin>(bundle);
    made->init();
    const std::size_t before = bundle->asked().size();
    bundle->onQuestion = [&] {
        testing_support::happensSoon([&] { return bundle->asked().size() > before + 1; });
    };

    std::array<ImageRef, 4> found;
    std::vector<std::thread> threads;
    for (ImageRef& icon : found)
        threads.emplace_back([&made, &icon] { icon = made->rootMediaGroupIcon(); });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_NE(found[0], nullptr);
    EXPECT_THAT(found, testing::Each(found[0]));
    EXPECT_EQ(bundle->asked().size(), before + 1);
}

}  // namespace
}  // namespace reelix
