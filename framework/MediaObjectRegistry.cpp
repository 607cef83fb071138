#include "framework/MediaObjectRegistry.h"

#include <utility>

#include "framework/TreeWalk.h"

namespace vexo {

namespace {

std::vector<VXMediaObjectList> listsOfTree(const VXMediaGroupRef& root) {
    std::vector<VXMediaObjectList> lists;
    if (!root)
        return lists;
    visitGroups(root, [&lists](const VXMediaGroupRef& group) {
        if (auto own = group->ownMediaObjects(); own && !own->empty())
            lists.push_back(std::move(*own));
        return true;
    });
    return lists;
}

}  // namespace

void MediaObjectRegistry::setTree(const VXMediaGroupRef& root) {
    std::vector<VXMediaObjectList> lists = listsOfTree(root);
    Table table;  // what is replaced is freed outside the lock: it may be large
    platform::Locked lock(mutex_);
    lists_.swap(lists);
    table_.swap(table);
}

VXMediaObjectRef MediaObjectRegistry::objectForID(const std::string& ID) {
    platform::Locked lock(mutex_);
    makeTable();
    const auto found = table_.find(ID);
    return found == table_.end() ? nullptr : found->second;
}

void MediaObjectRegistry::makeTable() {
    for (const VXMediaObjectList& mediaObjects : lists_) {
        if (table_.empty())
            table_.reserve(mediaObjects.size());  // a root lists nearly all items of its tree
        for (const VXMediaObjectRef& mediaObject : mediaObjects)
            table_.try_emplace(mediaObject->ID(), mediaObject);
    }
    lists_.clear();
}

}  // namespace vexo
