// A folder for a test, removed with its content when the test ends.
#pragma once

#include "platform/core/Bytes.h"

#include <filesystem>
#include <string>
#include <string_view>

class TemporaryFolder {
public:
    /// In `parent`, or in the system's place for temporary files.
    explicit TemporaryFolder(const std::filesystem::path& parent = std::filesystem::temp_directory_path());
    ~TemporaryFolder();
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;

    const std::filesystem::path& path() const { return path_; }
    /// The path of an item in the folder.
    std::string operator/(std::string_view name) const { return (path_ / name).string(); }
    /// Writes a file and returns its path.
    std::string write(std::string_view name, BytesView content) const;
    std::string write(std::string_view name, std::string_view content) const { return write(name, bytesOf(content)); }

private:
    std::filesystem::path path_;
};

/// The whole content of a file; fails the running test if it cannot be read.
Bytes readFile(const std::filesystem::path& path);
