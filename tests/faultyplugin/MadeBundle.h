// Bundles that a test makes around a module.
#pragma once

#include <string>

#include "tests/support/TemporaryFolder.h"

namespace testing_support {

// What a bundle is made of.
struct BundleParts {
    std::string identifier = "test.faulty";
    std::string principalClass = "FaultyPlugin";
    std::string module = FAULTY_PLUGIN_MODULE;  // linked to; empty for none
    std::string strings = "[Strings]\nName=Faulty\n";
    int interfaceVersion = 1;
};

// Makes `name` in the folder, in place of what was there, and answers its path.
inline std::string makeBundle(const TemporaryFolder& folder, const std::string& name,
                              const BundleParts& parts) {
    folder.remove(name);
    folder.writeFile(name + "/Contents/Info.plist",
                     "<plist version=\"1.0\"><dict><key>CFBundleIdentifier</key><string>" + parts.identifier +
                         "</string><key>CFBundleExecutable</key><string>Module.so</string>"
                         "<key>NSPrincipalClass</key><string>" +
                         parts.principalClass + "</string><key>VXHostInterfaceVersion</key><integer>" +
                         std::to_string(parts.interfaceVersion) + "</integer></dict></plist>");
    folder.writeFile(name + "/Contents/Resources/Strings.ini", parts.strings);
    if (!parts.module.empty())
        folder.makeLink(name + "/Contents/Linux/Module.so", parts.module);
    return folder.path(name);
}

}  // namespace testing_support
