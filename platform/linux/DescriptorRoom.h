// GLib ends the program where it can't open the descriptors on which its loops wait. Whoever is about to have
// it make one asks first whether there is room for them.
#pragma once

namespace platform {

// Raises std::system_error when hardly a file can be opened any more. Callable from any thread; what other
// threads open afterwards may still take the room.
void requireRoomForDescriptors();

}  // namespace platform
