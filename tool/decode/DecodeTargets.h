// Where the outputs of `ktfiles decode` go.
#pragma once

#include "tool/decode/DecodeFormat.h"
#include "tool/shared/input/FoundFile.h"

#include <filesystem>
#include <mutex>
#include <set>
#include <string>
#include <vector>

/// Whether `out` names a folder, and not a file: it is one, or ends with "/".
bool isDecodeFolder(const std::string& out);

/// The outputs of many files: which they are, and the folders that they are in, made where they are missing and gone
/// again when nothing came to be in them.
class DecodeTargets {
public:
    /// `out` is empty (the current folder), "-", a folder, or the file to write. In a folder an output is called as
    /// what it comes from, with the extension of the format, and the tree below a folder that was named is mirrored.
    DecodeTargets(const std::string& out, const DecodeFormat& format);
    ~DecodeTargets();
    DecodeTargets(const DecodeTargets&) = delete;
    DecodeTargets& operator=(const DecodeTargets&) = delete;

    /// The files that these names lead to, without those in the output folder, where earlier outputs are. What would be
    /// decoded to one output with another is told on standard error.
    std::vector<FoundFile> plan(const std::vector<std::string>& names);

    /// The output of one of them; its folder is there. By any thread. Throws Failure.
    std::string outputOf(const FoundFile& file);

private:
    std::string nameOf(const FoundFile& file) const;
    bool isEarlierOutput(const FoundFile& file) const;
    void makeFolder(const std::filesystem::path& folder);

    std::string out_;
    const DecodeFormat& format_;
    bool toFolder_;
    std::set<std::string> shared_; // files that would be decoded to one output with others
    std::mutex mutex_;
    std::vector<std::string> made_; // the mutex's
};
