// Understands the command line and runs the command it names.
#pragma once

namespace vexo {

// The process's exit status: 0 done, 1 it could not be done, 2 the command line is wrong.
int runCommandLine(int argc, char** argv);

}  // namespace vexo
