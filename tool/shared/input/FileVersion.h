// Detects whether a file has changed since it was examined.
#pragma once

#include <cstdint>
#include <string>

/// Values that change with a file's content, or when another file replaces it.
struct FileVersion {
    std::uint64_t device = 0, inode = 0;
    std::int64_t size = 0, modified = 0, changed = 0; // times in nanoseconds
    friend bool operator==(const FileVersion&, const FileVersion&) = default;
};

/// Throws Failure.
FileVersion versionOf(const std::string& path);
