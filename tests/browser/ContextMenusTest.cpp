// The menus of items and groups, and what choosing an entry does.
#include "tests/support/PluginTest.h"

namespace {

using namespace testing_support;
using testing::ElementsAre;
using testing::IsEmpty;
using vexo::VXMediaGroupRef;
using vexo::VXMediaObjectRef;

// The titles and the actions of a menu's entries.
std::vector<std::string> entriesOf(const platform::Menu& menu) {
    std::vector<std::string> entries;
    for (const platform::MenuItem& item : menu.items)
        entries.push_back(item.title + " → " + item.action);
    return entries;
}

class ContextMenus : public PluginTest {
  protected:
    ContextMenus() {
        environment.notifications.addObserver(
            observer_, vexo::willOpenOrRevealInSourceNotification,
            [this](const platform::Notification& notification) {
                senders.push_back(notification.object);
                userInfos.push_back(notification.userInfo);
                requestsWhenPosted.push_back(environment.workspace.requests().size());
            });
    }

    VXMediaObjectRef item(const std::string& path = "/movies/a.mov") {
        auto mediaObject = plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, "a", "id of a");
        if (!path.empty())
            mediaObject->setPath(path);
        return mediaObject;
    }
    VXMediaGroupRef group(const vexo::VXGroupTypeIdentifier& type = vexo::VXReelixEventGroupTypeIdentifier) {
        return plugin().newMediaGroupWithTypeIdentifier(type, "id of a group");
    }
    VXMediaGroupRef root() {
        const VXMediaGroupRef made = group(vexo::VXReelixRootGroupTypeIdentifier);
        plugin().setRootMediaGroup(made);
        return made;
    }
    std::shared_ptr<platform::Menu> menuOf(const VXMediaObjectRef& mediaObject) {
        return plugin().contextMenuForMediaObject(mediaObject, nullptr);
    }
    std::shared_ptr<platform::Menu> menuOf(const VXMediaGroupRef& mediaGroup) {
        return plugin().contextMenuForMediaGroup(mediaGroup);
    }
    static void choose(const platform::Menu& menu, std::size_t number) {
        const platform::MenuItem& entry = menu.items.at(number - 1);
        entry.perform(entry);
    }
    void install(const std::string& identifier) {
        environment.workspace.setPathForIdentifier(identifier, "/opt/" + identifier);
    }
    void takeText(const std::string& key) {
        environment.bundle->replacedStrings.insert_or_assign(key, std::nullopt);
    }
    std::vector<std::string> requests() const { return environment.workspace.requests(); }

    std::vector<const void*> senders;
    std::vector<platform::Dictionary> userInfos;
    std::vector<std::size_t> requestsWhenPosted;

  private:
    const std::shared_ptr<int> observer_ = std::make_shared<int>();
};

TEST_F(ContextMenus, AnItemIsOpenedOrRevealed) {
    const VXMediaObjectRef mediaObject = item();
    const auto menu = menuOf(mediaObject);
    ASSERT_TRUE(menu);
    EXPECT_EQ(menu->title, "Object Context Menu");
    EXPECT_FALSE(menu->autoenablesItems);
    EXPECT_THAT(entriesOf(*menu),
                ElementsAre("Open in Reelix → contextMenuOpen:", "Show in Files → contextMenuReveal:"));
    for (const platform::MenuItem& entry : menu->items) {
        EXPECT_EQ(entry.keyEquivalent, "");
        EXPECT_TRUE(entry.enabled);
        EXPECT_EQ(entry.representedObject, mediaObject);
    }
}

TEST_F(ContextMenus, AGroupIsOpened) {
    const VXMediaGroupRef mediaGroup = group();
    const auto menu = menuOf(mediaGroup);
    ASSERT_TRUE(menu);
    EXPECT_EQ(menu->title, "Group Context Menu");
    EXPECT_FALSE(menu->autoenablesItems);
    EXPECT_THAT(entriesOf(*menu), ElementsAre("Open in Reelix → contextMenuOpen:"));
    EXPECT_EQ(menu->items[0].keyEquivalent, "");
    EXPECT_TRUE(menu->items[0].enabled);
    EXPECT_EQ(menu->items[0].representedObject, mediaGroup);
}

TEST_F(ContextMenus, NothingHasNoMenu) {
    EXPECT_EQ(menuOf(VXMediaObjectRef()), nullptr);
    EXPECT_EQ(menuOf(VXMediaGroupRef()), nullptr);
}

TEST_F(ContextMenus, TheRootOpensTheApplicationItself) {
    EXPECT_THAT(entriesOf(*menuOf(root())), ElementsAre("Open Reelix → contextMenuOpen:"));
}

TEST_F(ContextMenus, TheRootIsThatVeryObject) {
    const VXMediaGroupRef installed = root();
    EXPECT_THAT(entriesOf(*menuOf(installed->copy())), ElementsAre("Open in Reelix → contextMenuOpen:"));
    root();  // takes the other's place
    EXPECT_THAT(entriesOf(*menuOf(installed)), ElementsAre("Open in Reelix → contextMenuOpen:"));
}

