// A tree as text that is the same for two trees which ought to be the same.
//
// Left out is what a tree's history decides: icons and attributes of items, because an item that a reload
// finds by its ID stays what it was, and the order right below the root, where a reload sorts and a first
// load does not.
#pragma once

#include <string>
#include <vector>

#include "host/VXMediaGroup.h"

namespace soak {

using TreePicture = std::vector<std::string>;  // lines

TreePicture pictureOf(const vexo::VXMediaGroupRef& root);

// The lines that only one of them has, the first few, and how many there are; empty where there are none.
std::string difference(const TreePicture& seen, const TreePicture& expected);

}  // namespace soak
