#include "platform/linux/BoundedCall.h"

#include "platform/linux/DescriptorRoom.h"

namespace platform {
namespace {

GMainContext* newContext() {
    requireRoomForDescriptors();
    return g_main_context_new();
}

gboolean cancel(gpointer cancellable) {
    g_cancellable_cancel(static_cast<GCancellable*>(cancellable));
    return G_SOURCE_REMOVE;
}

}  // namespace

BoundedCall::BoundedCall()
    : context_(newContext(), &g_main_context_unref),
      cancellable_(g_cancellable_new(), &g_object_unref),
      result_(nullptr, &g_object_unref) {
    g_main_context_push_thread_default(context_.get());
}

BoundedCall::~BoundedCall() {
    g_main_context_pop_thread_default(context_.get());
}

void BoundedCall::finished(GObject*, GAsyncResult* result, gpointer call) {
    static_cast<BoundedCall*>(call)->result_.reset(static_cast<GAsyncResult*>(g_object_ref(result)));
}

GAsyncResult* BoundedCall::wait(std::chrono::milliseconds atMost) {
    GSource* const timer = g_timeout_source_new(static_cast<guint>(atMost.count()));
    g_source_set_callback(timer, cancel, cancellable_.get(), nullptr);
    g_source_attach(timer, context_.get());
    while (!result_)
        g_main_context_iteration(context_.get(), /*may_block=*/TRUE);
    g_source_destroy(timer);
    g_source_unref(timer);
    return result_.get();
}

}  // namespace platform
