// What hybrid WavPack files keep beside themselves, to be lossless.
#pragma once

#include "media/ffmpeg/Demuxer.h"

#include <cstdint>
#include <memory>
#include <string>

namespace platform::ffmpeg {

/// The file "x.wvc" beside "x.wv", whose packets go with those of the same times.
class CorrectionFile {
public:
    /// Null where there is none that can be read, or where `packets` are not those of a WavPack file.
    static std::unique_ptr<CorrectionFile> beside(const std::string& path, const Demuxer& packets);

    /// Gives a packet what goes with it, in `opaque_ref`; nothing where nothing does.
    void attachTo(AVPacket& packet);
    /// To where the packets of `time` and behind are found.
    void seek(std::int64_t time);

private:
    explicit CorrectionFile(Demuxer demuxer);

    Demuxer demuxer_;
    Packet next_; // of the corrections; empty before it is read
};

} // namespace platform::ffmpeg
