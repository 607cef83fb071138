#include "platform/linux/RendererModule.h"

#include <dlfcn.h>

#include <stdexcept>

#include "platform/Path.h"
#include "platform/linux/OwnLibrary.h"

namespace platform {

const Renderer& rendererOfModule(const std::string& path) {
    // It is never unloaded: pictures of its classes may outlive everything else.
    void* module = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    void* entry = module ? dlsym(module, "vexoRenderer") : nullptr;
    if (!entry)
        throw std::runtime_error(dlerror());
    const Renderer* renderer = reinterpret_cast<decltype(&vexoRenderer)>(entry)(VEXO_VERSION);
    if (!renderer)
        throw std::runtime_error(path + " is of another version");
    return *renderer;
}

const Renderer& renderer() {
    static const Renderer& installed =
        rendererOfModule(path::appending(ownLibraryFolder(), "vexo/libVexoDrawing.so"));
    return installed;
}

}  // namespace platform
