// Where the outputs of `ktfiles decode` go.
#pragma once

#include "tool/decode/DecodeFile.h"

#include <string>
#include <vector>

/// A job for each file. `out` is empty (the current folder), "-", a folder, or the file to write; a folder is one that
/// is there or ends with "/", and its files are called as what they come from, with the extension of the format. Throws
/// UsageError for several files to one output.
std::vector<DecodeJob> decodeJobs(const std::vector<std::string>& files, const std::string& out,
                                  const DecodeFormat& format);

/// Whether `out` names a folder, and not a file.
bool isDecodeFolder(const std::string& out);

/// The folder of the outputs, made where it is missing, and gone again when nothing came to be in it.
class DecodeFolder {
public:
    /// Throws Failure.
    explicit DecodeFolder(const std::string& out);
    ~DecodeFolder();
    DecodeFolder(const DecodeFolder&) = delete;
    DecodeFolder& operator=(const DecodeFolder&) = delete;

private:
    std::string made_;
};
