// The bytes of one open file, read and written whole through the call table.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/SystemCalls.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>

namespace platform {

/// Owns the descriptor. Operations return 0 or a negative status code.
class FileBytes final : public ByteSource {
public:
    explicit FileBytes(int descriptor) : descriptor_(descriptor) {}
    ~FileBytes();
    FileBytes(const FileBytes&) = delete;
    FileBytes& operator=(const FileBytes&) = delete;

    std::int32_t length(std::uint64_t& length) const;
    /// Reads up to `count` bytes; fewer only at the end of the file.
    std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const override;
    /// Reads all of them; kStatusEndOfFile when the file is shorter.
    std::int32_t read(std::uint64_t position, void* to, std::size_t count) const;
    std::int32_t write(std::uint64_t position, const void* from, std::size_t count) const;
    /// As `write`, over bytes that exist, in one call of the system. When it fails the former bytes are put back.
    /// Writes nothing when the bytes are there already.
    std::int32_t overwrite(std::uint64_t position, BytesView bytes) const;
    std::int32_t setLength(std::uint64_t length) const;
    /// A barrier: what was written before is on the disk before what is written after. Nothing where the file system
    /// has no such thing.
    std::int32_t flush() const;

private:
    int descriptor_;
};

} // namespace platform
