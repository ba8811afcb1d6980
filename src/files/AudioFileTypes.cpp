#include "files/AudioFileTypes.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <array>
#include <initializer_list>
#include <map>
#include <string_view>

namespace {

constexpr std::array<AudioFileTypeRow, kAudioFileTypeRows + 1> kTypes{{
    {fourCC("AIFF"), 6, ".aif", ".L.aif", ".R.aif", "AIFF File"},
    {fourCC("AIFF"), 4, ".aif", ".ail", ".air", "AIFF File"},
    {fourCC("AIFF"), 5, ".aiff", "", "", "AIFF File"},
    {fourCC("WAVE"), 6, ".wav", ".L.wav", ".R.wav", "Wave File PC"},
    {fourCC("WAVE"), 4, ".wav", ".wal", ".war", "Wave File PC"},
    // Kept: this row is found by its type only; its suffixes are found in the rows above.
    {fourCC(".WAV"), 6, ".wav", ".L.wav", ".R.wav", "Wave File PC"},
    {fourCC(".WAV"), 4, ".wav", ".wal", ".war", "Wave File PC"},
    {fourCC("caff"), 6, ".caf", ".L.caf", ".R.caf", "CAF File"},
    {fourCC("MPG3"), 6, ".mp3", ".L.mp3", ".R.mp3", "MP3 File"},
    {fourCC("mpg4"), 4, ".mp4", "", "", "MP4 File"},
    {fourCC("M4A "), 6, ".m4a", ".L.m4a", ".R.m4a", "AAC File"},
    {0, 0, "", "", "", "Original Type"},
}};

const std::array<AudioFileExtensionRow, 33> kExtensions{{
    {"aiff", fourCC("AIFF")}, {"aif", fourCC("AIFF")},  {"ail", fourCC("AIFF")},
    {"air", fourCC("AIFF")},  {"aifc", fourCC("AIFF")}, {"wave", fourCC("WAVE")},
    {"wav", fourCC("WAVE")},  {"war", fourCC("WAVE")},  {"wal", fourCC("WAVE")},
    {"caf", fourCC("caff")},  {"aac", fourCC("adts")},  {"au", fourCC("NeXT")},
    {"snd", fourCC("NeXT")},  {"ac3", fourCC("ac-3")},  {"rex", fourCC("REX ")},
    {"rx2", fourCC("REX2")},  {"rcy", fourCC("RCSO")},  {"mp3", fourCC("MPG3")},
    {"mp4", fourCC("mpg4")},  {"m4v", fourCC("mpg4")},  {"m4a", fourCC("M4A ")},
    {"adts", fourCC("adts")}, {"mov", fourCC("MooV")},  {"dv", fourCC("MooV")},
    {"dvc", fourCC("MooV")},  {"avi", fourCC("MooV")},  {"mpg", fourCC("MooV")},
    {"mpeg", fourCC("MooV")}, {"ubs", fourCC(".ubs")},  {"midi", fourCC("Midi")},
    {"mid", fourCC("Midi")},  {"mxf", fourCC("MXF ")},  {"", 0},
}};

using TypesByExtension = std::map<std::string_view, std::uint32_t>;

const TypesByExtension& typesByExtension()
{
    static const TypesByExtension types = [] {
        TypesByExtension made;
        for (const AudioFileExtensionRow& row : kExtensions)
            if (!row.extension.empty())
                made.emplace(row.extension, row.type);
        return made;
    }();
    return types;
}

bool isTypeOneOf(const CFileRef& file, std::initializer_list<std::uint32_t> types)
{
    return std::find(types.begin(), types.end(), CFileUtilFileType(file)) != types.end();
}

} // namespace

const AudioFileTypeRow* CFileUtilAudioFileType(int index)
{
    return index < 0 ? nullptr : &kTypes[static_cast<std::size_t>(index)];
}

const AudioFileTypeRow* CFileUtilGetPointAudioFileType(unsigned int type)
{
    return std::find_if(kTypes.begin(), kTypes.end() - 1,
                        [type](const AudioFileTypeRow& row) { return row.type == type; });
}

const AudioFileExtensionRow* CFileUtilAudioFileExtensions()
{
    return kExtensions.data();
}

unsigned int CFileUtilFileTypeOfExtension(std::string_view extension)
{
    std::array<char, 4> lowered; // the longest has four characters
    if (extension.size() > lowered.size())
        return 0;
    std::transform(extension.begin(), extension.end(), lowered.begin(), asciiLower);
    const TypesByExtension& types = typesByExtension();
    const auto found = types.find({lowered.data(), extension.size()});
    return found == types.end() ? 0 : found->second;
}

unsigned int CFileUtilFileType(const CFileRef& file)
{
    const platform::String extension = file.CopyFileExtension();
    return extension.isNull() ? 0 : CFileUtilFileTypeOfExtension(extension.utf8());
}

bool CFileUtilIsCompressedFileType(const CFileRef& file)
{
    return isTypeOneOf(
        file, {fourCC("M4A "), fourCC("MPG3"), fourCC("MooV"), fourCC("ac-3"), fourCC("adts"), fourCC("mpg4")});
}

bool CFileUtilIsMovieFileType(const CFileRef& file)
{
    return isTypeOneOf(
        file, {fourCC("M4V "), fourCC("MPEG"), fourCC("MXF "), fourCC("MooV"), fourCC("dvc!"), fourCC("mpg4")});
}
