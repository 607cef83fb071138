// Beginnings of files: whatever their bytes, what is found is a type of files and none of folders.
#include <cstdint>

#include "framework/metadata/ContentType.h"
#include "fuzzing/Require.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (const auto* type = vexo::typeOfContent({reinterpret_cast<const char*>(data), size}))
        require(!type->isPackage && type == vexo::FileTypeTable::shared().typeNamed(type->contentType));
    return 0;
}
