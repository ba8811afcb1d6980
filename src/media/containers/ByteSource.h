// Where the bytes of a file come from: a descriptor (FileBytes), or whatever a caller reads files by.
#pragma once

#include <cstddef>
#include <cstdint>

namespace platform {

/// Random access to bytes.
class ByteSource {
public:
    /// Reads up to `count` bytes; fewer only at the end of the file. 0 or a negative status.
    virtual std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const = 0;

protected:
    ~ByteSource() = default;
};

} // namespace platform
