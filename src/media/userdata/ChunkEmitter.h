// Writes chunks one behind the other, gathered into few calls.
#pragma once

#include "media/containers/ContainerLayout.h"

namespace platform {

/// Writes from one position of the file on. The first failure is kept, and nothing is written after it.
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
    /// A body that stands elsewhere in the file, ahead of or behind what is written, never under it.
    void copy(std::uint64_t from, std::uint64_t size);
    void pad(std::uint64_t size);
    /// Where the next byte goes.
    std::uint64_t position() const { return position_ + gathered_.size(); }
    /// Writes what is gathered; the status of it all.
    std::int32_t flush();

private:
    const FileBytes& file_;
    const ContainerLayout& layout_;
    std::uint64_t position_;
    Bytes gathered_;
    std::int32_t status_ = 0;
};

} // namespace platform
