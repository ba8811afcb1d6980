#include "media/ffmpeg/CorrectionFile.h"

#include <new>
#include <utility>

extern "C" {
#include <libavcodec/packet.h>
#include <libavutil/buffer.h>
}

namespace platform::ffmpeg {

std::unique_ptr<CorrectionFile> CorrectionFile::beside(const std::string& path, const Demuxer& packets)
{
    if (packets.name() != "wv" || !path.ends_with(".wv"))
        return nullptr;
    std::int32_t status = 0;
    Demuxer demuxer((path + "c").c_str(), status);
    return demuxer.isOpen() && demuxer.name() == "wv"
               ? std::unique_ptr<CorrectionFile>(new CorrectionFile(std::move(demuxer)))
               : nullptr;
}

CorrectionFile::CorrectionFile(Demuxer demuxer) : demuxer_(std::move(demuxer)), next_(makePacket())
{
}

void CorrectionFile::attachTo(AVPacket& packet)
{
    std::int32_t status = 0;
    while (next_->size == 0 || next_->pts < packet.pts) {
        av_packet_unref(next_.get());
        if (!demuxer_.read(*next_, status))
            return;
    }
    if (next_->pts != packet.pts || next_->buf == nullptr)
        return;
    packet.opaque_ref = av_buffer_ref(next_->buf);
    if (packet.opaque_ref == nullptr)
        throw std::bad_alloc();
}

void CorrectionFile::seek(std::int64_t time)
{
    av_packet_unref(next_.get());
    if (!demuxer_.seek(time))
        demuxer_.restart();
}

} // namespace platform::ffmpeg
