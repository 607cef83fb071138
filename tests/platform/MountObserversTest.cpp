#include <gio/gunixmounts.h>
#include <gmock/gmock.h>

#include <stdexcept>

#include "platform/linux/LinuxWorkspace.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/FakeMountTable.h"

namespace platform {
namespace {

using testing::ElementsAre;

class MountObservers : public testing::Test {
  protected:
    void mount(const std::string& path) {
        Mount mount;
        mount.path = path;
        table.list.push_back(mount);
        GUnixMountMonitor* const monitor = g_unix_mount_monitor_get();
        g_signal_emit_by_name(monitor, "mounts-changed");
        g_object_unref(monitor);
    }
    void observe(std::function<void()> handler) {
        workspace.notificationCenter().addObserver(
            observer, NSWorkspaceDidMountNotification,
            [this, handler = std::move(handler)](const Notification& notification) {
                heard.push_back(*find(notification.userInfo, "NSDevicePath")->string());
                handler();
            });
    }

    testing_support::FakeMountTable table;
    CollectedLog log;
    LinuxWorkspace workspace{table, log};
    const std::shared_ptr<int> observer = std::make_shared<int>();
    std::vector<std::string> heard;
};

// The monitor calls from C, which nothing may be raised through.
TEST_F(MountObservers, OneThatRaisesKeepsNobodyFromHearing) {
    observe([] { throw std::runtime_error("broken"); });
    observe([] {});
    observe([] { throw 42; });
    workspace.followMounts();
    mount("/media/card");
    EXPECT_THAT(heard, ElementsAre("/media/card", "/media/card", "/media/card"));
    EXPECT_THAT(log.lines(), ElementsAre("cannot tell everybody that '/media/card' was mounted: broken"));
    mount("/media/disk");
    EXPECT_EQ(heard.size(), 6u);
}

TEST_F(MountObservers, WhatIsNoStandardExceptionIsHeldBackToo) {
    observe([] { throw 42; });
    workspace.followMounts();
    mount("/media/card");
    EXPECT_THAT(log.lines(), ElementsAre("cannot tell everybody that '/media/card' was mounted"));
}

}  // namespace
}  // namespace platform
