// Writes chunks one after another, gathered into few calls.
#pragma once

#include "media/containers/ContainerLayout.h"

namespace platform {

/// Writes from one position on. Keeps the first failure, after which nothing is written.
class ChunkEmitter {
public:
    ChunkEmitter(const FileBytes& file, const ContainerLayout& layout, std::uint64_t position)
        : file_(file),
          layout_(layout),
          position_(position)
    {
    }

    void header(FourCC id, std::uint64_t size);
    void bytes(BytesView bytes);
    /// Copies a body from elsewhere in the file, before or after what is written, never overlapping it.
    void copy(std::uint64_t from, std::uint64_t size);
    void pad(std::uint64_t size);
    /// Position of the next byte.
    std::uint64_t position() const { return position_ + gathered_.size(); }
    /// Writes what is gathered; returns the status of all writes.
    std::int32_t flush();

private:
    const FileBytes& file_;
    const ContainerLayout& layout_;
    std::uint64_t position_;
    Bytes gathered_;
    std::int32_t status_ = 0;
};

} // namespace platform
