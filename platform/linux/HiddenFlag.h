// The hidden flag that FAT and NTFS keep with a file.
#pragma once

#include <string>

namespace platform {

// Whether the flag is set, as far as the driver shows it; false on every other file system, where the
// question costs one statfs. Requires: `path` names a folder or a plain file and no link.
bool hasHiddenFlag(const std::string& path);

// Whether the file has NTFS attributes, which tells NTFS from other disks that FUSE serves.
bool hasNTFSAttributes(const std::string& path);

}  // namespace platform
