#include "framework/FilePasteboard.h"

#include <algorithm>
#include <unordered_set>

#include "platform/FileManager.h"
#include "platform/Services.h"
#include "platform/Text.h"

namespace vexo {
namespace {

constexpr const char* uriListType = "text/uri-list";
constexpr const char* copiedFilesType = "x-special/gnome-copied-files";
constexpr const char* plainTextType = "text/plain";

// The first of each stays.
class FileList {
  public:
    void add(std::string path) {
        if (known_.insert(path).second)
            paths_.push_back(std::move(path));
    }
    void add(const std::vector<std::string>& paths) {
        for (const std::string& path : paths)
            add(path);
    }
    std::vector<std::string> take() { return std::move(paths_); }

  private:
    std::vector<std::string> paths_;
    std::unordered_set<std::string> known_;
};

bool isPackage(const std::string& path) {
    const auto flags = platform::services().fileManager.itemFlagsAtPath(path);
    return flags && (*flags & platform::itemIsPackage);
}

std::vector<std::string> filesInGroup(const VXMediaGroup& group) {
    const VXMediaObjectList mediaObjects = group.mediaObjects();
    return filesOfMediaObjects({mediaObjects.begin(), mediaObjects.end()});
}

std::vector<std::string> filesOfMediaGroup(const VXMediaGroup& group) {
    const auto groupPath = group.path();
    auto path = groupPath ? platform::services().fileManager.resolvedPath(*groupPath) : std::nullopt;
    if (!path)
        return {};
    if (isPackage(*path)) {
        if (std::vector<std::string> files = filesInGroup(group); !files.empty())
            return files;
    }
    return {*std::move(path)};
}

bool isControl(char byte) {
    return static_cast<unsigned char>(byte) < 0x20 || byte == 0x7F;
}

std::string lineOfText(const std::string& path, const std::string& url) {
    const bool isLine = platform::isValidUTF8(path) && std::none_of(path.begin(), path.end(), isControl);
    return isLine ? path : url;
}

}  // namespace

std::vector<std::string> filesOfMediaObjects(const std::vector<VXMediaObjectRef>& mediaObjects) {
    FileList files;
    for (const VXMediaObjectRef& mediaObject : mediaObjects) {
        if (auto path = mediaObject->aliasResolvedPath())
            files.add(*std::move(path));
    }
    return files.take();
}

std::vector<std::string> filesOfMediaGroups(const std::vector<VXMediaGroupRef>& mediaGroups) {
    FileList files;
    for (const VXMediaGroupRef& group : mediaGroups)
        files.add(filesOfMediaGroup(*group));
    return files.take();
}

bool writeFiles(const std::vector<std::string>& paths, platform::Pasteboard& toPasteboard,
                const void* owner) {
    if (paths.empty())
        return false;
    std::string uriList;
    std::string copiedFiles = "copy";
    std::string plainText;
    for (const std::string& path : paths) {
        const std::string url = platform::URL::fileURLWithPath(path).absoluteString();
        uriList += url + "\r\n";
        copiedFiles += "\n" + url;
        plainText += (plainText.empty() ? "" : "\n") + lineOfText(path, url);
    }
    toPasteboard.addTypes({uriListType, copiedFilesType, plainTextType}, owner);
    toPasteboard.setString(std::move(uriList), uriListType);
    toPasteboard.setString(std::move(copiedFiles), copiedFilesType);
    toPasteboard.setString(std::move(plainText), plainTextType);
    return true;
}

}  // namespace vexo
