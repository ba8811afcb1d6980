// Whether a file is still the one that was looked at.
#pragma once

#include <cstdint>
#include <string>

/// What changes with a file's content, or when another takes its place.
struct FileVersion {
    std::uint64_t device = 0, inode = 0;
    std::int64_t size = 0, modified = 0, changed = 0; // times in nanoseconds
    friend bool operator==(const FileVersion&, const FileVersion&) = default;
};

/// Throws Failure.
FileVersion versionOf(const std::string& path);
