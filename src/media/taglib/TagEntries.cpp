#include "media/taglib/TagEntries.h"

#include <algorithm>
#include <array>

namespace platform::taglib {

TagLib::String byUse(const TagLib::String& text)
{
    const std::string bytes = text.isLatin1() ? text.to8Bit(false) : std::string();
    TagLib::String decoded(bytes, TagLib::String::UTF8);
    return utf8(decoded) == bytes && !bytes.empty() ? decoded : text;
}

EmbeddedTag textEntry(const char* system, std::string key, const TagLib::StringList& values)
{
    EmbeddedTag entry;
    entry.system = system;
    entry.key = std::move(key);
    for (const TagLib::String& value : values)
        entry.values.push_back(utf8(value));
    return entry;
}

EmbeddedTag dataEntry(const char* system, std::string key, const TagLib::ByteVector& bytes)
{
    EmbeddedTag entry;
    entry.system = system;
    entry.key = std::move(key);
    entry.size = bytes.size();
    const std::size_t shown = std::min<std::size_t>(bytes.size(), EmbeddedTag::kMaxHead);
    entry.head.resize(shown);
    std::transform(bytes.begin(), bytes.begin() + static_cast<long>(shown), entry.head.begin(),
                   [](char byte) { return static_cast<std::byte>(byte); });
    return entry;
}

std::string commonName(const TagLib::PropertyMap& properties)
{
    return properties.size() == 1 ? utf8(properties.begin()->first) : std::string();
}

std::string pictureKind(int number)
{
    static constexpr std::array<const char*, 21> kinds = {"Other",
                                                          "File Icon",
                                                          "Other File Icon",
                                                          "Front Cover",
                                                          "Back Cover",
                                                          "Leaflet Page",
                                                          "Media",
                                                          "Lead Artist",
                                                          "Artist",
                                                          "Conductor",
                                                          "Band",
                                                          "Composer",
                                                          "Lyricist",
                                                          "Recording Location",
                                                          "During Recording",
                                                          "During Performance",
                                                          "Movie Screen Capture",
                                                          "Coloured Fish",
                                                          "Illustration",
                                                          "Band Logo",
                                                          "Publisher Logo"};
    return number >= 0 && static_cast<std::size_t>(number) < kinds.size() ? kinds[static_cast<std::size_t>(number)]
                                                                          : std::to_string(number);
}

void addID3v1(const TagLib::ID3v1::Tag& tag, Entries& entries)
{
    const auto add = [&](const char* key, const char* name, const TagLib::String& value) {
        if (value.isEmpty())
            return;
        entries.push_back(textEntry("ID3v1", key, byUse(value)));
        entries.back().name = name;
    };
    add("title", "TITLE", tag.title());
    add("artist", "ARTIST", tag.artist());
    add("album", "ALBUM", tag.album());
    add("year", "DATE", tag.year() > 0 ? TagLib::String::number(static_cast<int>(tag.year())) : TagLib::String());
    add("comment", "COMMENT", tag.comment());
    add("track", "TRACKNUMBER",
        tag.track() > 0 ? TagLib::String::number(static_cast<int>(tag.track())) : TagLib::String());
    add("genre", "GENRE", tag.genre());
}

void addVorbisComment(TagLib::Ogg::XiphComment& comment, Entries& entries)
{
    for (const auto& [key, values] : comment.fieldListMap()) {
        entries.push_back(textEntry("Vorbis comment", utf8(key), values));
        entries.back().name = utf8(key.upper());
    }
    addPictures(comment.pictureList(), "Vorbis comment", entries);
}

void addPictures(const TagLib::List<TagLib::FLAC::Picture*>& pictures, const char* system, Entries& entries)
{
    for (const TagLib::FLAC::Picture* picture : pictures) {
        EmbeddedTag entry = dataEntry(system, "PICTURE", picture->data());
        entry.mimeType = utf8(picture->mimeType());
        entry.pictureKind = pictureKind(picture->type());
        entry.description = utf8(picture->description());
        entries.push_back(std::move(entry));
    }
}

void addAPE(TagLib::APE::Tag& tag, Entries& entries)
{
    for (const auto& [key, item] : tag.itemListMap()) {
        if (item.type() == TagLib::APE::Item::Binary) {
            entries.push_back(dataEntry("APE", utf8(item.key()), item.binaryData()));
            if (key.startsWith("COVER ART"))
                entries.back().pictureKind = utf8(item.key()).substr(std::string("Cover Art").size());
            continue;
        }
        entries.push_back(textEntry("APE", utf8(item.key()), item.values()));
        TagLib::APE::Tag alone;
        alone.setItem(item.key(), item);
        entries.back().name = commonName(alone.properties());
    }
}

void addASF(TagLib::ASF::Tag& tag, Entries& entries)
{
    const auto addText = [&](const char* key, const char* name, const TagLib::String& value) {
        if (value.isEmpty())
            return;
        entries.push_back(textEntry("ASF", key, value));
        entries.back().name = name;
    };
    addText("Title", "TITLE", tag.title());
    addText("Author", "ARTIST", tag.artist());
    addText("Copyright", "COPYRIGHT", tag.copyright());
    addText("Description", "COMMENT", tag.comment());
    addText("Rating", "", tag.rating());
    for (const auto& [key, attributes] : tag.attributeListMap())
        for (const TagLib::ASF::Attribute& attribute : attributes) {
            if (const TagLib::ASF::Picture picture = attribute.toPicture(); picture.isValid()) {
                EmbeddedTag entry = dataEntry("ASF", utf8(key), picture.picture());
                entry.mimeType = utf8(picture.mimeType());
                entry.pictureKind = pictureKind(picture.type());
                entry.description = utf8(picture.description());
                entries.push_back(std::move(entry));
            } else if (attribute.type() == TagLib::ASF::Attribute::BytesType ||
                       attribute.type() == TagLib::ASF::Attribute::GuidType) {
                entries.push_back(dataEntry("ASF", utf8(key), attribute.toByteVector()));
            } else {
                entries.push_back(textEntry("ASF", utf8(key), attribute.toString()));
                TagLib::ASF::Tag alone;
                alone.setAttribute(key, attribute);
                entries.back().name = commonName(alone.properties());
            }
        }
}

} // namespace platform::taglib
