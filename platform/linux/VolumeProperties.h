// What a volume is called and whether it can be taken out.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/MountRules.h"

namespace platform {

// What people call the volume: its label, else the last component of its mount point. "/" without a label is
// the "File System". A "/" in a label shows as ":", so that the name is one component of a path.
//
// The label is the disk's; a further mount of the same disk or of a folder on it is called by its mount
// point.
std::string displayNameOfVolume(const Volume& volume);

// Whether the medium can be taken out: the drive, or the one beneath an encrypted or joined disk, says so, or
// the desktop mounted it where it mounts such media.
bool isRemovable(const MountEntry& entry);

// False only for what is there and is no folder.
bool isFolderOrUnknown(const std::string& path);

// A display name from a label; nil when it can't be one ("", ".", "..").
std::optional<std::string> nameFromLabel(std::string_view label);
// The label in a name under /dev/disk/by-label, where udev writes what a file name can't hold as "\x2f".
std::string decodedLabel(std::string_view encoded);
// The label under which `device` has a link in `labelsFolder`; nil when it has none.
std::optional<std::string> labelOfDevice(const std::string& device, const std::string& labelsFolder);

}  // namespace platform
