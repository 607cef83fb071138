#include "platform/linux/ApplicationLauncher.h"

#include <fcntl.h>
#include <gio/gdesktopappinfo.h>
#include <signal.h>
#include <unistd.h>

#include "platform/linux/BoundedCall.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/SessionBus.h"

namespace platform {

using namespace std::chrono_literals;

namespace {

// A bus refuses at once what it does not know; what takes longer is an application that starts.
constexpr auto refusalTime = 1s;
constexpr auto startingTime = 20s;

constexpr const char* folderType = "inode/directory";

std::shared_ptr<GDesktopAppInfo> owned(gpointer application) {
    if (!application)
        return nullptr;
    return {static_cast<GDesktopAppInfo*>(application), g_object_unref};
}

bool isForTheBus(GDesktopAppInfo* application) {
    return g_desktop_app_info_get_boolean(application, G_KEY_FILE_DESKTOP_KEY_DBUS_ACTIVATABLE);
}

// The list that GIO wants, of one text or none. Valid while the text lives.
class OneOrNone {
  public:
    explicit OneOrNone(const std::optional<std::string>& text) : isEmpty_(!text) {
        element_.data = text ? const_cast<char*>(text->c_str()) : nullptr;
    }
    GList* list() { return isEmpty_ ? nullptr : &element_; }

  private:
    const bool isEmpty_;
    GList element_{};
};

// Runs in the new process before the program: only what is safe after a fork.
void leaveOurSession(gpointer) {
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    setsid();
}

}  // namespace

ApplicationLauncher::ApplicationLauncher(Report report) : report_(std::move(report)) {}

bool ApplicationLauncher::launch(const std::string& entryPath) {
    auto application = owned(g_desktop_app_info_new_from_filename(entryPath.c_str()));
    if (application)
        return carryOut({std::move(application)});
    report_("cannot launch '" + entryPath + "': it names no program that is installed");
    return false;
}

bool ApplicationLauncher::openFolder(const URL& folder) {
    auto application = owned(g_app_info_get_default_for_type(folderType, /*must_support_uris=*/TRUE));
    if (application)
        return carryOut({std::move(application), folder.absoluteString()});
    report_("cannot open '" + folder.path() +
            "': no application for folders is installed; install a file manager");
    return false;
}

void ApplicationLauncher::wait() {
    std::vector<std::future<bool>> activations;
    Locked lock(mutex_);
    activations.swap(activations_);
}

// GIO looks for the bus in either case, and would wait for one that is silent as long as that takes.
bool ApplicationLauncher::carryOut(const Request& request) {
    const SessionBus bus = SessionBus::find();
    if (bus.isSilent)
        return failed(request, "the session bus does not answer");
    if (bus.connection && isForTheBus(request.application.get()))
        return activate(request, bus);
    return startProgram(request);
}

bool ApplicationLauncher::startProgram(const Request& request) const {
    const FileDescriptor nothing(open("/dev/null", O_RDWR | O_CLOEXEC));
    OneOrNone uris(request.uri);
    g_autoptr(GError) error = nullptr;
    g_desktop_app_info_launch_uris_as_manager_with_fds(
        request.application.get(), uris.list(), nullptr, G_SPAWN_SEARCH_PATH, leaveOurSession, nullptr,
        nullptr, nullptr, nothing.number(), nothing.number(), nothing.number(), &error);
    return !error || failed(request, error->message);
}

bool ApplicationLauncher::activate(const Request& request, const SessionBus& bus) {
    auto activation =
        std::async(std::launch::async, [this, request, bus] { return waitForActivation(request); });
    if (activation.wait_for(refusalTime) == std::future_status::ready)
        return activation.get();
    Locked lock(mutex_);
    std::erase_if(activations_,
                  [](const auto& older) { return older.wait_for(0s) == std::future_status::ready; });
    activations_.push_back(std::move(activation));
    return true;
}

bool ApplicationLauncher::waitForActivation(Request request) const {
    OneOrNone uris(request.uri);
    BoundedCall call;
    g_app_info_launch_uris_async(G_APP_INFO(request.application.get()), uris.list(), nullptr,
                                 call.cancellable(), BoundedCall::finished, &call);
    g_autoptr(GError) error = nullptr;
    g_app_info_launch_uris_finish(G_APP_INFO(request.application.get()), call.wait(startingTime), &error);
    if (!error)
        return true;
    if (g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED))
        return failed(request, "it does not answer");
    g_dbus_error_strip_remote_error(error);
    return failed(request, error->message);
}

bool ApplicationLauncher::failed(const Request& request, const std::string& reason) const {
    report_("cannot launch the application of '" +
            std::string(g_desktop_app_info_get_filename(request.application.get())) + "': " + reason);
    return false;
}

}  // namespace platform
