// Beginnings of files: whatever their bytes, what is found is a type of files and none of folders.
#include <cstdint>
#include <cstdlib>

#include "framework/metadata/ContentType.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const vexo::FileType* type = vexo::typeOfContent({reinterpret_cast<const char*>(data), size});
    if (type && (type->isPackage || type != vexo::FileTypeTable::shared().typeNamed(type->contentType)))
        std::abort();
    return 0;
}
