#include "framework/Bundle.h"

#include <dlfcn.h>
#include <sys/stat.h>

#include "framework/ModuleFile.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/PropertyList.h"
#include "platform/Services.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {
namespace {

namespace path = platform::path;

constexpr std::uint64_t largestDescriptor = 1 << 20;

std::optional<std::string> text(const platform::Dictionary& descriptor, std::string_view key) {
    const platform::Value* value = platform::find(descriptor, key);
    if (!value || !value->string() || value->string()->empty())
        return std::nullopt;
    return *value->string();
}

bool isFileName(const std::string& name) {
    return name.find('/') == std::string::npos && name.find('\0') == std::string::npos && name != "." &&
           name != "..";
}

// What is wrong with a bundle's descriptor; empty when nothing is.
std::string problemOf(const platform::Dictionary& descriptor) {
    for (const char* key : {"CFBundleIdentifier", "CFBundleExecutable", "NSPrincipalClass"}) {
        if (!text(descriptor, key))
            return std::string("its Info.plist has no ") + key;
    }
    if (!isFileName(*text(descriptor, "CFBundleExecutable")))
        return "its CFBundleExecutable is no file name";
    const platform::Value* version = platform::find(descriptor, "VXHostInterfaceVersion");
    if (!version || !version->integer())
        return "its Info.plist has no VXHostInterfaceVersion";
    if (*version->integer() != VXHostInterfaceVersion)
        return "it was built for version " + std::to_string(*version->integer()) +
               " of the host's interface, and this host has " + std::to_string(VXHostInterfaceVersion);
    return {};
}

bool writableByOthers(const std::string& file) {
    struct stat status;
    return platform::uninterrupted([&] { return stat(file.c_str(), &status); }) == 0 &&
           (status.st_mode & S_IWOTH) != 0;
}

platform::PropertyListResult readDescriptor(const std::string& file) {
    const auto bytes = platform::services().fileManager.contentsAtPath(file, largestDescriptor);
    if (!bytes)
        return {std::nullopt, "its Contents/Info.plist cannot be read, or is too large"};
    platform::PropertyListResult result = platform::propertyListWithData(*bytes);
    if (result.value && !result.value->dictionary())
        return {std::nullopt, "its Contents/Info.plist holds no dictionary"};
    if (!result.value)
        result.error = "its Contents/Info.plist is damaged: " + result.error;
    return result;
}

}  // namespace

BundleResult Bundle::open(const std::string& bundlePath) {
    const platform::PropertyListResult descriptor = readDescriptor(bundlePath + "/Contents/Info.plist");
    const std::string problem =
        descriptor.value ? problemOf(*descriptor.value->dictionary()) : descriptor.error;
    if (!problem.empty())
        return {nullptr, "'" + bundlePath + "' is no usable plug-in: " + problem};

    std::shared_ptr<const Bundle> bundle(new Bundle(bundlePath, *descriptor.value->dictionary()));
    for (const std::string& file : {bundlePath, bundlePath + "/Contents", bundlePath + "/Contents/Info.plist",
                                    bundlePath + "/Contents/Linux", bundle->modulePath()}) {
        if (writableByOthers(file))
            return {nullptr, "the plug-in '" + bundlePath + "' is refused because every user may change '" +
                                 file + "'; take that right away with chmod o-w"};
    }
    return {std::move(bundle), {}};
}

Bundle::Bundle(std::string bundlePath, const platform::Dictionary& descriptor)
    : path_(std::move(bundlePath)),
      identifier_(*text(descriptor, "CFBundleIdentifier")),
      executable_(*text(descriptor, "CFBundleExecutable")),
      principalClassName_(*text(descriptor, "NSPrincipalClass")),
      strings_(BundleStrings::withContentsOfFile(path_ + "/Contents/Resources/Strings.ini")) {}

std::optional<std::string> Bundle::localizedString(std::string_view key) const {
    return strings_.stringForKey(key);
}

platform::ImageRef Bundle::iconNamed(std::string_view name) const {
    std::string iconName(name);
    auto picture = isFileName(iconName) ? pictureOfIcon(iconName) : nullptr;
    return picture ? std::make_shared<platform::Image>(std::move(picture), std::move(iconName)) : nullptr;
}

std::shared_ptr<const platform::Picture> Bundle::pictureOfIcon(const std::string& name) const {
    if (auto known = knownPicture(name); known && known->isDrawable())
        return known;
    auto picture = platform::pictureWithContentsOfFile(path_ + "/Contents/Resources/Icons/" + name + ".svg");
    if (!picture)
        return nullptr;
    platform::Locked lock(iconsMutex_);
    return icons_[name] = std::move(picture);
}

std::shared_ptr<const platform::Picture> Bundle::knownPicture(const std::string& name) const {
    platform::Locked lock(iconsMutex_);
    const auto known = icons_.find(name);
    return known == icons_.end() ? nullptr : known->second;
}

const VXPrincipalClass* Bundle::principalClass(std::string& error) const {
    if (const auto problem = problemOfModuleFile(modulePath())) {
        error = "the code of '" + path_ + "' cannot be loaded: " + *problem;
        return nullptr;
    }
    void* module = dlopen(modulePath().c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
    if (!module) {
        error = "the code of '" + path_ + "' cannot be loaded: " + dlerror();
        return nullptr;
    }
    const auto function =
        reinterpret_cast<VXPluginPrincipalClassFunction>(dlsym(module, VXPluginPrincipalClassSymbol));
    if (!function) {
        error = "the code of '" + path_ + "' is no plug-in's: it exports no " + VXPluginPrincipalClassSymbol;
        return nullptr;
    }
    const VXPrincipalClass* principalClass = function(principalClassName_.c_str());
    if (!principalClass)
        error = "the code of '" + path_ + "' has no principal class named '" + principalClassName_ + "'";
    return principalClass;
}

std::string Bundle::modulePath() const {
    return path_ + "/Contents/Linux/" + executable_;
}

}  // namespace vexo
