// The converting reader: the frames of an audio file in the format that its caller wants. Linear PCM in WAVE, RF64,
// BW64, RIFX, Wave64, AIFF, AIFC, CAF and AU is read by the library itself, everything else by a module that is loaded
// when the first such file is met (media/decoding/DecoderModule.h).
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
    void* data = nullptr;
};

/// Which channel is where: a tag, and with tag 0 a description for each channel, of which the first is here.
struct ChannelLayout {
    static constexpr std::uint32_t byDescriptions = 0;
    static constexpr std::uint32_t byBitmap = 0x10000; // every other tag counts its channels in its low 16 bits

    struct Description {
        std::uint32_t label = 0;
        std::uint32_t flags = 0;
        float coordinates[3] = {};
    };

    std::uint32_t tag = 0;
    std::uint32_t bitmap = 0;
    std::uint32_t descriptionCount = 0;
    Description descriptions[1];
};
static_assert(sizeof(ChannelLayout) == 32);

/// A file open for reading, with a place in it, a frame. Owns the file. Operations return 0 or a negative status; one
/// that fails leaves the place where it was. Reading allocates nothing, except that a rate conversion may behind a
/// seek, and whoever meets missing frames. What is read at a place does not depend on how it was come to.
class KT_EXPORT ConvertingReader final : public AudioHandle {
public:
    static constexpr std::int32_t kPropertyNotSupported = -66561;
    static constexpr std::int32_t kInvalidDataFormat = -66566;

    static constexpr FourCC fileFormatProperty = fourCC("ffmt");   // StreamDescription
    static constexpr FourCC clientFormatProperty = fourCC("cfmt"); // StreamDescription; can be set
    static constexpr FourCC clientLayoutProperty = fourCC("cclo"); // ChannelLayout, of any length; can be set
    static constexpr FourCC frameCountProperty = fourCC("#frm");   // 64-bit, at the file's rate
    static constexpr FourCC audioFileProperty = fourCC("afil"); // AudioHandle*, the reader's; null when there is none
    static constexpr FourCC missingFramesProperty = fourCC("miss"); // 64-bit, missingFrames()
    static constexpr FourCC checksumProperty = fourCC("csum");      // Checksum; set to any value, asks for it
    static constexpr FourCC packetTableProperty = fourCC("xpti");   // PacketTable; not of linear PCM

    /// Null, with `*status` and `*error` (either may be null), when the file cannot be opened; kFormatNotSupported for
    /// audio that nothing here decodes, and then the error says what to install.
    static std::unique_ptr<ConvertingReader> open(const URL& url, std::int32_t* status, Error* error = nullptr);
    ~ConvertingReader() override;

    /// How the file holds its audio.
    const StreamDescription& fileFormat() const;
    /// What read() gives. At first linear PCM as near to the file's own as it can be.
    const StreamDescription& clientFormat() const;
    /// Interleaved, packed linear PCM of any supported sample and channel count; else kFormatNotSupported, and `error`
    /// (may be null) says what to install where that would help. Samples of another kind go by way of 32-bit floats.
    /// Other channel counts: one channel goes to all, all are averaged to one, else surplus channels are left out and
    /// missing ones silent. Drops the layout.
    ///
    /// Another sample rate needs the decoder module, and on both sides 1 to 768,000 whole hertz and at most 64
    /// channels. Places and counts of frames are then those of the client's rate. A rate other than before sets the
    /// place to 0.
    std::int32_t setClientFormat(const StreamDescription& format, Error* error = nullptr);
    /// What else the file says; channels stand in the order of the speakers' bits. None of linear PCM that the library
    /// reads itself (CAudioFileIO tells).
    SoundFacts facts() const;
    /// The file's frames, at its own rate.
    std::uint64_t frameCount() const;
    /// The frames that there are to read: at the client's rate those whose time is ahead of the file's end.
    std::uint64_t clientFrameCount() const;

    /// Of the frames read so far, at the file's rate, those that the file does not hold or that cannot be decoded, as
    /// where it is damaged: they were read as silence, so that all others are where they belong. Each counts once.
    std::uint64_t missingFrames() const;
    /// Whether the sound is what the file's own checksum says; `notCompared` before all of it was read in one run.
    enum class Checksum : std::uint32_t { notCompared, same, differs };
    Checksum checksum() const;
    /// Asks for the comparison, which costs a hash of the sound: FLAC's MD5. Checksums of its parts (in FLAC, WavPack,
    /// TTA and Ogg) are always compared, and parts that fail are missing.
    void compareChecksum();

    /// At the client's rate. kStatusBeforeStart below 0; a place past the end is one where nothing is read.
    std::int32_t seek(std::int64_t frame);
    /// Reads into one buffer of all channels, and sets `frames` to how many were read: fewer than asked only at the end
    /// of the file or of the buffer's room, and none at the end. On failure none.
    std::int32_t read(std::uint32_t& frames, std::span<AudioBuffer> buffers);

    /// kPropertyNotSupported for other ids, and for what the file does not have.
    std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) override;
    std::int32_t property(FourCC id, std::uint32_t& size, void* data) override;
    std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) override;

private:
    struct Implementation;
    explicit ConvertingReader(std::unique_ptr<Implementation> implementation);
    std::int32_t setLayout(BytesView layout);
    std::unique_ptr<Implementation> implementation_;
};

} // namespace platform
