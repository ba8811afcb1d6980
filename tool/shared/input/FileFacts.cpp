#include "tool/shared/input/FileFacts.h"

#include "files/AudioFileNames.h"
#include "files/CFileUtilDates.h"
#include "tool/shared/input/InputFile.h"

#include <vector>

#include <sys/stat.h>

namespace {

bool isFile(const std::string& path)
{
    struct stat status = {};
    return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

/// The ways to spell a short text in upper and lower case, as it is given first.
std::vector<std::string> spellings(const std::string& text)
{
    std::vector<std::string> all{text};
    for (std::size_t at = 0; at < text.size(); ++at) {
        const bool isUpper = text[at] >= 'A' && text[at] <= 'Z', isLower = text[at] >= 'a' && text[at] <= 'z';
        if (!isUpper && !isLower)
            continue;
        for (std::size_t i = 0, count = all.size(); i < count; ++i) {
            std::string other = all[i];
            other[at] = static_cast<char>(text[at] ^ 'a' ^ 'A');
            all.push_back(std::move(other));
        }
    }
    return all;
}

} // namespace

std::optional<StereoHalf> stereoHalf(const std::string& path)
{
    const std::size_t name = path.rfind('/') + 1;
    const int index = CFileUtilHasStereoExtension(path.c_str() + name);
    const int point = CFileUtilGetPointExt(path.c_str() + name);
    if (index < 0)
        return std::nullopt;
    StereoHalf half;
    half.isLeft = index % 2 == 0;
    const std::string stem = path.substr(0, name + static_cast<std::size_t>(point));
    const std::string suffix = CFileUtilGetStereoExtension(nullptr, index ^ 1);
    half.partner = stem + suffix;
    // Programs write names in capitals, small, or in between.
    for (const std::string& candidate : spellings(suffix))
        if (isFile(stem + candidate)) {
            half.partner = stem + candidate;
            half.partnerExists = true;
            break;
        }
    return half;
}

FileFacts factsOf(const std::string& path)
{
    const CFileRef file = referenceTo(path);
    return {CFileUtilFileType(file), stereoHalf(path), CFileUtilGetModificationDate(file)};
}
