// The state of an open AudioFile.
#pragma once

#include "media/containers/AudioDescription.h"
#include "media/containers/ContainerLayout.h"
#include "media/containers/FileBytes.h"
#include "media/userdata/AudioFileService.h"

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace platform {

/// Owns the descriptor. Keeps what was read of the container: if the file is open for writing, until an edit or a
/// change of the file's length; otherwise while it is open.
struct AudioFile::Implementation {
    Implementation(int descriptor, Permission access) : bytes(descriptor), isWritable(access == Permission::readWrite)
    {
    }
    /// Only read; the bytes must outlive it.
    Implementation(const ByteSource& lent, std::uint64_t length) : bytes(lent, length), isWritable(false) {}

    std::int32_t scan();
    std::int32_t scan(std::uint64_t fileLength);
    /// Scans again if the file has changed since the last scan.
    std::int32_t refresh();
    /// Indices, in the layout's list, of the chunks of a type; keeps enumeration by index linear.
    const std::vector<std::uint32_t>& itemsOf(FourCC type);
    std::int32_t readBody(const Chunk& chunk, void* to, std::size_t count) const;
    std::int32_t findItem(FourCC type, std::uint32_t index, const Chunk*& chunk);
    std::int32_t checkEdit(FourCC type) const;
    std::int32_t setItem(FourCC type, std::uint32_t index, BytesView body);
    std::int32_t removeItem(FourCC type, std::uint32_t index) { return removeItems(type, {&index, 1}); }
    std::int32_t removeItems(FourCC type, std::span<const std::uint32_t> indices);

    std::int32_t describe();
    std::int32_t extendAudio(std::uint64_t byteCount, std::uint64_t chunkSize);
    std::int32_t writeAudio(std::uint64_t firstByte, BytesView samples);

    FileBytes bytes;
    bool isWritable;
    bool isStale = true;
    ContainerLayout layout;
    std::optional<HeaderWindow> window; // of the last scan
    std::optional<AudioDescription> description;
    std::optional<FourCC> itemsType;
    std::vector<std::uint32_t> items;
};

} // namespace platform
