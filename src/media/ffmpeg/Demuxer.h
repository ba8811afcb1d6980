// The packets of a file's audio, as FFmpeg finds them.
#pragma once

#include "media/ffmpeg/FLACFrames.h"
#include "media/ffmpeg/Handles.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

struct AVStream;

namespace platform::ffmpeg {

/// Owns the file. Opens no other file and no network connection.
class Demuxer {
public:
    /// If no audio is found that has a decoder, isOpen() is false and `status` says why.
    Demuxer(const char* path, std::int32_t& status);

    bool isOpen() const { return context_ != nullptr; }
    const AVStream& stream() const;
    /// Number of audio streams; stream() is the first that can be decoded.
    unsigned audioStreams() const;
    unsigned streams() const;
    std::string_view name() const;
    /// The brand of a movie; else empty.
    std::string_view brand() const;
    /// False at the end, after a hundred failed attempts in a damaged file, and if the file cannot be read, with the
    /// status.
    bool read(AVPacket& packet, std::int32_t& status);
    /// Seeks to a packet at or before a time in the stream's units, as precisely as the file allows.
    bool seek(std::int64_t time);
    /// Reads up to `count` bytes of the file itself, at most 4,096, fewer only at its end; the position of packets is
    /// unchanged. 0, or the status of a failed read.
    std::int32_t readAt(std::uint64_t position, std::byte* to, std::size_t count, std::size_t& got);
    /// Length of the file in bytes; 0 if unknown.
    std::uint64_t size() const;
    /// Returns to the first packet, in the state of a newly opened file.
    std::int32_t restart();

private:
    std::int32_t open();
    std::int32_t leaveFrames();

    std::string url_;
    FormatContext context_;
    int stream_ = -1;
    std::optional<FLACFrames> frames_; // of a FLAC file, from its start to where they stop or something is sought
};

} // namespace platform::ffmpeg
