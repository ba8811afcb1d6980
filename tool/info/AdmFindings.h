// What is off between the chunks "axml" and "chna" of a file.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <optional>
#include <string>
#include <vector>

/// Where they stand; with all of their bytes.
struct AdmChunks {
    std::optional<ChunkEntry> document, tracks; // "axml" and "chna"
};

struct AdmFinding {
    const char* name; // in JSON
    FourCC chunk;
    std::int64_t offset; // of the chunk's header
    std::string text;
    const char* effect; // what readers do
};

/// Of a file that has one of them at least. That the document is ADM at all, `adm --check` tells. Throws Failure.
std::vector<AdmFinding> admFindings(const std::string& path, const AdmChunks& chunks);
