// The file that makes a hybrid WavPack file lossless.
#pragma once

#include "media/ffmpeg/Demuxer.h"

#include <cstdint>
#include <memory>
#include <string>

namespace platform::ffmpeg {

/// The file "x.wvc" beside "x.wv". Its packets belong to those with the same times.
class CorrectionFile {
public:
    /// Null if there is none that can be read, or if `packets` are not those of a WavPack file.
    static std::unique_ptr<CorrectionFile> beside(const std::string& path, const Demuxer& packets);

    /// Attaches the matching correction to a packet in `opaque_ref`, if there is one.
    void attachTo(AVPacket& packet);
    /// Moves to the packets from `time` on.
    void seek(std::int64_t time);

private:
    explicit CorrectionFile(Demuxer demuxer);

    Demuxer demuxer_;
    Packet next_; // the next correction; empty until it is read
};

} // namespace platform::ffmpeg
