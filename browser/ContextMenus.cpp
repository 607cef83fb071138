// The menus of items and groups, and what their entries do.
#include "core/VXReelixPlugin.h"
#include "platform/Notification.h"
#include "platform/Services.h"
#include "platform/Workspace.h"

namespace reelix {
namespace {

// The newest first.
constexpr const char* applicationIdentifiers[] = {"com.norvale.ReelixApp", "com.norvale.Reelix8",
                                                  "com.norvale.Reelix7"};

// Every item stays enabled: an action that can do nothing does nothing.
std::shared_ptr<platform::Menu> newMenu(const char* title) {
    auto menu = std::make_shared<platform::Menu>();
    menu->title = title;
    menu->autoenablesItems = false;
    return menu;
}

using Action = void (VXReelixPlugin::*)(const platform::MenuItem& sender);

// A plug-in that is gone by the time an item is chosen is sent nothing.
std::function<void(const platform::MenuItem&)> sending(Action action, std::weak_ptr<VXReelixPlugin> target) {
    return [action, target](const platform::MenuItem& sender) {
        if (const auto plugin = target.lock())
            (plugin.get()->*action)(sender);
    };
}

struct NamedAction {
    const char* name;
    Action action;
};
constexpr NamedAction openAction{"contextMenuOpen:", &VXReelixPlugin::contextMenuOpen};
constexpr NamedAction revealAction{"contextMenuReveal:", &VXReelixPlugin::contextMenuReveal};

// A missing title leaves out its own item alone.
void addItem(platform::Menu& menu, const std::optional<std::string>& title, const NamedAction& action,
             std::shared_ptr<const void> representedObject, std::weak_ptr<VXReelixPlugin> target) {
    if (!title)
        return;
    menu.items.push_back({.title = *title,
                          .action = action.name,
                          .keyEquivalent = "",
                          .representedObject = std::move(representedObject),
                          .perform = sending(action.action, std::move(target))});
}

// Observers know the sender as what the host made.
void postWillOpenOrReveal(const vexo::VXMediaManager& plugin) {
    platform::services().notificationCenter.post(
        {std::string(vexo::willOpenOrRevealInSourceNotification), &plugin});
}

}  // namespace

std::shared_ptr<platform::Menu> VXReelixPlugin::contextMenuForMediaObject(const Object& mediaObject,
                                                                          const Group& /*inMediaGroup*/) {
    if (!mediaObject)
        return nullptr;
    auto menu = newMenu("Object Context Menu");
    addItem(*menu, localizedString("OpenInReelix"), openAction, mediaObject, self());
    addItem(*menu, localizedString("RevealInFinder"), revealAction, mediaObject, self());
    return menu;
}

std::shared_ptr<platform::Menu> VXReelixPlugin::contextMenuForMediaGroup(const Group& mediaGroup) {
    if (!mediaGroup)
        return nullptr;
    auto menu = newMenu("Group Context Menu");
    const bool isRoot = mediaGroup == rootMediaGroup();
    if (!isRoot && mediaGroup->typeIdentifier() == vexo::VXReelixOldReelixProjectsGroupTypeIdentifier)
        return menu;
    addItem(*menu, localizedString(isRoot ? "OpenReelix" : "OpenInReelix"), openAction, mediaGroup, self());
    return menu;
}

// Brings the application up. It is not handed what the menu was asked for.
void VXReelixPlugin::contextMenuOpen(const platform::MenuItem& /*sender*/) {
    platform::Workspace& workspace = platform::services().workspace;
    for (const char* identifier : applicationIdentifiers) {
        if (workspace.absolutePathForAppBundleWithIdentifier(identifier).empty())
            continue;
        postWillOpenOrReveal(*this);
        workspace.launchAppWithBundleIdentifier(identifier, platform::NSWorkspaceLaunchAsync);
        return;
    }
}

// Only items have this entry, so an item is what the sender represents.
void VXReelixPlugin::contextMenuReveal(const platform::MenuItem& sender) {
    const auto mediaObject = std::static_pointer_cast<const vexo::VXMediaObject>(sender.representedObject);
    const std::string path = mediaObject ? mediaObject->aliasResolvedPath().value_or("") : "";
    if (path.empty())
        return;
    postWillOpenOrReveal(*this);
    platform::services().workspace.selectFile(path, "");
}

}  // namespace reelix
