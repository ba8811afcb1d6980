// The types of audio files: the extensions that mean them, the suffixes of the two halves of a stereo pair, their names
// for people.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <string>
#include <string_view>

/// One row of the audio file type table. Texts are lower case apart from the channel letter; rows without suffixes have
/// empty ones, which no name ends with.
struct AudioFileTypeRow {
    std::uint32_t type;        // 0 in the end row
    std::uint8_t suffixLength; // of both suffixes
    char extension[7];         // with its dot
    char leftSuffix[7];
    char rightSuffix[7];
    const char* displayName;
};

/// One row of the table from extensions to types; the end row has an empty extension and type 0.
struct AudioFileExtensionRow {
    std::string extension; // without dot, lower case
    std::uint32_t type;
};

inline constexpr int kAudioFileTypeRows = 11; // ahead of the end row
inline constexpr int kStereoSuffixes = 2 * kAudioFileTypeRows;

/// Row `index` of the audio file type table, 0 to kAudioFileTypeRows; null for a negative index. Above, undefined.
KT_EXPORT const AudioFileTypeRow* CFileUtilAudioFileType(int index);
/// The first row of the type; the end row, whose display name is "Original Type", for an unknown one.
KT_EXPORT const AudioFileTypeRow* CFileUtilGetPointAudioFileType(unsigned int type);
/// The first row of the extension table.
KT_EXPORT const AudioFileExtensionRow* CFileUtilAudioFileExtensions();

/// The type that the file's extension means, in any case; 0 when it means none.
KT_EXPORT unsigned int CFileUtilFileType(const CFileRef& file);
/// The same of an extension without its dot.
KT_EXPORT unsigned int CFileUtilFileTypeOfExtension(std::string_view extension);
/// Whether the type is "M4A ", "MPG3", "MooV", "ac-3", "adts" or "mpg4".
KT_EXPORT bool CFileUtilIsCompressedFileType(const CFileRef& file);
/// Whether the type is "M4V ", "MPEG", "MXF ", "MooV", "dvc!" or "mpg4".
KT_EXPORT bool CFileUtilIsMovieFileType(const CFileRef& file);
