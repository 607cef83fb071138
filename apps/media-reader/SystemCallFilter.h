// Limits the calls that the process may make of the system, by seccomp.
#pragma once

namespace reader {

// From now on only what decoding needs is allowed; other calls fail with EPERM. They do not end the process,
// because libraries look around (for the number of processors, say) and can do without an answer. False where
// the kernel has no such filter.
bool allowOnlyDecoding();

}  // namespace reader
