// The environment's file system with what a test changes about it: the order of listings, flags, dates and
// names that a real disk would leave to luck or cannot show.
#pragma once

#include <algorithm>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/FileManager.h"
#include "platform/Services.h"
#include "platform/ThreadSafety.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/PathFolder.h"

namespace testing_support {

class ForwardingFiles final : public platform::FileManager {
  public:
    explicit ForwardingFiles(HostEnvironment& environment) : environment_(environment) {}

    // What counts in place of the real thing, by path. A folder without a listing is listed in byte order.
    std::map<std::string, std::vector<std::string>> listings;
    std::map<std::string, std::optional<platform::FileAttributes>> attributes;
    std::map<std::string, std::optional<std::uint32_t>> flags;
    std::map<std::string, std::optional<std::string>> displayNames;
    std::map<std::string, std::string> fileSystemTypes;
    // Called first by each operation of the name.
    std::function<void(const std::string& path)> beforeListing;
    std::function<void(const std::string& path)> beforeKind;
    std::function<void(const std::string& path)> beforeDisplayName;
    std::function<void(const std::string& path)> beforeAttributeRead;
    PathFolder::BeforeReading beforeReading;

    mutable std::vector<std::size_t> attributeReads;  // the buffer sizes of extendedAttribute

    std::optional<std::string> homeDirectory() const override { return real().homeDirectory(); }
    std::optional<platform::FileKind> kindOfItemAtPath(const std::string& path) const override {
        if (beforeKind)
            beforeKind(path);
        return real().kindOfItemAtPath(path);
    }
    std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(
        const std::string& path) const override {
        if (beforeListing)
            beforeListing(path);
        if (const auto scripted = listings.find(path); scripted != listings.end())
            return scripted->second;
        auto names = real().contentsOfDirectoryAtPath(path);
        if (names)
            std::sort(names->begin(), names->end());
        return names;
    }
    std::unique_ptr<platform::Folder> openFolderAtPath(const std::string& path) const override {
        return PathFolder::open(*this, path, beforeReading);
    }
    std::optional<platform::FileAttributes> attributesOfItemAtPath(const std::string& path) const override {
        const auto scripted = attributes.find(path);
        return scripted != attributes.end() ? scripted->second : real().attributesOfItemAtPath(path);
    }
    std::optional<std::uint32_t> itemFlagsAtPath(const std::string& path) const override {
        const auto scripted = flags.find(path);
        return scripted != flags.end() ? scripted->second : real().itemFlagsAtPath(path);
    }
    std::optional<std::string> displayNameAtPath(const std::string& path) const override {
        if (beforeDisplayName)
            beforeDisplayName(path);
        const auto scripted = displayNames.find(path);
        return scripted != displayNames.end() ? scripted->second : real().displayNameAtPath(path);
    }
    std::ptrdiff_t extendedAttribute(const std::string& path, std::string_view name,
                                     std::span<char> buffer) const override {
        if (beforeAttributeRead)
            beforeAttributeRead(path);
        {
            platform::Locked lock(attributeReadsMutex_);
            attributeReads.push_back(buffer.size());
        }
        return real().extendedAttribute(path, name, buffer);
    }
    std::optional<std::string> fileSystemTypeNameAtPath(const std::string& path) const override {
        const auto scripted = fileSystemTypes.find(path);
        return scripted != fileSystemTypes.end() ? scripted->second : real().fileSystemTypeNameAtPath(path);
    }
    std::unique_ptr<platform::ByteSource> openFileAtPath(const std::string& path) const override {
        return real().openFileAtPath(path);
    }
    std::optional<std::string> resolvedPath(const std::string& path) const override {
        return real().resolvedPath(path);
    }

  private:
    const platform::FileManager& real() const { return environment_.files(); }

    HostEnvironment& environment_;
    mutable platform::Mutex attributeReadsMutex_;
};

// The environment's services with other files.
inline platform::Services servicesWith(platform::FileManager& files, HostEnvironment& environment) {
    return {files,
            environment.workspace,
            environment.userDefaults,
            environment.dispatcher,
            environment.notifications,
            environment.log};
}

}  // namespace testing_support
