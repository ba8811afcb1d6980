// A file for a verb to process, and whether it was named explicitly.
#pragma once

#include "tool/shared/output/Failure.h"

#include <cstddef>
#include <string>

struct FoundFile {
    std::string path;
    std::string problem;          // why it, or a folder, could not be examined; mostly empty
    std::size_t folderLength = 0; // length of the named folder in the path; 0 if the file itself was named

    bool isBelowFolder() const { return folderLength > 0; }
};

/// Whether the name is that of a file with only sound in it, not of a picture, a text or a film.
bool isCalledAudio(const std::string& path);

/// Whether the name is that of a file whose chunks are read here.
bool isCalledContainer(const std::string& path);

/// Whether the failure is not worth reporting, since folders hold all kinds of files: for a file met below a folder,
/// audio of a kind that the verb does not handle, and files that are neither audio nor named like it.
bool isPassedOver(const FoundFile& file, const Failure& failure);
