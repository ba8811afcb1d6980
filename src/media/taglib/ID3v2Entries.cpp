#include "media/taglib/ChapterIds.h"
#include "media/taglib/TagEntries.h"

#include <memory>
#include <taglib/attachedpictureframe.h>
#include <taglib/commentsframe.h>
#include <taglib/generalencapsulatedobjectframe.h>
#include <taglib/id3v2frame.h>
#include <taglib/id3v2framefactory.h>
#include <taglib/id3v2header.h>
#include <taglib/popularimeterframe.h>
#include <taglib/privateframe.h>
#include <taglib/textidentificationframe.h>
#include <taglib/uniquefileidentifierframe.h>
#include <taglib/unknownframe.h>
#include <taglib/unsynchronizedlyricsframe.h>
#include <taglib/urllinkframe.h>

namespace platform::taglib {

namespace {

namespace ID3v2 = TagLib::ID3v2;

constexpr const char* kSystem = "ID3v2";

std::string bytesAsText(const TagLib::ByteVector& bytes)
{
    return {bytes.data(), bytes.size()};
}

/// `id` and the details that distinguish it from others of its kind.
std::string keyOf(const ID3v2::Frame& frame, std::initializer_list<std::string> details)
{
    std::string key = bytesAsText(frame.frameID());
    for (const std::string& detail : details)
        key += detail.empty() ? "" : ":" + detail;
    return key;
}

bool isHidden(const ID3v2::Frame& frame)
{
    const std::string id = bytesAsText(frame.frameID());
    return id == kChapter.hidden || id == kContents.hidden;
}

/// A text under the name that TagLib gives it.
template <typename Frame>
EmbeddedTag namedEntry(const Frame& frame, std::initializer_list<std::string> details, const TagLib::StringList& values)
{
    TagLib::StringList decoded = values;
    if constexpr (requires { frame.textEncoding(); })
        for (TagLib::String& value : decoded)
            value = frame.textEncoding() == TagLib::String::Latin1 ? byUse(value) : value;
    EmbeddedTag entry = textEntry(kSystem, keyOf(frame, details), decoded);
    entry.name = commonName(frame.asProperties());
    return entry;
}

template <typename Frame>
EmbeddedTag languageEntry(const Frame& frame)
{
    // Kept: a language of three NUL bytes means none.
    const TagLib::ByteVector language = frame.language();
    const std::string code = language.isEmpty() || language[0] == '\0' ? std::string() : bytesAsText(language);
    return namedEntry(frame, {code, utf8(frame.description())}, frame.text());
}

EmbeddedTag pictureEntry(const ID3v2::AttachedPictureFrame& frame)
{
    EmbeddedTag entry = dataEntry(kSystem, keyOf(frame, {}), frame.picture());
    entry.mimeType = utf8(frame.mimeType());
    entry.pictureKind = pictureKind(frame.type());
    entry.description = utf8(frame.description());
    return entry;
}

/// Adds the texts of the frames inside a chapter, which `bytes` hold one after another.
void addInnerTexts(const TagLib::ByteVector& bytes, const ID3v2::Header& header, TagLib::StringList& values)
{
    for (unsigned int at = 0; at < bytes.size();) {
        const std::unique_ptr<ID3v2::Frame> inner(ID3v2::FrameFactory::instance()->createFrame(bytes.mid(at), &header));
        if (!inner)
            return;
        at += ID3v2::Frame::headerSize(header.majorVersion()) + inner->size();
        if (dynamic_cast<const ID3v2::TextIdentificationFrame*>(inner.get()) != nullptr)
            values.append(inner->toString());
    }
}

/// A chapter ("ID3v2 Chapter Frame Addendum" 1.0): an id that ends with a NUL byte, start and end in milliseconds, byte
/// offsets, and frames that describe it. For a table of contents: an id and the ids of its entries.
EmbeddedTag chapterEntry(const ID3v2::UnknownFrame& frame, const ID3v2::Header& header)
{
    const TagLib::ByteVector data = frame.data();
    const int idEnd = data.find('\0');
    const std::string id = idEnd > 0 ? bytesAsText(data.mid(0, static_cast<unsigned int>(idEnd))) : std::string();
    const auto body = static_cast<unsigned int>(idEnd + 1);
    TagLib::StringList values;
    if (bytesAsText(frame.frameID()) == kContents.hidden) {
        constexpr unsigned int kFlagsAndCount = 2;
        if (idEnd < 0 || data.size() < body + kFlagsAndCount)
            return dataEntry(kSystem, keyOf(frame, {}), data);
        auto count = static_cast<unsigned char>(data[static_cast<int>(body) + 1]);
        auto at = static_cast<int>(body + kFlagsAndCount);
        for (int end = data.find('\0', static_cast<unsigned int>(at)); count > 0 && end >= 0; --count) {
            values.append(TagLib::String(
                bytesAsText(data.mid(static_cast<unsigned int>(at), static_cast<unsigned int>(end - at)))));
            at = end + 1;
            end = data.find('\0', static_cast<unsigned int>(at));
        }
    } else {
        constexpr unsigned int kTimesAndOffsets = 16;
        if (idEnd < 0 || data.size() < body + kTimesAndOffsets)
            return dataEntry(kSystem, keyOf(frame, {}), data);
        values.append(TagLib::String(std::to_string(data.toUInt(body)) + " ms"));
        values.append(TagLib::String(std::to_string(data.toUInt(body + 4)) + " ms"));
        addInnerTexts(data.mid(body + kTimesAndOffsets), header, values);
    }
    return textEntry(kSystem, keyOf(frame, {id}), values);
}

EmbeddedTag entryOf(const ID3v2::Frame& frame, const ID3v2::Header& header)
{
    if (const auto* user = dynamic_cast<const ID3v2::UserTextIdentificationFrame*>(&frame)) {
        TagLib::StringList values = user->fieldList();
        if (!values.isEmpty())
            values.erase(values.begin()); // removes the description
        return namedEntry(*user, {utf8(user->description())}, values);
    }
    if (const auto* text = dynamic_cast<const ID3v2::TextIdentificationFrame*>(&frame))
        return namedEntry(*text, {}, text->fieldList());
    if (const auto* comment = dynamic_cast<const ID3v2::CommentsFrame*>(&frame))
        return languageEntry(*comment);
    if (const auto* lyrics = dynamic_cast<const ID3v2::UnsynchronizedLyricsFrame*>(&frame))
        return languageEntry(*lyrics);
    if (const auto* user = dynamic_cast<const ID3v2::UserUrlLinkFrame*>(&frame))
        return namedEntry(*user, {utf8(user->description())}, user->url());
    if (const auto* link = dynamic_cast<const ID3v2::UrlLinkFrame*>(&frame))
        return namedEntry(*link, {}, link->url());
    if (const auto* picture = dynamic_cast<const ID3v2::AttachedPictureFrame*>(&frame))
        return pictureEntry(*picture);
    if (const auto* rating = dynamic_cast<const ID3v2::PopularimeterFrame*>(&frame))
        return textEntry(kSystem, keyOf(frame, {utf8(rating->email())}),
                         TagLib::String::number(rating->rating()) + " of 255");
    if (const auto* unique = dynamic_cast<const ID3v2::UniqueFileIdentifierFrame*>(&frame))
        return dataEntry(kSystem, keyOf(frame, {utf8(unique->owner())}), unique->identifier());
    if (const auto* owned = dynamic_cast<const ID3v2::PrivateFrame*>(&frame))
        return dataEntry(kSystem, keyOf(frame, {utf8(owned->owner())}), owned->data());
    if (const auto* object = dynamic_cast<const ID3v2::GeneralEncapsulatedObjectFrame*>(&frame)) {
        EmbeddedTag entry = dataEntry(kSystem, keyOf(frame, {utf8(object->fileName())}), object->object());
        entry.mimeType = utf8(object->mimeType());
        entry.description = utf8(object->description());
        return entry;
    }
    if (const auto* unknown = dynamic_cast<const ID3v2::UnknownFrame*>(&frame))
        return isHidden(frame) ? chapterEntry(*unknown, header) : dataEntry(kSystem, keyOf(frame, {}), unknown->data());
    return textEntry(kSystem, keyOf(frame, {}), frame.toString());
}

} // namespace

void addID3v2(const ID3v2::Tag& tag, Entries& entries)
{
    for (const ID3v2::Frame* frame : tag.frameList())
        entries.push_back(entryOf(*frame, *tag.header()));
}

} // namespace platform::taglib
