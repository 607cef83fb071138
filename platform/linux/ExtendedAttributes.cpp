#include "platform/linux/ExtendedAttributes.h"

#include <sys/xattr.h>

#include <cerrno>
#include <cstdlib>
#include <memory>

#include "platform/linux/AppleDouble.h"
#include "platform/linux/FileByteSource.h"
#include "platform/linux/FileStatus.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

// The size of the value, or the negative errno.
std::ptrdiff_t attributeOfFile(const std::string& path, const std::string& name, std::span<char> buffer) {
    const auto size =
        uninterrupted([&] { return getxattr(path.c_str(), name.c_str(), buffer.data(), buffer.size()); });
    return size >= 0 ? size : -errno;
}

// As getxattr answers, with the negative errno for a failure. The file belongs beside the one that holds the
// content, which is elsewhere where `path` is a link.
std::ptrdiff_t attributeOfSidecar(const std::string& path, std::string_view name, std::span<char> buffer) {
    const auto target = canonicalPath(path);
    if (!target)
        return -errno;
    const std::string sidecarPath = appleDoublePath(*target);
    auto file = PlainFile::open(sidecarPath);
    if (!file)
        return -ENODATA;
    FileByteSource sidecar(std::move(file), sidecarPath);
    const auto value = attributeInAppleDouble(sidecar, name);
    if (!value)
        return -ENODATA;
    if (!buffer.empty() && value->size() > buffer.size())
        return -ERANGE;
    value->copy(buffer.data(), buffer.size());
    return static_cast<std::ptrdiff_t>(value->size());
}

}  // namespace

AttributeAnswer extendedAttribute(const std::string& path, std::string_view name, std::span<char> buffer,
                                  ForeignNames foreignNames) {
    const auto own = attributeOfFile(path, "user." + std::string(name), buffer);
    const bool keepsAttributes = own != -ENOTSUP;
    if (own != -ENODATA && keepsAttributes)
        return {own};
    if (keepsAttributes && foreignNames == ForeignNames::knownToBeMissing)
        return {own, /*hasForeignNames=*/false};
    const auto foreign = attributeOfFile(path, "osx." + std::string(name), buffer);
    const bool hasForeignNames = foreign != -ENOTSUP;
    if (!keepsAttributes && (foreign == -ENODATA || !hasForeignNames))
        return {attributeOfSidecar(path, name, buffer), hasForeignNames};
    return {foreign, hasForeignNames};
}

bool isUsualForAttributes(int error) {
    return meansMissing(error) || error == ENODATA || error == ENOTSUP || error == ERANGE;
}

std::optional<std::string> canonicalPath(const std::string& path) {
    const std::unique_ptr<char, decltype(&free)> resolved(
        uninterrupted([&] { return realpath(path.c_str(), nullptr); }), &free);
    return resolved ? std::optional<std::string>(resolved.get()) : std::nullopt;
}

}  // namespace platform
