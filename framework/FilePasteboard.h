// What the host itself says of dragged or copied things, for programs that know nothing of its plug-ins: the
// files they stand for, in the types of the desktop's file managers.
//
// Paths are those that other programs know, never names below /Volumes. A file is named once, where it comes
// first. Belongs to the pasteboard's thread.
#pragma once

#include <string>
#include <vector>

#include "host/VXMediaManager.h"

namespace vexo {

// An item stands for its file; one without a path, or whose volume is gone, for none.
std::vector<std::string> filesOfMediaObjects(const std::vector<VXMediaObjectRef>& mediaObjects);

// A group stands for its folder, which is what a file manager can copy. A package is of use to the program
// alone that made it, so one stands for the files of its items, as long as there are any. A group without a
// path stands for none.
std::vector<std::string> filesOfMediaGroups(const std::vector<VXMediaGroupRef>& mediaGroups);

// Declares and fills "text/uri-list", "x-special/gnome-copied-files" and "text/plain". Answers whether there
// was anything to write; else no type is declared.
//
// Plain text has a path on each line. A path that no such line can hold, because of control characters or
// bytes that are not UTF-8, stands there as its URL.
bool writeFiles(const std::vector<std::string>& paths, platform::Pasteboard& toPasteboard, const void* owner);

}  // namespace vexo
