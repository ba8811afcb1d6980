// The packets of a file's audio as FFmpeg finds them.
#pragma once

#include "media/ffmpeg/Handles.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

struct AVStream;

namespace platform::ffmpeg {

/// Owns the file, and takes nothing from any other, nor from a network.
class Demuxer {
public:
    /// isOpen() is false afterwards, with the status, when no audio is found that there is a decoder for.
    Demuxer(const char* path, std::int32_t& status);

    bool isOpen() const { return context_ != nullptr; }
    const AVStream& stream() const;
    /// Streams of audio, of which stream() is the first that can be decoded.
    unsigned audioStreams() const;
    unsigned streams() const;
    std::string_view name() const;
    /// What a movie says of its kind; else empty.
    std::string_view brand() const;
    /// False at the end, where the file is broken beyond a hundred tries, and where it cannot be read, with the status.
    bool read(AVPacket& packet, std::int32_t& status);
    /// To a packet at or before a time, in the stream's units, as well as the file lets it be found.
    bool seek(std::int64_t time);
    /// Bytes of the file itself, up to `count`, at most 4,096, fewer only at its end; the packets go on where they
    /// were. 0, or the status of a read that failed.
    std::int32_t readAt(std::uint64_t position, std::byte* to, std::size_t count, std::size_t& got);
    /// The file's length in bytes; 0 when it cannot be told.
    std::uint64_t size() const;
    /// To the first packet, in the state of a newly opened file.
    std::int32_t restart();

private:
    std::int32_t open();

    std::string url_;
    FormatContext context_;
    int stream_ = -1;
};

} // namespace platform::ffmpeg
