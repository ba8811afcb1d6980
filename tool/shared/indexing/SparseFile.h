// Files with holes: ranges that were never written, and read as zeros.
#pragma once

#include "platform/OwnedDescriptor.h"

#include <cstdint>
#include <string>

/// Knows the holes of one file. Owns a descriptor of its own if the file has any to speak of.
class SparseFile {
public:
    /// `size` is that of the file, in bytes.
    SparseFile(const std::string& path, std::int64_t size);

    /// Where the hole ends that `offset` is in; `offset` if it is in none.
    std::int64_t endOfHole(std::int64_t offset);

private:
    platform::OwnedDescriptor file_;
};
