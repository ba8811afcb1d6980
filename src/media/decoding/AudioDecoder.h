// A decoder of one open file: what the converting reader stands on. A module that is loaded implements it too, so that
// everything here is inline or pure.
#pragma once

#include "media/containers/AudioHandle.h"
#include "media/decoding/ConvertingReader.h"
#include "media/samples/SoundFacts.h"

#include <cstdint>

namespace platform {

/// Owns the file. Frames are counted from the first valid one, priming left out. The formats do not change.
class AudioDecoder {
public:
    AudioDecoder() = default;
    virtual ~AudioDecoder() = default;
    AudioDecoder(const AudioDecoder&) = delete;
    AudioDecoder& operator=(const AudioDecoder&) = delete;

    /// How the file holds its audio.
    virtual const StreamDescription& fileFormat() const = 0;
    /// What read() gives: interleaved, packed linear PCM of a supported sample, at the file's rate and channel count.
    virtual const StreamDescription& frameFormat() const = 0;
    virtual std::uint64_t frameCount() const = 0;
    /// What else the file says; channels stand in the order of the speakers' bits. None of linear PCM.
    virtual SoundFacts facts() const { return {}; }
    /// False when the format has none.
    virtual bool packetTable(PacketTable&) const { return false; }
    /// Frames among those read so far for which the file has none that can be decoded: silence stands for them.
    virtual std::uint64_t missingFrames() const { return 0; }
    /// As ConvertingReader's.
    virtual ConvertingReader::Checksum checksum() const { return ConvertingReader::Checksum::notCompared; }
    virtual void compareChecksum() {}
    /// The file itself, which stays the decoder's: answers "ffmt" with its type code. Null when there is none.
    virtual AudioHandle* file() = 0;

    /// Every frame number is taken; beyond the last, nothing is read.
    virtual std::int32_t seek(std::uint64_t frame) = 0;
    /// Reads at most `frames` frames and sets it to their number; 0 with success only at the end. After a failure a
    /// seek comes first.
    virtual std::int32_t read(std::uint32_t& frames, void* to) = 0;
};

} // namespace platform
