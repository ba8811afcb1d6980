#include "tool/shared/input/FoundFile.h"

#include <algorithm>
#include <cctype>
#include <iterator>
#include <string_view>
#include <unistd.h>

namespace {

constexpr std::string_view kContainers[] = {"aif",  "aifc", "aiff", "ail", "air", "bwf", "caf",
                                            "rf64", "rx2",  "w64",  "wal", "war", "wav", "wave"};
constexpr std::string_view kOthers[] = {"aac",  "ac3", "adts", "amr", "ape", "au",  "dff", "dsf", "dts", "eac3",
                                        "flac", "m4a", "m4b",  "mka", "mp2", "mp3", "mpc", "oga", "ogg", "opus",
                                        "ra",   "rex", "snd",  "spx", "tak", "tta", "wma", "wv"};

std::string extensionOf(const std::string& path)
{
    const std::size_t dot = path.rfind('.');
    std::string extension = dot == path.npos ? "" : path.substr(dot + 1);
    std::ranges::transform(extension, extension.begin(),
                           [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return extension;
}

template <class Names>
bool isAmong(const Names& names, const std::string& name)
{
    return std::ranges::find(names, name) != std::end(names);
}

} // namespace

bool isCalledContainer(const std::string& path)
{
    return isAmong(kContainers, extensionOf(path));
}

bool isCalledAudio(const std::string& path)
{
    const std::string extension = extensionOf(path);
    return isAmong(kContainers, extension) || isAmong(kOthers, extension);
}

bool isPassedOver(const FoundFile& file, const Failure& failure)
{
    if (!file.isBelowFolder())
        return false;
    const auto* const other = dynamic_cast<const OtherKind*>(&failure);
    if (other != nullptr && other->isAudio())
        return true;
    // A dangling link matters only if its name is that of sound.
    return !isCalledAudio(file.path) && (other != nullptr || ::access(file.path.c_str(), F_OK) != 0);
}
