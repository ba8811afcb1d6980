#include "media/ffmpeg/Handles.h"

#include <new>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
}

namespace platform::ffmpeg {

void Release::operator()(AVCodecContext* context) const
{
    avcodec_free_context(&context);
}

void Release::operator()(AVCodecParameters* parameters) const
{
    avcodec_parameters_free(&parameters);
}

void Release::operator()(AVFormatContext* context) const
{
    avformat_close_input(&context);
}

void Release::operator()(AVFrame* frame) const
{
    av_frame_free(&frame);
}

void Release::operator()(AVPacket* packet) const
{
    av_packet_free(&packet);
}

namespace {

template <class Owner>
Owner allocated(typename Owner::pointer object)
{
    if (object == nullptr)
        throw std::bad_alloc();
    return Owner(object);
}

} // namespace

CodecParameters makeCodecParameters()
{
    return allocated<CodecParameters>(avcodec_parameters_alloc());
}

Frame makeFrame()
{
    return allocated<Frame>(av_frame_alloc());
}

Packet makePacket()
{
    return allocated<Packet>(av_packet_alloc());
}

} // namespace platform::ffmpeg
