// A menu as data, for any toolkit to show. Belongs to the main thread.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace platform {

struct MenuItem {
    std::string title;
    std::string action;         // the name of the operation, "contextMenuOpen:"
    std::string keyEquivalent;  // empty for none
    bool enabled = true;
    std::shared_ptr<const void> representedObject;        // what the menu was asked for
    std::function<void(const MenuItem& sender)> perform;  // sends the action to its target
};

struct Menu {
    std::string title;
    bool autoenablesItems = true;
    std::vector<MenuItem> items;
};

}  // namespace platform
