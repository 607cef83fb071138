// Denies access to the file system and the network by the kernel's Landlock.
#pragma once

namespace reader {

// From now on the process opens, makes, removes and runs no file by its name and, on newer kernels, connects
// and listens to no TCP port, and reaches no abstract socket and no process outside. False where the kernel
// has no Landlock.
bool denyFilesAndNetwork();

}  // namespace reader
