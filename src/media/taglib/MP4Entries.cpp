#include "media/taglib/TagEntries.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace platform::taglib {

namespace {

namespace MP4 = TagLib::MP4;
using TagLib::String;

constexpr const char* kSystem = "MP4";

// Kinds of value of the known names, which TagLib does not publish.
constexpr std::array<std::string_view, 2> kPairs = {"trkn", "disk"};
constexpr std::array<std::string_view, 5> kSwitches = {"cpil", "pgap", "pcst", "hdvd", "shwm"};
constexpr std::array<std::string_view, 13> kNumbers = {"tmpo", "stik",        "rtng",       "akID", "tvsn",
                                                       "tves", "cnID",        "sfID",       "atID", "geID",
                                                       "cmID", "\xC2\xA9mvi", "\xC2\xA9mvc"};

template <std::size_t N>
bool isOneOf(const std::array<std::string_view, N>& names, std::string_view key)
{
    return std::find(names.begin(), names.end(), key) != names.end();
}

String pairText(MP4::Item::IntPair pair)
{
    return String::number(pair.first) + (pair.second > 0 ? "/" + String::number(pair.second) : String());
}

const char* imageType(MP4::CoverArt::Format format)
{
    switch (format) {
    case MP4::CoverArt::JPEG:
        return "image/jpeg";
    case MP4::CoverArt::PNG:
        return "image/png";
    case MP4::CoverArt::BMP:
        return "image/bmp";
    case MP4::CoverArt::GIF:
        return "image/gif";
    default:
        return "";
    }
}

} // namespace

void addMP4(MP4::Tag& tag, Entries& entries)
{
    for (const auto& [name, item] : tag.itemMap()) {
        const std::string key = utf8(name);
        if (key == "covr") {
            for (const MP4::CoverArt& art : item.toCoverArtList()) {
                entries.push_back(dataEntry(kSystem, key, art.data()));
                entries.back().mimeType = imageType(art.format());
                entries.back().pictureKind = "Front Cover";
            }
            continue;
        }
        if (isOneOf(kPairs, key))
            entries.push_back(textEntry(kSystem, key, pairText(item.toIntPair())));
        else if (isOneOf(kSwitches, key))
            entries.push_back(textEntry(kSystem, key, String(item.toBool() ? "1" : "0")));
        else if (isOneOf(kNumbers, key))
            entries.push_back(textEntry(kSystem, key, String::number(item.toInt())));
        else if (key == "plID")
            entries.push_back(textEntry(kSystem, key, String(std::to_string(item.toLongLong()))));
        else if (!item.toStringList().isEmpty())
            entries.push_back(textEntry(kSystem, key, item.toStringList()));
        else {
            for (const TagLib::ByteVector& bytes : item.toByteVectorList())
                entries.push_back(dataEntry(kSystem, key, bytes));
            continue;
        }
        MP4::Tag alone;
        alone.setItem(name, item);
        entries.back().name = commonName(alone.properties());
    }
}

} // namespace platform::taglib
