// A file that a verb is to work on, and whether it was asked for by name.
#pragma once

#include "tool/shared/output/Failure.h"

#include <cstddef>
#include <string>

struct FoundFile {
    std::string path;
    std::string problem;          // why it, or a folder, could not be looked at; mostly empty
    std::size_t folderLength = 0; // of the path: the folder that was named, below which it was met; 0: named itself

    bool isBelowFolder() const { return folderLength > 0; }
};

/// Whether the name is that of a file with nothing but sound in it: a picture or a text is none, nor is a film.
bool isCalledAudio(const std::string& path);

/// Whether the name is that of a file whose chunks are read here.
bool isCalledContainer(const std::string& path);

/// Whether the failure is no news, since folders hold all kinds of files: of one met below a folder, what is audio of a
/// kind that the verb has nothing to do with, and what is no audio and not called so.
bool isPassedOver(const FoundFile& file, const Failure& failure);
