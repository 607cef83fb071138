// The reader's walls against a file that takes it over: it can open no file, reach no network, run no program
// and start no process. Files are handed to it open.
//
// The sanitizers need what is forbidden here, so a reader built with one has NoSandbox.cpp instead.
#pragma once

#include <string>
#include <vector>

namespace reader {

// Puts up, for good, those walls that this kernel has, and answers their names. The process has given up new
// privileges before.
std::vector<std::string> enterSandbox();

}  // namespace reader
