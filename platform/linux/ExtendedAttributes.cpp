#include "platform/linux/ExtendedAttributes.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <memory>

#include "platform/Path.h"
#include "platform/linux/AppleDouble.h"
#include "platform/linux/FileByteSource.h"
#include "platform/linux/FileStatus.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

// The call came with Linux 6.13; no C library of ours names it yet.
constexpr long getxattratNumber = 464;

struct AttributeArguments {  // struct xattr_args of <linux/xattr.h>
    alignas(8) std::uint64_t value;
    std::uint32_t size;
    std::uint32_t flags;
};

// nil where the kernel, or what filters calls to it, does not know the call.
std::optional<std::ptrdiff_t> attributeInFolder(int folder, const char* file, const char* name,
                                                std::span<char> buffer) {
    static std::atomic<bool> isKnown = true;
    if (!isKnown.load(std::memory_order_relaxed))
        return std::nullopt;
    AttributeArguments arguments{reinterpret_cast<std::uintptr_t>(buffer.data()),
                                 static_cast<std::uint32_t>(buffer.size()), 0};
    const long size = uninterrupted(
        [&] { return syscall(getxattratNumber, folder, file, 0, name, &arguments, sizeof(arguments)); });
    if (size >= 0)
        return size;
    if (errno != ENOSYS && errno != EPERM)
        return -errno;
    isKnown = false;
    return std::nullopt;
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

AttributedFile::AttributedFile(const std::string& path)
    : folder_(AT_FDCWD), folderPath_(nullptr), name_(path.c_str()) {}

AttributedFile::AttributedFile(int folder, const std::string& folderPath, const char* name)
    : folder_(folder), folderPath_(&folderPath), name_(name) {}

std::ptrdiff_t AttributedFile::attribute(const std::string& name, std::span<char> buffer) const {
    if (const auto size = attributeInFolder(folder_, name_, name.c_str(), buffer))
        return *size;
    const auto size =
        uninterrupted([&] { return getxattr(path().c_str(), name.c_str(), buffer.data(), buffer.size()); });
    return size >= 0 ? size : -errno;
}

std::string AttributedFile::path() const {
    return folderPath_ ? path::appending(*folderPath_, name_) : name_;
}

AttributeAnswer extendedAttribute(const AttributedFile& file, std::string_view name, std::span<char> buffer,
                                  ForeignNames foreignNames) {
    const auto own = file.attribute("user." + std::string(name), buffer);
    const bool keepsAttributes = own != -ENOTSUP;
    if (own != -ENODATA && keepsAttributes)
        return {own};
    if (keepsAttributes && foreignNames == ForeignNames::knownToBeMissing)
        return {own, /*hasForeignNames=*/false};
    const auto foreign = file.attribute("osx." + std::string(name), buffer);
    const bool hasForeignNames = foreign != -ENOTSUP;
    if (!keepsAttributes && (foreign == -ENODATA || !hasForeignNames))
        return {attributeOfSidecar(file.path(), name, buffer), hasForeignNames};
    return {foreign, hasForeignNames};
}

bool isOfFoundFile(std::ptrdiff_t size) {
    return size >= 0 || size == -ENODATA || size == -ENOTSUP || size == -ERANGE;
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
