// Loops of 64 KiB with ten chunks, as in a folder that is scanned, and the minimum that a scan must do.
#pragma once

#include "platform/core/Bytes.h"

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

inline constexpr std::size_t kLoopFileSize = 64 * 1024;
inline constexpr std::size_t kLoopChunks = 10;
inline constexpr std::string_view kLoopTitle = "Shaker Groove 120 bpm"; // of the AIFF loops

/// With a title, basic tagging, categories and transients; all but the title behind the samples.
Bytes aiffLoop();
Bytes waveLoop();

/// A folder that is removed when the object goes.
class BenchFolder {
public:
    BenchFolder();
    ~BenchFolder();
    BenchFolder(const BenchFolder&) = delete;
    BenchFolder& operator=(const BenchFolder&) = delete;

    /// Writes a file and returns its path.
    std::string write(const std::string& name, const Bytes& content) const;
    const std::filesystem::path& path() const { return path_; }

private:
    std::filesystem::path path_;
};

/// Opens the file, reads 16 KiB, closes it; false when one of them failed.
bool openReadClose(const std::string& path);

/// Reads every loop chunk of an AIFF or CAF file; false when tags or transients are missing.
bool readLoopTags(const std::string& path);

/// Seconds of processor time that the process has taken.
double cpuSeconds();
