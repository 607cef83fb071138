// Finds the groups and items of loaded trees by what `tree --json` prints of them: their ID or their URL.
//
// Holds what the trees were when it was made. Belongs to one thread.
#pragma once

#include <string>
#include <unordered_map>

#include "framework/Host.h"

namespace vexo {

struct FoundObject {
    std::shared_ptr<VXMediaManager> manager;  // whose tree it is in; never nil
    VXMediaObjectRef mediaObject;             // never nil
    VXMediaGroupRef mediaGroup;               // that holds it; never nil
};

struct FoundGroup {
    std::shared_ptr<VXMediaManager> manager;  // whose tree it is in; never nil
    VXMediaGroupRef mediaGroup;               // never nil
};

class TreeLookup {
  public:
    // Requires: the trees are loaded.
    explicit TreeLookup(const Host& host);

    // The first in tree order, a group's own items before its children; nil when there is none. Valid while
    // the lookup lives.
    const FoundObject* objectWithID(const std::string& id) const;
    const FoundGroup* groupWithID(const std::string& id) const;

    // What to say where there is none.
    static std::string noObjectProblem(const std::string& id);
    static std::string noGroupProblem(const std::string& id);

  private:
    void addGroup(const FoundGroup& found);
    void addObject(const FoundObject& found);

    std::unordered_map<std::string, FoundObject> objects_;
    std::unordered_map<std::string, FoundGroup> groups_;
};

}  // namespace vexo
