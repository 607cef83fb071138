#include "platform/linux/LinuxWorkspace.h"

#include <gio/gunixmounts.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

#include "platform/Path.h"
#include "platform/linux/FileReveal.h"
#include "platform/linux/IconLookup.h"

namespace platform {

namespace {

constexpr std::string_view reelixCreatorCode = "rlxm";
constexpr std::string_view reelixIdentifier = "com.norvale.ReelixApp";

bool isForTheBusAlone(const DesktopEntry& entry) {
    return entry.isActivatedByBus && entry.exec.empty() && entry.tryExec.empty();
}

ApplicationReference referenceToApplication(const DesktopEntry& entry) {
    ApplicationReference application{entry.identifier, std::nullopt, entry.icon};
    if (auto path = entry.programPath())
        application.url = URL::fileURLWithPath(std::move(*path));
    return application;
}

}  // namespace

LinuxWorkspace::LinuxWorkspace(const MountTable& mountTable, SystemLog& log)
    : mountTable_(mountTable),
      log_(log),
      dataFolders_(desktopDataFolders()),
      entries_(dataFolders_),
      launcher_([this](const std::string& problem) { report(problem); }) {}

LinuxWorkspace::~LinuxWorkspace() {
    if (!monitor_)
        return;
    g_signal_handler_disconnect(monitor_, monitorHandler_);
    g_object_unref(monitor_);
}

void LinuxWorkspace::followMounts() {
    knownVolumes_ = mountedLocalVolumePaths();
    monitor_ = g_unix_mount_monitor_get();
    const auto changed =
        +[](GUnixMountMonitor*, gpointer self) { static_cast<LinuxWorkspace*>(self)->mountsChanged(); };
    monitorHandler_ = g_signal_connect(monitor_, "mounts-changed", G_CALLBACK(changed), this);
}

std::vector<std::string> LinuxWorkspace::mountedLocalVolumePaths() const {
    std::vector<std::string> paths;
    for (const Mount& mount : mountTable_.mounts())
        paths.push_back(mount.path);
    return paths;
}

std::vector<std::string> LinuxWorkspace::mountedRemovableMedia() const {
    std::vector<std::string> paths;
    for (const Mount& mount : mountTable_.mounts())
        if (mount.removable)
            paths.push_back(mount.path);
    return paths;
}

std::optional<ApplicationReference> LinuxWorkspace::applicationForCreator(
    std::string_view creatorCode) const {
    auto entry = entries_.entryWithCreatorCode(creatorCode);
    if (!entry && creatorCode == reelixCreatorCode)
        entry = entries_.entryWithIdentifier(reelixIdentifier);
    return entry ? std::optional(referenceToApplication(*entry)) : std::nullopt;
}

std::string LinuxWorkspace::absolutePathForAppBundleWithIdentifier(std::string_view identifier) const {
    const auto entry = entries_.entryWithIdentifier(identifier);
    if (entry && isForTheBusAlone(*entry))
        return entry->path;
    const auto path = entry ? entry->programPath() : std::nullopt;
    return path && access(path->c_str(), X_OK) == 0 ? *path : "";
}

ImageRef LinuxWorkspace::iconForApplication(const ApplicationReference& application) const {
    const auto path = pathOfIcon(application.icon, dataFolders_);
    auto picture = path ? pictureWithContentsOfFile(*path) : nullptr;
    return picture ? std::make_shared<Image>(std::move(picture), application.icon) : nullptr;
}

// The entry is the one whose path was answered before. The option is the default way, and there is no other.
bool LinuxWorkspace::launchAppWithBundleIdentifier(std::string_view identifier, std::uint32_t /*options*/) {
    if (const auto entry = entries_.entryWithIdentifier(identifier))
        return launcher_.launch(entry->path);
    report("cannot launch '" + std::string(identifier) + "': there is no such application");
    return false;
}

void LinuxWorkspace::waitUntilLaunched() {
    launcher_.wait();
}

bool LinuxWorkspace::selectFile(const std::string& path, const std::string& /*inFileViewerRootedAtPath*/) {
    const auto problem = showInFileManager(URL::fileURLWithPath(path));
    if (!problem)
        return true;
    log_.log("cannot show '" + path + "' in a file manager, and opens its folder instead: " + *problem);
    return launcher_.openFolder(URL::fileURLWithPath(path::withoutLastComponent(path)));
}

void LinuxWorkspace::report(const std::string& problem) {
    log_.log(problem);
    notificationCenter().post({std::string(VXWorkspaceDidFailNotification), this, {{"problem", problem}}});
}

void LinuxWorkspace::mountsChanged() {
    const auto before = std::exchange(knownVolumes_, mountedLocalVolumePaths());
    const auto now = knownVolumes_;  // an observer may run the main loop, and with it this
    for (const auto& path : now)
        if (std::find(before.begin(), before.end(), path) == before.end())
            postMount(path);
}

// Nothing may be raised into GLib, which called.
void LinuxWorkspace::postMount(const std::string& path) try {
    notificationCenter().post({std::string(NSWorkspaceDidMountNotification), this, {{"NSDevicePath", path}}});
} catch (const std::exception& error) {
    log_.log("cannot tell everybody that '" + path + "' was mounted: " + error.what());
} catch (...) {
    log_.log("cannot tell everybody that '" + path + "' was mounted");
}

}  // namespace platform
