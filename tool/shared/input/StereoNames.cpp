#include "tool/shared/input/StereoNames.h"

#include "files/AudioFileNames.h"
#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <vector>

#include <sys/stat.h>

namespace {

bool isFile(const std::string& path)
{
    struct stat status = {};
    return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

/// All spellings of a short text in upper and lower case, the given one first.
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

std::string lowerCase(std::string_view text)
{
    std::string lower(text);
    std::transform(lower.begin(), lower.end(), lower.begin(), asciiLower);
    return lower;
}

bool isAudioExtension(std::string_view extension)
{
    constexpr std::array<std::string_view, 20> known{".wav",  ".wave", ".bwf", ".rf64", ".w64",  ".aif", ".aiff",
                                                     ".aifc", ".caf",  ".snd", ".au",   ".flac", ".wv",  ".ape",
                                                     ".mp3",  ".m4a",  ".aac", ".ogg",  ".opus", ".sd2"};
    return std::ranges::find(known, lowerCase(extension)) != known.end();
}

char asciiUpper(char c)
{
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

std::string upperCase(std::string_view text)
{
    std::string upper(text);
    std::transform(upper.begin(), upper.end(), upper.begin(), asciiUpper);
    return upper;
}

/// The sides at the end of a name, before the extension.
struct Sides {
    std::string_view left, right;
};
constexpr Sides kSides[] = {{".l", ".r"},        {"_l", "_r"},         {"-l", "-r"},        {" l", " r"},
                            {"(l)", "(r)"},      {".left", ".right"},  {"_left", "_right"}, {"-left", "-right"},
                            {" left", " right"}, {"(left)", "(right)"}};

/// Spells the other side like `given`: "Left" and "Right", "LEFT" and "RIGHT".
std::string inCaseOf(std::string_view given, std::string_view other)
{
    const auto isLower = [](char c) { return c >= 'a' && c <= 'z'; };
    const auto isUpper = [](char c) { return c >= 'A' && c <= 'Z'; };
    if (std::ranges::none_of(given, isLower))
        return upperCase(other);
    std::string text(other);
    if (std::ranges::any_of(given, isUpper)) {
        const auto first = std::ranges::find_if(text, isLower);
        std::transform(first, std::min(first + 1, text.end()), first, asciiUpper);
    }
    return text;
}

/// Finds the partner among its possible names, the most likely one first.
StereoHalf withPartner(bool isLeft, const std::vector<std::string>& names)
{
    const auto found = std::ranges::find_if(names, isFile);
    const bool exists = found != names.end();
    return {.isLeft = isLeft, .partner = exists ? *found : names.front(), .partnerExists = exists};
}

/// Programs write the suffixes, which are short, in any mixture of case.
std::vector<std::string> namesByTable(const std::string& stem, const std::string& suffix)
{
    std::vector<std::string> names = spellings(suffix);
    for (std::string& name : names)
        name.insert(0, stem);
    return names;
}

std::vector<std::string> namesByCase(const std::string& stem, std::string_view given, std::string_view other,
                                     const std::string& extension)
{
    std::vector<std::string> names;
    for (const std::string_view side : {given, std::string_view("l"), std::string_view("L"), std::string_view("Le")})
        for (const std::string& ending : {extension, lowerCase(extension), upperCase(extension)})
            names.push_back(stem + inCaseOf(side, other) + ending);
    return names;
}

} // namespace

std::optional<StereoHalf> stereoHalf(const std::string& path)
{
    const std::size_t name = path.rfind('/') + 1;
    if (const int index = CFileUtilHasStereoExtension(path.c_str() + name); index >= 0) {
        const int point = CFileUtilGetPointExt(path.c_str() + name);
        return withPartner(index % 2 == 0, namesByTable(path.substr(0, name + static_cast<std::size_t>(point)),
                                                        CFileUtilGetStereoExtension(nullptr, index ^ 1)));
    }
    const std::size_t point = path.rfind('.');
    if (point == std::string::npos || point < name || !isAudioExtension(std::string_view(path).substr(point)))
        return std::nullopt;
    const std::string lower = lowerCase(std::string_view(path).substr(name, point - name));
    for (const Sides& sides : kSides)
        for (const bool isLeft : {true, false}) {
            const std::string_view own = isLeft ? sides.left : sides.right, other = isLeft ? sides.right : sides.left;
            if (lower.size() <= own.size() || !lower.ends_with(own))
                continue;
            const std::size_t at = point - own.size();
            return withPartner(isLeft, namesByCase(path.substr(0, at), std::string_view(path).substr(at, own.size()),
                                                   other, path.substr(point)));
        }
    return std::nullopt;
}
