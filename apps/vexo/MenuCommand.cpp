#include <fmt/format.h>

#include <variant>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/MainLoop.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"
#include "apps/vexo/TreeLookup.h"
#include "framework/GuardedWork.h"
#include "platform/Services.h"
#include "platform/ThreadSafety.h"
#include "platform/Workspace.h"

namespace vexo {
namespace {

using platform::Locked;
using platform::Menu;
using platform::MenuItem;

using MenuRef = std::shared_ptr<Menu>;  // nil where the plug-in has none

// The menu of an item or a group.
struct AskedMenu {
    MenuRef menu;
    std::shared_ptr<const void> askedFor;
    std::optional<std::string> id;
};

constexpr const char* noAnswer = "the plug-in could not say what can be done";

std::variant<AskedMenu, std::string> menuOfObject(const TreeLookup& lookup, const std::string& id) {
    const FoundObject* const found = lookup.objectWithID(id);
    if (!found)
        return TreeLookup::noObjectProblem(id);
    MenuRef menu;
    const bool isAnswered = runGuarded(
        [&] { menu = found->manager->contextMenuForMediaObject(found->mediaObject, found->mediaGroup); });
    if (!isAnswered)
        return noAnswer;
    return AskedMenu{std::move(menu), found->mediaObject, found->mediaObject->ID()};
}

std::variant<AskedMenu, std::string> menuOfGroup(const TreeLookup& lookup, const std::string& id) {
    const FoundGroup* const found = lookup.groupWithID(id);
    if (!found)
        return TreeLookup::noGroupProblem(id);
    MenuRef menu;
    const bool isAnswered =
        runGuarded([&] { menu = found->manager->contextMenuForMediaGroup(found->mediaGroup); });
    if (!isAnswered)
        return noAnswer;
    return AskedMenu{std::move(menu), found->mediaGroup, found->mediaGroup->ID()};
}

Json jsonItem(const MenuItem& item, const AskedMenu& asked) {
    return {{"title", jsonText(item.title)},
            {"action", jsonText(item.action)},
            {"keyEquivalent", jsonText(item.keyEquivalent)},
            {"enabled", item.enabled},
            {"representedObject", item.representedObject == asked.askedFor ? jsonText(asked.id) : Json()}};
}

Json jsonMenu(const AskedMenu& asked) {
    if (!asked.menu)
        return {};
    Json items = Json::array();
    for (const MenuItem& item : asked.menu->items)
        items.push_back(jsonItem(item, asked));
    return {{"title", jsonText(asked.menu->title)},
            {"autoenablesItems", asked.menu->autoenablesItems},
            {"items", items}};
}

void printText(const AskedMenu& asked, std::ostream& out) {
    if (!asked.menu) {
        out << "(no menu)\n";
        return;
    }
    const OutputStyle style = OutputStyle::ofStandardOutput();
    out << style.bold(printable(asked.menu->title)) << "\n";
    if (asked.menu->items.empty())
        out << "  (no entries)\n";
    for (std::size_t i = 0; i < asked.menu->items.size(); ++i)
        out << fmt::format("{:3}  {}\n", i + 1, printable(asked.menu->items[i].title));
}

// What becomes of an action, which itself tells nothing. Told on any thread.
class ActionOutcome {
  public:
    void noteThatItActs() {
        Locked lock(mutex_);
        acted_ = true;
    }
    void noteFailure(const platform::Notification& notification) {
        const platform::Value* const problem = platform::find(notification.userInfo, "problem");
        Locked lock(mutex_);
        failures_.push_back(problem && problem->string() ? *problem->string() : notification.name);
    }
    bool acted() const {
        Locked lock(mutex_);
        return acted_;
    }
    Problems failures() const {
        Locked lock(mutex_);
        return failures_;
    }

  private:
    mutable platform::Mutex mutex_;
    bool acted_ VX_GUARDED_BY(mutex_) = false;
    Problems failures_ VX_GUARDED_BY(mutex_);
};

std::shared_ptr<ActionOutcome> observedOutcome() {
    auto outcome = std::make_shared<ActionOutcome>();
    const platform::Services& services = platform::services();
    services.notificationCenter.addObserver(
        outcome, willOpenOrRevealInSourceNotification,
        [&told = *outcome](const platform::Notification&) { told.noteThatItActs(); });
    services.workspace.notificationCenter().addObserver(
        outcome, platform::VXWorkspaceDidFailNotification,
        [&told = *outcome](const platform::Notification& notification) { told.noteFailure(notification); });
    return outcome;
}

// Why an action does nothing, and what there is to do about it.
std::string reasonForNothing(const MenuItem& item) {
    if (item.action == "contextMenuOpen:")
        return "no application for it is installed; install it, or see ENVIRONMENT in 'man vexo'";
    if (item.action == "contextMenuReveal:")
        return "where its file is is not known; see whether its volume is mounted";
    return "there was nothing to do";
}

Problems perform(const MenuItem& item) {
    const auto outcome = observedOutcome();
    if (!runGuardedOnce([&] { item.perform(item); }))
        return {"'" + item.title + "' failed"};
    MainLoop().runPending();
    platform::services().workspace.waitUntilLaunched();
    if (!outcome->acted())
        return {"'" + item.title + "' did nothing: " + reasonForNothing(item)};
    return outcome->failures();
}

Problems performEntry(const AskedMenu& asked, int number) {
    const int count = asked.menu ? static_cast<int>(asked.menu->items.size()) : 0;
    if (number < 1 || number > count)
        return {fmt::format("the menu has no such entry; it has {}", count)};
    return perform(asked.menu->items[static_cast<std::size_t>(number - 1)]);
}

}  // namespace

Problems runMenu(Host& host, const MenuOptions& options, std::ostream& out) {
    loadWithProgress(host);
    const TreeLookup lookup(host);
    const auto result = options.object ? menuOfObject(lookup, *options.object)
                                       : menuOfGroup(lookup, options.group.value_or(""));
    if (const std::string* const problem = std::get_if<std::string>(&result))
        return {*problem};
    const AskedMenu& asked = std::get<AskedMenu>(result);
    if (options.chosenEntry)
        return performEntry(asked, *options.chosenEntry);
    if (options.format == OutputFormat::json)
        out << jsonMenu(asked).dump(2) << "\n";
    else
        printText(asked, out);
    return {};
}

}  // namespace vexo
