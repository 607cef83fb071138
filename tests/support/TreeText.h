// A tree of groups and items as one literal text, for comparing whole trees.
#pragma once

#include <string>

#include "host/VXMediaGroup.h"

namespace testing_support {

// A line for each group and item, indented by two blanks a level; a group's own items before its children:
//
//     Root VXReelix "Reelix" <none> icon=MBReelixAppIconSmall
//       * /home/Movies/…/a.mov "Movie"
//       Event /home/…/Beach "Beach" </home/…> icon=Reelix-icon-event year=2008
//
// that is: type, ID, name, parent ID, icon and year. "home" is written for `homePath`.
std::string treeText(const vexo::VXMediaGroupRef& root, const std::string& homePath);

}  // namespace testing_support
