// The types of audio files: their extensions, the suffixes of the two halves of a stereo pair, and their names for
// people.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>
#include <string_view>

/// One row of the audio file type table. Texts are lower case apart from the channel letter. Rows without suffixes
/// have empty ones, which match no name.
struct AudioFileTypeRow {
    std::uint32_t type;        // a four-character code; 0 in the end row
    std::uint8_t suffixLength; // in bytes, of both suffixes
    char extension[7];         // with its dot; NUL-terminated
    char leftSuffix[7];        // such as ".L.wav"; NUL-terminated
    char rightSuffix[7];       // such as ".R.wav"; NUL-terminated
    const char* displayName;   // English, a literal
};

/// One row of the table from extensions to types; the end row has an empty extension and type 0.
struct AudioFileExtensionRow {
    std::string extension; // without dot, lower case
    std::uint32_t type;    // a four-character code
};

inline constexpr int kAudioFileTypeRows = 11;                  // without the end row
inline constexpr int kStereoSuffixes = 2 * kAudioFileTypeRows; // the stereo indices are 0 to this, less one

/// Row `index` of the audio file type table, 0 to kAudioFileTypeRows; null for a negative index, undefined above.
KT_EXPORT const AudioFileTypeRow* CFileUtilAudioFileType(int index);
/// The first row of the type; for an unknown one the end row, whose display name is "Original Type".
KT_EXPORT const AudioFileTypeRow* CFileUtilGetPointAudioFileType(unsigned int type);
/// The first row of the extension table; the end row ends it.
KT_EXPORT const AudioFileExtensionRow* CFileUtilAudioFileExtensions();

/// The type of the file's extension, in any case; 0 for an unknown one.
KT_EXPORT unsigned int CFileUtilFileType(const CFileRef& file);
/// The type of an extension without its dot, in any case; 0 for an unknown one.
KT_EXPORT unsigned int CFileUtilFileTypeOfExtension(std::string_view extension);
/// Whether the type is "M4A ", "MPG3", "MooV", "ac-3", "adts" or "mpg4".
KT_EXPORT bool CFileUtilIsCompressedFileType(const CFileRef& file);
/// Whether the type is "M4V ", "MPEG", "MXF ", "MooV", "dvc!" or "mpg4".
KT_EXPORT bool CFileUtilIsMovieFileType(const CFileRef& file);
