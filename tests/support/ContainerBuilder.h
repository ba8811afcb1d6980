// Images of chunked containers for tests, built chunk by chunk: sound ones, and damaged ones by a stored size that is
// not the true one.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "platform/core/ByteWriter.h"

#include <array>
#include <optional>
#include <string_view>

/// RIFF, RF64 and BW64 with little-endian sizes, everything else big-endian; "caff" with the chunk headers of CAF.
class ContainerBuilder {
public:
    explicit ContainerBuilder(std::string_view id, std::string_view formType = "WAVE");

    ContainerBuilder& chunk(std::string_view id, BytesView body, std::optional<std::int64_t> storedSize = {});
    ContainerBuilder& chunk(std::string_view id, std::string_view body, std::optional<std::int64_t> storedSize = {})
    {
        return chunk(id, bytesOf(body), storedSize);
    }
    ContainerBuilder& chunk(std::string_view id, std::size_t zeros) { return chunk(id, Bytes(zeros)); }
    /// The chunk without the pad byte that its odd size asks for.
    ContainerBuilder& unpadded(std::string_view id, std::string_view body);
    /// The chunk that describes 16-bit mono samples.
    ContainerBuilder& format(std::uint32_t frames = 0);
    /// A "ds64" of 28 bytes and a table.
    ContainerBuilder& ds64(std::uint64_t riffSize, std::uint64_t dataSize,
                           std::initializer_list<std::pair<FourCC, std::uint64_t>> table = {});

    /// The image, its container size set to what is there or to `storedSize`.
    Bytes bytes(std::optional<std::uint32_t> storedSize = {}) const;

private:
    ByteWriter out_;
    bool isCAF_;
};

/// The body of a "fmt " chunk of 16 bytes.
Bytes waveFormat(int tag, int channels, int rate, int blockAlign, int bits);
/// The body of a CAF "desc" chunk. The numbers: flags, bytes and frames in a packet, channels, bits.
Bytes cafDescription(double rate, std::string_view format, const std::array<std::uint32_t, 5>& numbers);

/// Opens a memory file that holds a copy of the bytes.
std::int32_t openInMemory(CAudioFileIO& file, BytesView content, unsigned int mode = kFileIOReadWrite);
struct MemoryAudioFile : CAudioFileIO {
    explicit MemoryAudioFile(BytesView content, unsigned int mode = kFileIOReadWrite)
    {
        openInMemory(*this, content, mode);
    }
};
/// What an open memory file holds.
BytesView contentOf(const CAudioFileIO& file);
/// The chunks as ForEachChunk lists them: "fmt :16 data:4".
std::string listing(CAudioFileIO& file);
