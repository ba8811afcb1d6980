// Chooses the outputs of `ktfiles decode`.
#pragma once

#include "tool/decode/DecodeFormat.h"
#include "tool/shared/input/FoundFile.h"

#include <filesystem>
#include <mutex>
#include <set>
#include <string>
#include <vector>

/// Whether `out` names a folder: it is one, or ends with "/".
bool isDecodeFolder(const std::string& out);

/// The outputs of many files and their folders, which are created if missing and removed again if they stay empty.
class DecodeTargets {
public:
    /// `out` is empty (the current folder), "-", a folder, or the output file. In a folder an output has the name of
    /// its source with the format's extension, and the tree below a named folder is mirrored.
    DecodeTargets(const std::string& out, const DecodeFormat& format);
    ~DecodeTargets();
    DecodeTargets(const DecodeTargets&) = delete;
    DecodeTargets& operator=(const DecodeTargets&) = delete;

    /// The files that these names lead to, except those in the output folder, which are earlier outputs. Files that
    /// would share an output are reported on standard error.
    std::vector<FoundFile> plan(const std::vector<std::string>& names);

    /// The output of one file, whose folder exists then. May be called by any thread. Throws Failure.
    std::string outputOf(const FoundFile& file);

private:
    std::string nameOf(const FoundFile& file) const;
    bool isEarlierOutput(const FoundFile& file) const;
    void makeFolder(const std::filesystem::path& folder);

    std::string out_;
    const DecodeFormat& format_;
    bool toFolder_;
    std::set<std::string> shared_; // files that would share an output
    std::mutex mutex_;
    std::vector<std::string> made_; // guarded by the mutex
};
