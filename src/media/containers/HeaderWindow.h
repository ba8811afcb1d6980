// A window on the bytes of an open file: chunk headers, and the small chunks beside them, are read through it, so that
// a file of tiny chunks costs few calls.
#pragma once

#include "media/containers/FileBytes.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

/// Keeps two pieces of the file: its start, and what was read last elsewhere, which is where the chunks behind the
/// samples stand. Does not own the file; what is written to it meanwhile is not seen.
class HeaderWindow {
public:
    HeaderWindow(const FileBytes& file, std::uint64_t length) : file_(file), length_(length) {}

    std::uint64_t length() const { return length_; }
    /// That of the first read that failed.
    std::int32_t status() const { return status_; }

    /// `count` bytes at `position`, at most 4,096, there until the next call; null when the file ends ahead of them,
    /// and when they cannot be read.
    const std::byte* at(std::uint64_t position, std::size_t count)
    {
        if (position > length_ || count > length_ - position)
            return nullptr;
        const bool isStart = position + count <= kPieceSize;
        Piece& piece = isStart ? start_ : elsewhere_;
        if (piece.find(position, count) == nullptr)
            load(piece, isStart ? 0 : position);
        return piece.find(position, count);
    }

    /// The same of what was read already; null when it was not.
    const std::byte* held(std::uint64_t position, std::size_t count) const
    {
        const std::byte* found = start_.find(position, count);
        return found != nullptr ? found : elsewhere_.find(position, count);
    }

private:
    static constexpr std::size_t kPieceSize = 4096;

    struct Piece {
        const std::byte* find(std::uint64_t position, std::size_t count) const
        {
            if (position < start || position - start > size || count > size - (position - start))
                return nullptr;
            return bytes.data() + (position - start);
        }

        std::uint64_t start = 0;
        std::size_t size = 0;
        std::array<std::byte, kPieceSize> bytes; // filled up to size
    };

    void load(Piece& piece, std::uint64_t from)
    {
        piece.start = from;
        const auto count = static_cast<std::size_t>(std::min<std::uint64_t>(kPieceSize, length_ - from));
        const std::int32_t result = file_.readSome(from, piece.bytes.data(), count, piece.size);
        if (status_ == kStatusOK)
            status_ = result;
    }

    const FileBytes& file_;
    std::uint64_t length_;
    std::int32_t status_ = kStatusOK;
    Piece start_, elsewhere_;
};

} // namespace platform
