// The converting reader: the frames of an audio file in the format that its caller wants. The library itself reads
// linear PCM in WAVE, RF64, BW64, RIFX, Wave64, AIFF, AIFC, CAF and AU; a module reads everything else, and is loaded
// for the first such file (media/decoding/DecoderModule.h).
#pragma once

#include "media/containers/AudioHandle.h"
#include "media/packets/PacketTable.h"
#include "media/samples/SoundFacts.h"
#include "media/samples/StreamDescription.h"
#include "platform/URL.h"
#include "platform/core/Bytes.h"
#include "platform/core/Error.h"

#include <cstdint>
#include <memory>
#include <span>

namespace platform {

class AudioDecoder;

/// One destination of frames: `byteSize` bytes at `data`.
struct AudioBuffer {
    std::uint32_t channels = 0; // interleaved
    std::uint32_t byteSize = 0; // in: room; out: bytes read
    void* data = nullptr;       // interleaved frames; borrowed
};

/// Which channel is where: a tag and, with tag 0, a description of each channel, of which the first is here.
struct ChannelLayout {
    static constexpr std::uint32_t byDescriptions = 0; // the tag for descriptions
    static constexpr std::uint32_t byBitmap = 0x10000; // every other tag counts its channels in its low 16 bits

    /// One channel.
    struct Description {
        std::uint32_t label = 0;   // what the channel is
        std::uint32_t flags = 0;   // always 0
        float coordinates[3] = {}; // where it is, when the label says so
    };

    std::uint32_t tag = 0;              // byDescriptions, byBitmap, or a named layout
    std::uint32_t bitmap = 0;           // with byBitmap: a bit for each speaker
    std::uint32_t descriptionCount = 0; // with byDescriptions
    Description descriptions[1];        // the first of descriptionCount
};
static_assert(sizeof(ChannelLayout) == 32);

/// A file open for reading, with a position in frames. Owns the file. Operations return 0 or a negative status; one
/// that fails leaves the position. Reading allocates nothing, except after a seek with a rate conversion and where
/// frames are missing. What is read at a position does not depend on how it was reached.
class KT_EXPORT ConvertingReader final : public AudioHandle {
public:
    static constexpr std::int32_t kPropertyNotSupported = -66561; // a status: no such property
    static constexpr std::int32_t kInvalidDataFormat = -66566;    // a status: an MP3 file without a valid frame

    static constexpr FourCC fileFormatProperty = fourCC("ffmt");   // StreamDescription
    static constexpr FourCC clientFormatProperty = fourCC("cfmt"); // StreamDescription; can be set
    static constexpr FourCC clientLayoutProperty = fourCC("cclo"); // ChannelLayout, of any length; can be set
    static constexpr FourCC frameCountProperty = fourCC("#frm");   // 64-bit, at the file's rate
    static constexpr FourCC audioFileProperty = fourCC("afil"); // AudioHandle*, the reader's; null when there is none
    static constexpr FourCC missingFramesProperty = fourCC("miss"); // 64-bit, missingFrames()
    static constexpr FourCC checksumProperty = fourCC("csum");      // Checksum; set to any value, asks for it
    static constexpr FourCC packetTableProperty = fourCC("xpti");   // PacketTable; not of linear PCM

    /// Opens a file. Null, with `*status` and `*error` (either may be null), on failure; kFormatNotSupported for
    /// audio that nothing here decodes, and then the error says what to install.
    static std::unique_ptr<ConvertingReader> open(const URL& url, std::int32_t* status, Error* error = nullptr);
    ~ConvertingReader() override;

    /// How the file holds its audio.
    const StreamDescription& fileFormat() const;
    /// What read() gives: at first, linear PCM as close to the file's format as possible.
    const StreamDescription& clientFormat() const;
    /// Interleaved, packed linear PCM of any supported sample and channel count; else kFormatNotSupported, and `error`
    /// (may be null) says what to install where that would help. Samples of another kind go by way of 32-bit floats.
    /// Other channel counts: one channel goes to all, all are averaged to one, else surplus channels are left out and
    /// missing ones silent. Drops the layout.
    ///
    /// Another sample rate needs the decoder module, and on both sides 1 to 768,000 whole hertz and at most 64
    /// channels. Positions and counts are then frames at the client's rate. A change of rate sets the
    /// position to 0.
    std::int32_t setClientFormat(const StreamDescription& format, Error* error = nullptr);
    /// What else the file says; channels come in the order of the speakers' bits. Empty for linear PCM that the
    /// library reads itself (CAudioFileIO tells).
    SoundFacts facts() const;
    /// How many frames the file has, at its own rate.
    std::uint64_t frameCount() const;
    /// How many frames can be read, at the client's rate: those whose time is ahead of the file's end.
    std::uint64_t clientFrameCount() const;

    /// How many of the frames read so far, at the file's rate, the file does not hold or nothing can decode, as where
    /// it is damaged. They are read as silence, so that all others are in their places. Each counts once.
    std::uint64_t missingFrames() const;
    /// The result of comparing the sound with the file's own checksum; `notCompared` until all of it was read in one
    /// run.
    enum class Checksum : std::uint32_t { notCompared, same, differs };
    /// The result; `notCompared` also when it was not asked for.
    Checksum checksum() const;
    /// Asks for the comparison, which costs a hash of the sound: FLAC's MD5. Checksums of parts (in FLAC, WavPack,
    /// TTA and Ogg) are always compared, and parts that fail are missing.
    void compareChecksum();

    /// Sets the position, at the client's rate. kStatusBeforeStart below 0; past the end nothing is read.
    std::int32_t seek(std::int64_t frame);
    /// Reads into one buffer for all channels, and sets `frames` to how many were read: fewer than asked only at the
    /// end of the file or of the buffer's room, 0 at the end and on failure.
    std::int32_t read(std::uint32_t& frames, std::span<AudioBuffer> buffers);

    /// kPropertyNotSupported for other ids, and for what the file does not have.
    std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) override;
    std::int32_t property(FourCC id, std::uint32_t& size, void* data) override;
    /// kPropertyNotSupported for other ids; as setClientFormat() for the client's format.
    std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) override;

private:
    struct Implementation;
    explicit ConvertingReader(std::unique_ptr<Implementation> implementation);
    std::int32_t setLayout(BytesView layout);
    std::unique_ptr<Implementation> implementation_;
};

} // namespace platform
