// Services that are in place for the length of a scope and know nothing, except for what a test tells them.
#pragma once

#include <optional>
#include <string>
#include <utility>

#include "platform/Dispatcher.h"
#include "platform/FileManager.h"
#include "platform/Notification.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"
#include "platform/UserDefaults.h"
#include "platform/Workspace.h"

namespace platform {

class StandInFileManager : public FileManager {
  public:
    std::optional<std::string> home;

    std::optional<std::string> homeDirectory() const override { return home; }
    std::optional<FileKind> kindOfItemAtPath(const std::string&) const override { return {}; }
    std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(const std::string&) const override {
        return {};
    }
    std::unique_ptr<Folder> openFolderAtPath(const std::string&) const override { return nullptr; }
    std::optional<FileAttributes> attributesOfItemAtPath(const std::string&) const override { return {}; }
    std::optional<std::uint32_t> itemFlagsAtPath(const std::string&) const override { return {}; }
    std::optional<std::string> displayNameAtPath(const std::string&) const override { return {}; }
    std::ptrdiff_t extendedAttribute(const std::string&, std::string_view, std::span<char>) const override {
        return -1;
    }
    std::optional<std::string> fileSystemTypeNameAtPath(const std::string&) const override { return {}; }
    std::unique_ptr<ByteSource> openFileAtPath(const std::string&) const override { return nullptr; }
    std::optional<std::string> resolvedPath(const std::string& path) const override { return path; }
};

class StandInWorkspace final : public Workspace {
  public:
    std::vector<std::string> mountedLocalVolumePaths() const override { return {}; }
    std::vector<std::string> mountedRemovableMedia() const override { return {}; }
    std::optional<ApplicationReference> applicationForCreator(std::string_view) const override { return {}; }
    std::string absolutePathForAppBundleWithIdentifier(std::string_view) const override { return {}; }
    ImageRef iconForApplication(const ApplicationReference&) const override { return nullptr; }
    bool launchAppWithBundleIdentifier(std::string_view, std::uint32_t) override { return false; }
    bool selectFile(const std::string&, const std::string&) override { return false; }
};

class StandInUserDefaults final : public UserDefaults {
  public:
    void synchronize() override {}
    std::optional<Dictionary> persistentDomainForName(std::string_view) override { return {}; }
    std::optional<Value> objectForKey(std::string_view) override { return {}; }
};

class StandInDispatcher final : public Dispatcher {
  public:
    bool isMainThread() const override { return true; }
    void asyncInBackground(Block) override {}
    void afterInBackground(Delay, Block) override {}
    void performOnMainRunLoop(Delay, std::vector<RunLoopMode>, Block) override {}
    void detachThread(std::string_view, double, Block) override {}
    void setFailureHandler(FailureHandler) override {}
};

class StandInSystemLog final : public SystemLog {
  public:
    void log(std::string_view) override {}
};

struct StandInServices {
    StandInFileManager fileManager;
    StandInWorkspace workspace;
    StandInUserDefaults userDefaults;
    StandInDispatcher dispatcher;
    NotificationCenter notificationCenter;
    StandInSystemLog systemLog;
    const ServicesScope scope{
        Services{fileManager, workspace, userDefaults, dispatcher, notificationCenter, systemLog}};
};

}  // namespace platform
