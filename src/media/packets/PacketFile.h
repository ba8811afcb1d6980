// The bytes of the file that packets are found in: headers, tables and packets are read through one window on it, so
// that neither a walk over every frame of an hour nor a table of millions of sizes costs many calls.
#pragma once

#include "media/containers/FileBytes.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>

namespace platform {

class PacketFile {
public:
    /// What at() can be asked for.
    static constexpr std::size_t kMostAtOnce = std::size_t{1} << 15;
    /// A packet of more bytes is none: ALAC's largest, of 16,384 frames of 8 channels, have 512 KiB.
    static constexpr std::size_t kLargestPacket = std::size_t{1} << 24;

    /// Takes the descriptor over.
    PacketFile(int descriptor, std::uint64_t length) : bytes_(descriptor), length_(length) {}

    std::uint64_t length() const { return length_; }
    const FileBytes& bytes() const { return bytes_; }

    /// `count` bytes at `position`, or as many as the file has there; good until the next call of any kind. Fewer also
    /// when they cannot be read, which takeStatus() then tells.
    BytesView at(std::uint64_t position, std::size_t count)
    {
        if (position >= windowStart_ && position - windowStart_ <= windowSize_ &&
            count <= windowSize_ - (position - windowStart_)) [[likely]]
            return {window_.data() + (position - windowStart_), count};
        return load(position, count);
    }

    /// Puts `count` bytes at `position` into `to`, all of them or a negative status.
    std::int32_t read(std::uint64_t position, std::uint64_t count, Bytes& to);

    /// That of the first read which failed since this was last asked; kStatusOK when none did.
    std::int32_t takeStatus();
    /// The status of a reader that looked whether the file is of its kind: that of a failed read, or
    /// kFormatNotSupported when it is not.
    std::int32_t takeStatus(bool isOfKind);

private:
    BytesView load(std::uint64_t position, std::size_t count);

    FileBytes bytes_;
    std::uint64_t length_;
    std::int32_t status_ = 0;
    Bytes window_; // as long as the largest read so far
    std::uint64_t windowStart_ = 0;
    std::size_t windowSize_ = 0;
};

} // namespace platform
