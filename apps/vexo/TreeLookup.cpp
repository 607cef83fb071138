#include "apps/vexo/TreeLookup.h"

#include "framework/TreeWalk.h"
#include "platform/Text.h"

namespace vexo {
namespace {

// The first with a name keeps it. An ID is mostly a path and its bytes may be no text: it can be given as it
// is, which no other has, or as it was printed, which others may share.
template <typename Found, typename Thing>
void enter(std::unordered_map<std::string, Found>& names, const std::optional<std::string>& id,
           const Thing& thing, const Found& found) {
    if (id) {
        names.try_emplace(*id, found);
        names.try_emplace(platform::validUTF8(*id), found);
    }
    if (const auto url = thing.URL())
        names.try_emplace(url->absoluteString(), found);
}

template <typename Found>
const Found* find(const std::unordered_map<std::string, Found>& names, const std::string& id) {
    const auto found = names.find(id);
    return found != names.end() ? &found->second : nullptr;
}

}  // namespace

TreeLookup::TreeLookup(const Host& host) {
    for (const LoadedPlugin& plugin : host.plugins()) {
        const VXMediaGroupRef root = plugin.manager->rootMediaGroup();
        if (!root)
            continue;
        visitGroups(root, [&](const VXMediaGroupRef& group) {
            addGroup({plugin.manager, group});
            return true;
        });
    }
}

// A group without items of its own reports those of its children, which are entered there.
void TreeLookup::addGroup(const FoundGroup& found) {
    const VXMediaGroup& group = *found.mediaGroup;
    enter(groups_, group.ID(), group, found);
    for (const VXMediaObjectRef& mediaObject : group.ownMediaObjects().value_or(VXMediaObjectList()))
        addObject({found.manager, mediaObject, found.mediaGroup});
}

void TreeLookup::addObject(const FoundObject& found) {
    enter(objects_, found.mediaObject->ID(), *found.mediaObject, found);
}

const FoundObject* TreeLookup::objectWithID(const std::string& id) const {
    return find(objects_, id);
}

const FoundGroup* TreeLookup::groupWithID(const std::string& id) const {
    return find(groups_, id);
}

std::string TreeLookup::noObjectProblem(const std::string& id) {
    return "there is no item with the ID or URL '" + id + "'; 'vexo tree --json' prints those there are";
}

std::string TreeLookup::noGroupProblem(const std::string& id) {
    return "there is no group with the ID or URL '" + id + "'; 'vexo tree --json' prints those there are";
}

}  // namespace vexo
