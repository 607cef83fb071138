// Entries that are neither files nor folders: whoever opens one of them may wait for ever.
#pragma once

#include <string>
#include <vector>

#include "tests/support/TemporaryFolder.h"

namespace testing_support {

// Makes each kind of them in the folder of a path, with names that begin with the path's last component: a
// FIFO, a socket and, where the test may, devices. Answers the names' paths.
std::vector<std::string> makeSpecialFiles(const TemporaryFolder& home, const std::string& path,
                                          const std::string& extension);

// A socket with a name in the file system.
void makeSocket(const std::string& path);

}  // namespace testing_support
