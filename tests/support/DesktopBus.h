// A session bus of a test's own, and services on it that a test makes up.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "platform/ThreadSafety.h"
#include "tests/support/TemporaryFolder.h"

typedef struct _GTestDBus GTestDBus;
typedef struct _GDBusConnection GDBusConnection;
typedef struct _GDBusMessage GDBusMessage;

namespace testing_support {

// While one exists it is the session bus of this process and of those it starts.
class DesktopBus {
  public:
    // In `serviceFolder` are the descriptions of what the bus starts by itself.
    explicit DesktopBus(const std::string& serviceFolder);
    ~DesktopBus();
    DesktopBus(const DesktopBus&) = delete;
    DesktopBus& operator=(const DesktopBus&) = delete;

    std::string address() const;

  private:
    GTestDBus* const bus_;
};

// A place where no session bus is, for the length of a scope.
class NoDesktopBus {
  private:
    const ScopedEnvironment address_{"DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/bus"};
};

// Owns a name on a bus and answers every call in one way.
class BusService {
  public:
    enum class Answer { done, error, never };

    BusService(const DesktopBus& bus, const std::string& name, Answer answer = Answer::done);
    ~BusService();
    BusService(const BusService&) = delete;
    BusService& operator=(const BusService&) = delete;

    // What was called, in order, before it was answered: "ShowItems (['file:///a'], '')".
    std::vector<std::string> calls() const VX_EXCLUDES(mutex_);

  private:
    bool receive(GDBusMessage* message) VX_EXCLUDES(mutex_);
    void reply(GDBusMessage* call);

    const Answer answer_;
    mutable platform::Mutex mutex_;
    std::vector<std::string> calls_ VX_GUARDED_BY(mutex_);
    GDBusConnection* connection_ = nullptr;
    unsigned filter_ = 0;
};

}  // namespace testing_support
