// Waits for an asynchronous operation of GIO, though not for ever.
//
//     BoundedCall call;
//     g_app_info_launch_uris_async(app, uris, context, call.cancellable(), BoundedCall::finished, &call);
//     g_app_info_launch_uris_finish(app, call.wait(5s), &error);
//
// Needs no main loop and runs nothing of anybody else's meanwhile. Belongs to the thread that made it; one at
// a time for one operation.
#pragma once

#include <gio/gio.h>

#include <chrono>
#include <memory>

namespace platform {

class BoundedCall {
  public:
    // Raises std::system_error when too few files may be open.
    BoundedCall();
    ~BoundedCall();
    BoundedCall(const BoundedCall&) = delete;
    BoundedCall& operator=(const BoundedCall&) = delete;

    // For the operation to take.
    GCancellable* cancellable() const { return cancellable_.get(); }
    static void finished(GObject* source, GAsyncResult* result, gpointer call);

    // The operation's result, for its finishing function. What has not ended when the time is over is
    // cancelled, and its error is G_IO_ERROR_CANCELLED.
    GAsyncResult* wait(std::chrono::milliseconds atMost);

  private:
    template <typename Object>
    using Owned = std::unique_ptr<Object, decltype(&g_object_unref)>;

    const std::unique_ptr<GMainContext, decltype(&g_main_context_unref)> context_;
    const Owned<GCancellable> cancellable_;
    Owned<GAsyncResult> result_;
};

}  // namespace platform
