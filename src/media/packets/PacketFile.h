// The bytes of a file of packets. Headers, tables and packets are read through one window, so that neither a walk over
// every frame of an hour nor a table of millions of sizes costs many calls.
#pragma once

#include "media/containers/FileBytes.h"
#include "platform/core/Bytes.h"

#include <cstddef>
#include <cstdint>

namespace platform {

class PacketFile {
public:
    /// The most that at() can return.
    static constexpr std::size_t kMostAtOnce = std::size_t{1} << 15;
    /// Larger packets are invalid: ALAC's largest, of 16,384 frames in 8 channels, has 512 KiB.
    static constexpr std::size_t kLargestPacket = std::size_t{1} << 24;

    /// Takes ownership of the descriptor.
    PacketFile(int descriptor, std::uint64_t length) : bytes_(descriptor), length_(length) {}

    std::uint64_t length() const { return length_; }
    const FileBytes& bytes() const { return bytes_; }

    /// `count` bytes at `position`, or as many as the file has there; valid until the next call of any kind. Fewer also
    /// if they cannot be read, which takeStatus() reports.
    BytesView at(std::uint64_t position, std::size_t count)
    {
        if (position >= windowStart_ && position - windowStart_ <= windowSize_ &&
            count <= windowSize_ - (position - windowStart_)) [[likely]]
            return {window_.data() + (position - windowStart_), count};
        return load(position, count);
    }

    /// Reads `count` bytes at `position` into `to`: all of them, or a negative status.
    std::int32_t read(std::uint64_t position, std::uint64_t count, Bytes& to);

    /// Status of the first failed read since the last call; kStatusOK if none failed.
    std::int32_t takeStatus();
    /// The status for a reader that has checked the file's kind: that of a failed read, or kFormatNotSupported if the
    /// kind is another.
    std::int32_t takeStatus(bool isOfKind);

private:
    BytesView load(std::uint64_t position, std::size_t count);

    FileBytes bytes_;
    std::uint64_t length_;
    std::int32_t status_ = 0;
    Bytes window_; // as large as the largest read so far
    std::uint64_t windowStart_ = 0;
    std::size_t windowSize_ = 0;
};

} // namespace platform
