// The metadata of one file, read by field: what its chunks say, or its tags.
#pragma once

#include "audiofile/fields/MetaSource.h"
#include "files/CFileRef.h"
#include "media/containers/ContainerTraits.h"
#include "platform/core/Error.h"

#include <optional>
#include <string>
#include <vector>

class CAudioFileIO;

/// Codes of the domain "metadata". Other errors are of the domain "status".
enum class MetadataError : std::int64_t {
    noAudio = 1,   // the file has no sound, or is damaged; the description says what it lacks
    noChunks = 2,  // chunks are wanted, and the file has none
    badHeader = 3, // the header of the container or of a chunk cannot be read
    badTag = 4     // the tag of a file without chunks cannot be read; what to install, where that would help
};

inline constexpr const char* kMetadataErrorDomain = "metadata"; // the domain of MetadataError

/// The fields of a file.
struct FileMetadata {
    FourCC container = 0;          // the outermost id: "RIFF", "FORM", "caff" …; 0 for a file without chunks
    std::vector<MetaField> fields; // in the order of the file
};

/// The groups of fields that are wanted: "bext", "info", or the id of a chunk, in any case; empty means all.
using MetaGroups = std::vector<std::string>;

/// Reads the chunks of WAVE, RF64, BW64, RIFX, Wave64, AIFF, AIFC and CAF files, and the tags of others. Chunks that
/// describe how samples are coded, and unused room, are left out; unknown chunks show their first bytes. Chunks of
/// groups that are not wanted are not read. Null, with `error`, on failure.
KT_EXPORT std::optional<FileMetadata> ReadMetadataFields(const CFileRef& file, const MetaGroups& groups = {},
                                                         platform::Error* error = nullptr);

/// The same of a file that is open, through its read cache. A file without chunks must have been described at opening
/// (CAudioFileIO::Open), or is opened once more where it has no tags.
KT_EXPORT std::optional<FileMetadata> ReadMetadataFieldsOfOpenFile(CAudioFileIO& file, const MetaGroups& groups = {},
                                                                   platform::Error* error = nullptr);

/// The groups of all containers, each once, in small letters.
KT_EXPORT std::vector<std::string> MetadataGroupNames();

/// The chunks that fields are made of, in memory.
struct HeldMetadata {
    FourCC container = 0;                                         // as in FileMetadata
    platform::ContainerKind kind = platform::ContainerKind::riff; // which container it is
    MetaSource source;                                            // the chunks
    double sampleRate = 0;                                        // in Hz; 0 unknown
    std::int64_t frames = -1;                                     // of the sound; negative: unknown
};

/// Reads the chunks of a file that has chunks; null, with `error`, for others and on failure.
KT_EXPORT std::optional<HeldMetadata> HoldMetadata(const CFileRef& file, const MetaGroups& groups = {},
                                                   platform::Error* error = nullptr);
/// The fields of chunks in memory.
KT_EXPORT std::vector<MetaField> MetadataFieldsOf(const HeldMetadata& held, const MetaGroups& groups = {});
