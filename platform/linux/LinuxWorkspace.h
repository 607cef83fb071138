// Volumes from the mount table and applications from desktop entries, asked for and shown through the
// desktop.
//
// The environment (XDG_DATA_HOME, XDG_DATA_DIRS) counts as it was when the workspace was made. Mounts are
// posted on the main run loop.
#pragma once

#include <gio/gio.h>

#include <memory>
#include <string>
#include <vector>

#include "platform/SystemLog.h"
#include "platform/Workspace.h"
#include "platform/linux/ApplicationLauncher.h"
#include "platform/linux/DesktopEntries.h"
#include "platform/linux/MountTable.h"

typedef struct _GUnixMountMonitor GUnixMountMonitor;

namespace platform {

// Made and destroyed on the main thread; otherwise callable from any thread.
class LinuxWorkspace final : public Workspace {
  public:
    // `mountTable` and `log` must outlive the workspace.
    LinuxWorkspace(const MountTable& mountTable, SystemLog& log);
    // Waits for applications that were launched and have not yet taken notice of it, some seconds at most.
    ~LinuxWorkspace() override;

    // Posts each volume that is mounted from now on. A program that ends before anybody could mount one does
    // without: the monitor's thread and types take longer than reading a small library. Called once, on the
    // main thread.
    void followMounts();

    std::vector<std::string> mountedLocalVolumePaths() const override;
    std::vector<std::string> mountedRemovableMedia() const override;

    // The entry that states the code; for ReelixApp's own code also the entry of its identifier. The
    // application has no URL when its program is nowhere in PATH, and one that leads nowhere when the entry
    // gives a path where no file is left.
    std::optional<ApplicationReference> applicationForCreator(std::string_view creatorCode) const override;
    // The program, or the entry of an application that only the session bus can start.
    std::string absolutePathForAppBundleWithIdentifier(std::string_view identifier) const override;
    ImageRef iconForApplication(const ApplicationReference& application) const override;

    bool launchAppWithBundleIdentifier(std::string_view identifier, std::uint32_t options) override;
    void waitUntilLaunched() override;
    bool selectFile(const std::string& path, const std::string& inFileViewerRootedAtPath) override;

  private:
    void mountsChanged();
    void postMount(const std::string& path);
    void report(const std::string& problem);

    const MountTable& mountTable_;
    SystemLog& log_;
    const std::vector<std::string> dataFolders_;
    const DesktopEntries entries_;

    // The main thread's own.
    GUnixMountMonitor* monitor_ = nullptr;  // nil until mounts are followed
    gulong monitorHandler_ = 0;
    std::vector<std::string> knownVolumes_;

    ApplicationLauncher launcher_;  // the last: it reports until it has gone
};

}  // namespace platform
