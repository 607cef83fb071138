// A plug-in that raises in one operation, which the name of its principal class tells: "FaultyPlugin",
// "FaultyPlugin:performLoadData" or, for what is no std::exception, "FaultyPlugin:performLoadData:number", or
// for a broken archive, "FaultyPlugin:perform:archive", which also says how often that was raised. With
// "FaultyPlugin:noPicture" its image shows none.
#include <stdexcept>

#include "host/VXConstants.h"
#include "host/VXMediaManager.h"
#include "platform/KeyedUnarchiver.h"

namespace {

using vexo::VXMediaGroupRef;
using vexo::VXMediaObjectRef;

std::string faultyOperation;
bool raisesNumber = false;
bool raisesArchiveError = false;
int archiveErrors = 0;

void enter(std::string_view operation) {
    if (operation != faultyOperation)
        return;
    if (raisesNumber)
        throw 42;
    if (raisesArchiveError)
        throw platform::ArchiveError("", "broken archive " + std::to_string(++archiveErrors));
    throw std::runtime_error("fault in " + std::string(operation));
}

// Sets what is faulty; false for the name of another class.
bool readClassName(std::string_view name) {
    constexpr std::string_view ownName = "FaultyPlugin";
    if (!name.starts_with(ownName))
        return false;
    name.remove_prefix(std::min(name.size(), ownName.size() + 1));
    faultyOperation = name.substr(0, name.find(':'));
    raisesNumber = name.ends_with(":number");
    raisesArchiveError = name.ends_with(":archive");
    archiveErrors = 0;
    return true;
}

class FaultyPicture final : public platform::Picture {
  public:
    platform::Size naturalSize() const override { return {16, 16}; }
    bool isDrawable() const override { return true; }
    std::optional<platform::Bitmap> draw(int width, int height) const override {
        enter("draw");
        const auto pixels = static_cast<std::size_t>(width) * static_cast<std::size_t>(height);
        return platform::Bitmap{width, height, std::vector<std::uint32_t>(pixels)};
    }
};

class FaultyPlugin final : public vexo::VXMediaManager {
  public:
    explicit FaultyPlugin(vexo::VXBundleRef bundle) : VXMediaManager(std::move(bundle)) {
        enter("constructor");
    }
    VXMediaManager* init() override {
        enter("init");
        return faultyOperation == "nil" ? nullptr : VXMediaManager::init();
    }

    std::string rootMediaGroupTitle() override {
        enter("rootMediaGroupTitle");
        return "Faulty";
    }
    platform::ImageRef rootMediaGroupIcon() override { return nullptr; }
    unsigned mediaTypesSupported() override {
        enter("mediaTypesSupported");
        return 4;
    }
    std::string uniqueID() override {
        enter("uniqueID");
        return "Faulty ID";
    }
    std::string displayName() override { return rootMediaGroupTitle(); }
    platform::ImageRef displayImage() override { return nullptr; }
    std::vector<VXMediaGroupRef> mediaGroups() override {
        enter("mediaGroups");
        return {};
    }
    bool canLoadData() override {
        enter("canLoadData");
        return true;
    }
    bool appInstalled() override {
        enter("appInstalled");
        return true;
    }
    std::optional<std::string> defaultLoadingMessage() override { return std::nullopt; }
    std::optional<std::string> defaultNoDataMessage(const VXMediaGroupRef&) override {
        enter("defaultNoDataMessage");
        return std::nullopt;
    }
    std::vector<vexo::VXLibraryLocations> libraryLocations() override {
        enter("libraryLocations");
        return {{"projects", {"/faulty"}}};
    }

    void loadData() override {
        enter("loadData");
        VXMediaManager::loadData();
    }
    VXMediaGroupRef performLoadData() override {
        enter("performLoadData");
        const auto root = newMediaGroupWithTypeIdentifier(vexo::VXReelixRootGroupTypeIdentifier, "faulty");
        root->setName("Faulty");
        root->setMediaObjects(vexo::VXMediaObjectList({newMediaObjectWithType(3, "clip", "faulty-clip")}));
        return root;
    }

    std::shared_ptr<platform::Menu> contextMenuForMediaObject(const VXMediaObjectRef&,
                                                              const VXMediaGroupRef&) override {
        enter("contextMenuForMediaObject");
        return menu();
    }
    std::shared_ptr<platform::Menu> contextMenuForMediaGroup(const VXMediaGroupRef&) override {
        enter("contextMenuForMediaGroup");
        return menu();
    }
    bool writeMediaGroups(const std::vector<VXMediaGroupRef>&, platform::Pasteboard&) override {
        enter("writeMediaGroups");
        return false;
    }
    bool writeMediaObjects(const std::vector<VXMediaObjectRef>&, platform::Pasteboard&) override {
        enter("writeMediaObjects");
        return false;
    }
    platform::ImageRef thumbnailOverlayForMediaObject(const VXMediaObjectRef&,
                                                      const std::vector<VXMediaGroupRef>&,
                                                      platform::Size) override {
        enter("thumbnailOverlayForMediaObject");
        auto picture = faultyOperation == "noPicture" ? nullptr : std::make_shared<FaultyPicture>();
        return std::make_shared<platform::Image>(std::move(picture), "overlay");
    }

  private:
    static std::shared_ptr<platform::Menu> menu() {
        platform::MenuItem item;
        item.title = "Act";
        item.perform = [](const platform::MenuItem&) { enter("perform"); };
        auto menu = std::make_shared<platform::Menu>();
        menu->items.push_back(std::move(item));
        return menu;
    }
};

bool isManagedMediaSource() {
    enter("isManagedMediaSource");
    return false;
}

platform::Array supportedPasteboardTypes() {
    enter("supportedPasteboardTypes");
    return {};
}

std::shared_ptr<vexo::VXMediaManager> newFaultyPlugin(vexo::VXBundleRef bundle) {
    const auto plugin = std::make_shared<FaultyPlugin>(std::move(bundle));
    return plugin->init() ? plugin : nullptr;
}

}  // namespace

extern "C" const vexo::VXPrincipalClass* VXPluginPrincipalClass(const char* className) {
    static const vexo::VXPrincipalClass principalClass{&isManagedMediaSource, &supportedPasteboardTypes, 1.0,
                                                       "Faulty-1.0", &newFaultyPlugin};
    if (!readClassName(className))
        return nullptr;
    enter("VXPluginPrincipalClass");
    return &principalClass;
}
