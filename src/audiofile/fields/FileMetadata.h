// The metadata of one file, read by field: what its chunks say, or its tags.
#pragma once

#include "audiofile/fields/MetaSource.h"
#include "files/CFileRef.h"
#include "media/containers/ContainerTraits.h"
#include "platform/core/Error.h"

#include <optional>
#include <string>
#include <vector>

/// Codes of the domain "metadata". Other errors are of the domain "status".
enum class MetadataError : std::int64_t {
    noAudio = 1,   // the file is none, or is damaged; the description says what it lacks
    noChunks = 2,  // the file has none, of those that want chunks
    badHeader = 3, // the header of the container or of a chunk cannot be read
    badTag = 4     // the tag of a file without chunks cannot be read; what to install, where that would help
};

inline constexpr const char* kMetadataErrorDomain = "metadata";

struct FileMetadata {
    FourCC container = 0; // the outermost id: "RIFF", "FORM", "caff" …; 0 of a file without chunks
    std::vector<MetaField> fields;
};

/// Which groups of fields are wanted: "bext", "info", or the id of a chunk, whatever their case; empty: all.
using MetaGroups = std::vector<std::string>;

/// The chunks of WAVE, RF64, BW64, RIFX, Wave64, AIFF, AIFC and CAF files, and the tags of others. Chunks that say how
/// samples are coded, and room that is not used, are left out; of those that nobody here knows the first bytes are
/// shown. Chunks that no wanted field is made of are not read.
KT_EXPORT std::optional<FileMetadata> ReadMetadataFields(const CFileRef& file, const MetaGroups& groups = {},
                                                         platform::Error* error = nullptr);

/// The groups by which fields go, of all containers, each once, in small letters.
KT_EXPORT std::vector<std::string> MetadataGroupNames();

/// The chunks that fields are made of, in memory.
struct HeldMetadata {
    FourCC container = 0;
    platform::ContainerKind kind = platform::ContainerKind::riff;
    MetaSource source;
    double sampleRate = 0;    // 0 unknown
    std::int64_t frames = -1; // of the sound; below 0 unknown
};

/// Of a file that has chunks.
KT_EXPORT std::optional<HeldMetadata> HoldMetadata(const CFileRef& file, const MetaGroups& groups = {},
                                                   platform::Error* error = nullptr);
KT_EXPORT std::vector<MetaField> MetadataFieldsOf(const HeldMetadata& held, const MetaGroups& groups = {});
