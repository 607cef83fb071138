// Launches applications by their desktop entries, as desktops do: through the session bus where the entry
// says so, else by starting the program.
//
// A program that is started shares nothing with ours: it has a session of its own, so that what happens to
// our terminal does not concern it, and neither our input and output nor anything else that we have open.
//
// Callable from any thread.
#pragma once

#include <functional>
#include <future>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/ThreadSafety.h"
#include "platform/URL.h"

typedef struct _GDesktopAppInfo GDesktopAppInfo;

namespace platform {

struct SessionBus;

class ApplicationLauncher {
  public:
    // Told what could not be done and why, in one line; called on any thread, for as long as the launcher
    // lives.
    using Report = std::function<void(const std::string& problem)>;

    explicit ApplicationLauncher(Report report);
    // Waits as well: a bus drops a request whose sender goes before the application has started.
    ~ApplicationLauncher() = default;

    // These don't wait for the application. False when it is known by then that it does not start; what is
    // found out later is reported as well.
    bool launch(const std::string& entryPath);
    // With the application that the user has for folders.
    bool openFolder(const URL& folder);
    // Waits until it is known of every application whether it starts, some seconds at most.
    void wait() VX_EXCLUDES(mutex_);

  private:
    struct Request {
        std::shared_ptr<GDesktopAppInfo> application;
        std::optional<std::string> uri = {};  // to open
    };

    bool carryOut(const Request& request);
    bool startProgram(const Request& request) const;
    bool activate(const Request& request, const SessionBus& bus) VX_EXCLUDES(mutex_);
    bool waitForActivation(Request request) const;
    bool failed(const Request& request, const std::string& reason) const;

    const Report report_;
    Mutex mutex_;
    // Those not answered at once. A future of this kind waits before it goes.
    std::vector<std::future<bool>> activations_ VX_GUARDED_BY(mutex_);
};

}  // namespace platform
