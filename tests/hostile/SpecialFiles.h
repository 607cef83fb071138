// Entries that are neither files nor folders: whoever opens one of them may wait for ever.
#pragma once

#include <string>
#include <vector>

#include "tests/support/TemporaryFolder.h"

namespace testing_support {

// Makes one of each kind, a FIFO, a socket and, where the test may, devices: at `path`, which ends in a slash
// or with the beginning of a name, followed by the kind and the extension. Answers their paths in the home.
std::vector<std::string> makeSpecialFiles(const TemporaryFolder& home, const std::string& path,
                                          const std::string& extension);

// A socket with a name in the file system.
void makeSocket(const std::string& path);

}  // namespace testing_support
