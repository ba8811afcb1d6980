// A decoder of one open file, on which the converting reader stands. Modules loaded at run time implement it too, so
// everything here is inline or pure.
#pragma once

#include "media/containers/AudioHandle.h"
#include "media/decoding/ConvertingReader.h"
#include "media/samples/SoundFacts.h"

#include <cstdint>

namespace platform {

/// Owns the file. Frames count from the first valid one, after priming. The formats never change.
class AudioDecoder {
public:
    AudioDecoder() = default;
    virtual ~AudioDecoder() = default;
    AudioDecoder(const AudioDecoder&) = delete;
    AudioDecoder& operator=(const AudioDecoder&) = delete;

    /// How the file stores its audio.
    virtual const StreamDescription& fileFormat() const = 0;
    /// What read() delivers: interleaved, packed linear PCM at the file's rate and channel count.
    virtual const StreamDescription& frameFormat() const = 0;
    virtual std::uint64_t frameCount() const = 0;
    /// Further facts that the file states, channels in the order of the speakers' bits. Empty for linear PCM.
    virtual SoundFacts facts() const { return {}; }
    /// False if the format has none.
    virtual bool packetTable(PacketTable&) const { return false; }
    /// Of the frames read so far, the number that the file lacks or cannot decode; they are read as silence.
    virtual std::uint64_t missingFrames() const { return 0; }
    /// As ConvertingReader::checksum.
    virtual ConvertingReader::Checksum checksum() const { return ConvertingReader::Checksum::notCompared; }
    virtual void compareChecksum() {}
    /// The file itself, owned by the decoder; answers "ffmt" with its type code. Null if there is none.
    virtual AudioHandle* file() = 0;

    /// Any frame number is accepted; nothing can be read beyond the last.
    virtual std::int32_t seek(std::uint64_t frame) = 0;
    /// Reads up to `frames` frames and sets it to their number; 0 with success only at the end. After a failure, seek
    /// before reading on.
    virtual std::int32_t read(std::uint32_t& frames, void* to) = 0;
};

} // namespace platform
