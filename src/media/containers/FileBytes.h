// The bytes of one open file, read and written completely through the table of system calls.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/SystemCalls.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>

namespace platform {

/// Owns the descriptor, or reads what a caller has open, which then is only read. Operations return 0 or a negative
/// status code.
class FileBytes final : public ByteSource {
public:
    explicit FileBytes(int descriptor) : descriptor_(descriptor) {}
    /// Borrows the bytes, `length` of them.
    FileBytes(const ByteSource& lent, std::uint64_t length) : lent_(&lent), lentLength_(length) {}
    ~FileBytes();
    FileBytes(const FileBytes&) = delete;
    FileBytes& operator=(const FileBytes&) = delete;

    std::int32_t length(std::uint64_t& length) const;
    /// Reads up to `count` bytes; fewer only at the end of the file.
    std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const override;
    /// Reads all bytes; kStatusEndOfFile if the file is shorter.
    std::int32_t read(std::uint64_t position, void* to, std::size_t count) const;
    std::int32_t write(std::uint64_t position, const void* from, std::size_t count) const;
    /// As `write`, over existing bytes, in one system call. A failure puts the former bytes back. Writes nothing if the
    /// bytes are equal.
    std::int32_t overwrite(std::uint64_t position, BytesView bytes) const;
    std::int32_t setLength(std::uint64_t length) const;
    /// A barrier: earlier writes reach the disk before later ones. Does nothing on a file system without such a call.
    std::int32_t flush() const;

private:
    int descriptor_ = -1; // none if the bytes are lent
    const ByteSource* lent_ = nullptr;
    std::uint64_t lentLength_ = 0;
};

} // namespace platform