TEST_F(ContextMenus, AnOldProjectLibraryHasAnEmptyMenu) {
    const auto menu = menuOf(group(vexo::VXReelixOldReelixProjectsGroupTypeIdentifier));
    ASSERT_TRUE(menu);
    EXPECT_EQ(menu->title, "Group Context Menu");
    EXPECT_FALSE(menu->autoenablesItems);
    EXPECT_THAT(menu->items, IsEmpty());
}

TEST_F(ContextMenus, ACopyOfTheTextIsAnotherTypeThanThatOfOldProjects) {
    static const vexo::VXGroupTypeIdentifier copy(vexo::VXReelixOldReelixProjectsGroupTypeIdentifier.text());
    EXPECT_THAT(entriesOf(*menuOf(group(copy))), ElementsAre("Open in Reelix → contextMenuOpen:"));
}

TEST_F(ContextMenus, ARootOfOldProjectsIsARootFirst) {
    const VXMediaGroupRef old = group(vexo::VXReelixOldReelixProjectsGroupTypeIdentifier);
    plugin().setRootMediaGroup(old);
    EXPECT_THAT(entriesOf(*menuOf(old)), ElementsAre("Open Reelix → contextMenuOpen:"));
}

TEST_F(ContextMenus, AMissingTitleLeavesOutItsOwnEntryAlone) {
    takeText("OpenInReelix");
    EXPECT_THAT(entriesOf(*menuOf(item())), ElementsAre("Show in Files → contextMenuReveal:"));
    EXPECT_THAT(entriesOf(*menuOf(group())), IsEmpty());
    EXPECT_THAT(entriesOf(*menuOf(root())), ElementsAre("Open Reelix → contextMenuOpen:"));
    takeText("RevealInFinder");
    EXPECT_THAT(entriesOf(*menuOf(item())), IsEmpty());
    takeText("OpenReelix");
    EXPECT_THAT(entriesOf(*menuOf(root())), IsEmpty());
}

TEST_F(ContextMenus, EachCallMakesAMenuOfItsOwn) {
    const VXMediaObjectRef mediaObject = item();
    EXPECT_NE(menuOf(mediaObject), menuOf(mediaObject));
}

TEST_F(ContextMenus, OpeningLaunchesTheNewestThatIsInstalled) {
    const auto menu = menuOf(item());
    install("com.norvale.Reelix7");
    choose(*menu, 1);
    install("com.norvale.Reelix8");
    choose(*menu, 1);
    install("com.norvale.ReelixApp");
    choose(*menu, 1);
    EXPECT_THAT(requests(),
                ElementsAre("launch com.norvale.Reelix7 65536", "launch com.norvale.Reelix8 65536",
                            "launch com.norvale.ReelixApp 65536"));
}

TEST_F(ContextMenus, AGroupsEntryOpensAsWell) {
    install("com.norvale.ReelixApp");
    choose(*menuOf(group()), 1);
    choose(*menuOf(root()), 1);
    EXPECT_THAT(requests(),
                ElementsAre("launch com.norvale.ReelixApp 65536", "launch com.norvale.ReelixApp 65536"));
}

TEST_F(ContextMenus, OpeningWithoutAnApplicationDoesNothing) {
    choose(*menuOf(item()), 1);
    EXPECT_THAT(requests(), IsEmpty());
    EXPECT_THAT(senders, IsEmpty());
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(ContextMenus, RevealingSelectsTheFile) {
    choose(*menuOf(item("/movies/ä \xff.mov")), 2);
    EXPECT_THAT(requests(), ElementsAre("select /movies/ä \xff.mov in ''"));
}

TEST_F(ContextMenus, TheFileThatIsRevealedIsWhereOtherProgramsSeeIt) {
    environment.mounts.list = {{"/media/card", "/dev/sdb1", "vfat", "CARD", true}};
    choose(*menuOf(item("/Volumes/CARD/a.mov")), 2);
    EXPECT_THAT(requests(), ElementsAre("select /media/card/a.mov in ''"));
}

TEST_F(ContextMenus, RevealingWithoutAPathDoesNothing) {
    choose(*menuOf(item("")), 2);
    choose(*menuOf(item("/Volumes/Gone/a.mov")), 2);
    EXPECT_THAT(requests(), IsEmpty());
    EXPECT_THAT(senders, IsEmpty());
}

TEST_F(ContextMenus, ThePluginTellsBeforeItActs) {
    install("com.norvale.ReelixApp");
    choose(*menuOf(item()), 1);
    choose(*menuOf(item()), 2);
    const void* const sender = static_cast<vexo::VXMediaManager*>(&plugin());
    EXPECT_THAT(senders, ElementsAre(sender, sender));
    EXPECT_THAT(requestsWhenPosted, ElementsAre(0u, 1u));
    EXPECT_THAT(userInfos, ElementsAre(IsEmpty(), IsEmpty()));
    EXPECT_EQ(vexo::willOpenOrRevealInSourceNotification, "willOpenOrRevealInSourceNotification");
}

TEST_F(ContextMenus, ChoosingAfterThePluginIsGoneDoesNothing) {
    install("com.norvale.ReelixApp");
    const auto menu = menuOf(item());
    dropPlugin();
    choose(*menu, 1);
    choose(*menu, 2);
    EXPECT_THAT(requests(), IsEmpty());
    EXPECT_THAT(senders, IsEmpty());
}

}  // namespace
