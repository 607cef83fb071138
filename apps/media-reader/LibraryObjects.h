// FFmpeg's objects with an owner that frees them.
#pragma once

#include <memory>
#include <new>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libswscale/swscale.h>
}

namespace reader {

struct FreeObject {
    void operator()(AVCodecContext* context) const { avcodec_free_context(&context); }
    void operator()(AVFrame* frame) const { av_frame_free(&frame); }
    void operator()(AVPacket* packet) const { av_packet_free(&packet); }
    void operator()(SwsContext* context) const { sws_freeContext(context); }
};

template <typename Type>
using Owned = std::unique_ptr<Type, FreeObject>;

// Takes over what FFmpeg has allocated; raises std::bad_alloc for nil.
template <typename Type>
Owned<Type> owned(Type* object) {
    if (!object)
        throw std::bad_alloc();
    return Owned<Type>(object);
}

}  // namespace reader
