// The audio-file service: audio files opened by location, whatever their container (WAVE with RF64 and BW64, AIFF,
// AIFC, CAF). It works on the file itself, through platform/SystemCalls.h, with a chunk scanner of its own.
#pragma once

#include "media/containers/AudioHandle.h"
#include "media/samples/StreamDescription.h"
#include "platform/URL.h"
#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"
#include "platform/core/Value.h"

#include <cstdint>
#include <memory>
#include <span>

namespace platform {

class ByteSource;

/// An open audio file; the destructor closes it. Operations return 0 or a negative status code (core/Status.h). While
/// a file is open for reading, chunk headers are kept once read: later writes of others are seen when it is opened
/// anew.
///
/// User data are the blocks that a container carries besides the samples, named by a four-character type and, where a
/// type occurs more than once, by their index in file order. Chunks that make up the container or describe the
/// samples ("fmt ", "COMM", "desc", "data", …) can be read as user data, but not set or removed; filler ("free") is
/// no user data.
class KT_EXPORT AudioFile final : public AudioHandle {
public:
    /// The access that is wanted.
    enum class Permission { read, readWrite };
    /// Bits of create()'s `flags`.
    enum CreationFlag : std::uint32_t { eraseExisting = 1 };

    // The ids of property(); none of these values can be set.
    static constexpr FourCC fileTypeProperty = fourCC("ffmt");    // FourCC
    static constexpr FourCC dataFormatProperty = fourCC("dfmt");  // StreamDescription
    static constexpr FourCC byteCountProperty = fourCC("bcnt");   // 64-bit
    static constexpr FourCC packetCountProperty = fourCC("pcnt"); // 64-bit
    static constexpr FourCC dataOffsetProperty = fourCC("doff");  // 64-bit
    /// a status: no such property, or one that cannot be set
    static constexpr auto kUnsupportedProperty = static_cast<std::int32_t>(fourCC("pty?"));

    /// Opens a file. Null, with `*status`, when it cannot be opened or the service does not know its kind
    /// (kStatusParameterError). `typeHint` names the container to assume where the bytes leave it open, which no
    /// container of today does.
    static std::unique_ptr<AudioFile> open(const URL& url, Permission permission, FourCC typeHint,
                                           std::int32_t* status);
    /// Opens a file for reading: what open() takes, and the containers that are only read, big-endian WAVE (RIFX),
    /// Wave64 and AU. kStatusParameterError for others.
    static std::unique_ptr<AudioFile> openToRead(const URL& url, std::int32_t* status);
    /// The same for `length` bytes that the caller has open, and that must outlive the result.
    static std::unique_ptr<AudioFile> openToRead(const ByteSource& bytes, std::uint64_t length, std::int32_t* status);
    /// Creates a file without samples, open for reading and writing. `fileType` is "WAVE", "AIFF", "AIFC" or "caff";
    /// the format is linear PCM that the container can hold: little-endian in WAVE (8 bits unsigned), big-endian in
    /// AIFF, which has no floats. kStatusParameterError for others; kStatusDuplicateName when the file exists, unless
    /// `flags` (of CreationFlag, others are ignored) let it be emptied.
    static std::unique_ptr<AudioFile> create(const URL& url, FourCC fileType, const StreamDescription& format,
                                             std::int32_t* status, std::uint32_t flags = 0);
    ~AudioFile() override;

    std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) override;
    std::int32_t property(FourCC id, std::uint32_t& size, void* data) override;
    /// Always kUnsupportedProperty.
    std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) override;

    /// "WAVE" (RF64 and BW64 too), "AIFF", "AIFC" or "caff"; "RIFX", "W64f" or "NeXT" (AU) of what openToRead() adds.
    FourCC fileType() const;

    // The audio data. kStatusIOError when the file does not say, or contradicts itself.
    /// How the samples are coded.
    std::int32_t dataFormat(StreamDescription& format);
    /// The length of the audio data, in bytes.
    std::int32_t audioDataByteCount(std::uint64_t& bytes);
    /// The length of the audio data in packets; for linear PCM a packet is a frame.
    std::int32_t audioDataPacketCount(std::uint64_t& packets);
    /// Where the audio data begins, in bytes from the start of the file.
    std::int32_t audioDataOffset(std::uint64_t& offset);

    /// Reads `packets` packets, fewer at the end of the audio data, and sets `packets` to their number.
    /// kStatusEndOfFile when there is none from `firstPacket` on. kStatusParameterError unless packets have one size,
    /// as in linear PCM.
    std::int32_t readPackets(std::uint64_t firstPacket, std::uint32_t& packets, void* data);
    /// Reads bytes in the same way; `firstByte` counts from the start of the audio data.
    std::int32_t readBytes(std::uint64_t firstByte, std::uint32_t& bytes, void* data);
    /// Writes packets of linear PCM. Writing past the end extends the audio data when nothing follows it in the file
    /// (else kStatusEndOfFile) and no gap is left (else kStatusParameterError). On failure the number written is 0.
    std::int32_t writePackets(std::uint64_t firstPacket, std::uint32_t& packets, const void* data);
    /// Writes bytes in the same way; `firstByte` counts from the start of the audio data.
    std::int32_t writeBytes(std::uint64_t firstByte, std::uint32_t& bytes, const void* data);

    /// How many items of the type there are.
    std::int32_t countUserData(FourCC type, std::uint32_t& count);
    /// The size of an item in bytes; kStatusParameterError when there is no such item.
    std::int32_t userDataSize(FourCC type, std::uint32_t index, std::uint32_t& size);
    /// Copies at most `size` bytes of the item to `data` and sets `size` to their number.
    std::int32_t userData(FourCC type, std::uint32_t index, std::uint32_t& size, void* data);
    /// Replaces an item, or appends one when `index` is the count of items of its type. An item as long as before is
    /// rewritten in place; otherwise the new one is written and committed before the old one goes, so that the file
    /// opens and holds the old item or the new one whenever the edit is cut short (docs/formats/user-data-edits.md).
    std::int32_t setUserData(FourCC type, std::uint32_t index, std::uint32_t size, const void* data);
    /// Removes an item; those after it move up by one index.
    std::int32_t removeUserData(FourCC type, std::uint32_t index);
    /// Removes the items at all these indices, which ascend, in one pass; the last ones go first. On failure some may
    /// be gone.
    std::int32_t removeUserData(FourCC type, std::span<const std::uint32_t> indices);

    /// The texts of the CAF "info" chunk, by key; empty when there is none. kStatusParameterError for other containers.
    std::int32_t information(Dictionary& information);
    /// Replaces all of them. Every value must be text, and no text may hold a NUL (kStatusParameterError).
    std::int32_t setInformation(const Dictionary& information);

private:
    struct Implementation;
    static std::unique_ptr<AudioFile> openAny(const URL& url, Permission permission, std::int32_t& status);
    explicit AudioFile(std::unique_ptr<Implementation> implementation);
    std::unique_ptr<Implementation> implementation_;
};

} // namespace platform
