// The documents inside the project packages of a sample home.
#pragma once

#include <cstddef>
#include <vector>

#include "apps/vexo/DemoContents.h"

namespace vexo {

// A whole document as the editor would write it: what a browser reads of it, and what only the editor
// understands (objects of its own classes, shared between several places and referring back to their owner).
std::vector<std::byte> demoDocument(const DemoProject& project);

}  // namespace vexo
