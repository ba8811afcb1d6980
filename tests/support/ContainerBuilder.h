// Builds container images for tests chunk by chunk: intact ones, and ones with a wrong stored size.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "platform/core/ByteWriter.h"

#include <array>
#include <optional>
#include <string_view>

/// RIFF, RF64 and BW64 have little-endian sizes, all others big-endian; "caff" has CAF's chunk headers.
class ContainerBuilder {
public:
    explicit ContainerBuilder(std::string_view id, std::string_view formType = "WAVE");

    ContainerBuilder& chunk(std::string_view id, BytesView body, std::optional<std::int64_t> storedSize = {});
    ContainerBuilder& chunk(std::string_view id, std::string_view body, std::optional<std::int64_t> storedSize = {})
    {
        return chunk(id, bytesOf(body), storedSize);
    }
    ContainerBuilder& chunk(std::string_view id, std::size_t zeros) { return chunk(id, Bytes(zeros)); }
    /// Adds the chunk without the pad byte that its odd size requires.
    ContainerBuilder& unpadded(std::string_view id, std::string_view body);
    /// Adds the chunk that describes 16-bit mono samples.
    ContainerBuilder& format(std::uint32_t frames = 0);
    /// Adds a "ds64" of 28 bytes and a table.
    ContainerBuilder& ds64(std::uint64_t riffSize, std::uint64_t dataSize,
                           std::initializer_list<std::pair<FourCC, std::uint64_t>> table = {});

    /// The image, with the real container size or `storedSize`.
    Bytes bytes(std::optional<std::uint32_t> storedSize = {}) const;

private:
    ByteWriter out_;
    bool isCAF_;
};

/// The body of a "fmt " chunk of 16 bytes.
Bytes waveFormat(int tag, int channels, int rate, int blockAlign, int bits);
/// The body of a CAF "desc" chunk. The numbers are flags, bytes and frames per packet, channels, bits.
Bytes cafDescription(double rate, std::string_view format, const std::array<std::uint32_t, 5>& numbers);

/// Opens a memory file that holds a copy of the bytes.
std::int32_t openInMemory(CAudioFileIO& file, BytesView content, unsigned int mode = kFileIOReadWrite);
struct MemoryAudioFile : CAudioFileIO {
    explicit MemoryAudioFile(BytesView content, unsigned int mode = kFileIOReadWrite)
    {
        openInMemory(*this, content, mode);
    }
};
/// The content of an open memory file.
BytesView contentOf(const CAudioFileIO& file);
/// The chunks as listed by ForEachChunk: "fmt :16 data:4".
std::string listing(CAudioFileIO& file);
