// Checks the chunks "axml" and "chna" of a file against each other.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <optional>
#include <string>
#include <vector>

/// Their positions; both are complete.
struct AdmChunks {
    std::optional<ChunkEntry> document, tracks; // "axml" and "chna"
};

struct AdmFinding {
    const char* name; // as in JSON
    FourCC chunk;
    std::int64_t offset; // of the chunk's header
    std::string text;
    const char* effect; // how readers react
};

/// For a file with at least one of them. Whether the document is ADM at all is left to `adm --check`. Throws Failure.
std::vector<AdmFinding> admFindings(const std::string& path, const AdmChunks& chunks);
