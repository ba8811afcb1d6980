// The metadata of one file, read by field.
#pragma once

#include "tool/meta/MetaReaders.h"

struct FileMetadata {
    FourCC container = 0; // the outermost id: "RIFF", "FORM", "caff" …; 0 of a file without chunks
    std::vector<MetaField> fields;
};

/// The chunks that fields are made of, in memory.
struct HeldMetadata {
    FourCC container = 0;
    std::span<const MetaReader> readers;
    MetaSource source;
    double sampleRate = 0;    // 0 unknown
    std::int64_t frames = -1; // of the sound; below 0 unknown
};

/// Which groups of fields are wanted, in small letters; empty: all.
using MetaGroups = std::vector<std::string>;

/// Chunks that no wanted field is made of are not read. Throws as readMetadata does.
HeldMetadata holdMetadata(const std::string& path, const MetaGroups& groups = {});
std::vector<MetaField> fieldsOf(const HeldMetadata& held, const MetaGroups& groups = {});

/// The chunks of WAVE, RF64, BW64, RIFX, Wave64, AIFF, AIFC and CAF files, and the tags of others; throws Failure.
/// Chunks that say how samples are coded, and room that is not used, are left out; of those that nobody here knows the
/// first bytes are shown.
FileMetadata readMetadata(const std::string& path, const MetaGroups& groups);

/// The groups by which fields go, of all containers, each once.
std::vector<std::string> metaGroups();
