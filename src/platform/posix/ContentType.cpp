#include "platform/ContentType.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <string_view>

namespace platform {

namespace {

struct Conformance {
    std::string_view type;
    std::string_view parent; // empty at the top; a type with two parents has two rows
};

constexpr Conformance conformances[] = {
    {"public.item", ""},
    {"public.content", ""},
    {"public.data", "public.item"},
    {"public.directory", "public.item"},
    {"public.folder", "public.directory"},
    {"public.text", "public.data"},
    {"public.text", "public.content"},
    {"public.plain-text", "public.text"},
    {"public.xml", "public.text"},
    {"public.json", "public.text"},
    {"public.image", "public.data"},
    {"public.image", "public.content"},
    {"public.png", "public.image"},
    {"public.jpeg", "public.image"},
    {"public.audiovisual-content", "public.data"},
    {"public.audiovisual-content", "public.content"},
    {"public.movie", "public.audiovisual-content"},
    {"public.video", "public.movie"},
    {"public.mpeg", "public.movie"},
    {"public.mpeg-4", "public.movie"},
    {"public.avi", "public.movie"},
    {"public.audio", "public.audiovisual-content"},
    {"public.aiff-audio", "public.audio"},
    {"public.aifc-audio", "public.aiff-audio"},
    {"public.waveform-audio", "public.audio"},
    {"public.mp2", "public.audio"},
    {"public.mp3", "public.audio"},
    {"public.mpeg-4-audio", "public.audio"},
    {"public.aac-audio", "public.audio"},
    {"public.ac3-audio", "public.audio"},
    {"public.enhanced-ac3-audio", "public.audio"},
    {"public.ulaw-audio", "public.audio"},
    {"public.midi-audio", "public.audio"},
    {"org.xiph.flac", "public.audio"},
    {"org.xiph.ogg-audio", "public.audio"},
    {"org.xiph.opus", "public.audio"},
};

struct MIMEName {
    std::string_view name; // a whole type, or all of "audio/"
    std::string_view type;
    bool isFamily = false; // stands for each type without a row, as a special case of `type`
};

constexpr MIMEName mimeNames[] = {
    {"audio/aiff", "public.aiff-audio"},
    {"audio/x-aiff", "public.aiff-audio"},
    {"audio/wav", "public.waveform-audio"},
    {"audio/wave", "public.waveform-audio"},
    {"audio/x-wav", "public.waveform-audio"},
    {"audio/vnd.wave", "public.waveform-audio"},
    {"audio/mpeg", "public.mp3"},
    {"audio/mp3", "public.mp3"},
    {"audio/mp4", "public.mpeg-4-audio"},
    {"audio/x-m4a", "public.mpeg-4-audio"},
    {"audio/aac", "public.aac-audio"},
    {"audio/ac3", "public.ac3-audio"},
    {"audio/eac3", "public.enhanced-ac3-audio"},
    {"audio/basic", "public.ulaw-audio"},
    {"audio/midi", "public.midi-audio"},
    {"audio/x-midi", "public.midi-audio"},
    {"audio/flac", "org.xiph.flac"},
    {"audio/x-flac", "org.xiph.flac"},
    {"audio/ogg", "org.xiph.ogg-audio"},
    {"audio/opus", "org.xiph.opus"},
    {"audio/", "public.audio", true},
    {"video/mp4", "public.mpeg-4"},
    {"video/mpeg", "public.mpeg"},
    {"video/x-msvideo", "public.avi"},
    {"video/", "public.video", true},
    {"image/png", "public.png"},
    {"image/jpeg", "public.jpeg"},
    {"image/", "public.image", true},
    {"text/plain", "public.plain-text"},
    {"text/xml", "public.xml"},
    {"text/", "public.text", true},
    {"application/xml", "public.xml"},
    {"application/json", "public.json"},
    {"application/octet-stream", "public.data"},
    {"inode/directory", "public.folder"},
};

/// Whether the last part of a vendor's identifier says that it is audio: "com.example.wave-audio",
/// "com.example.audio-format".
bool saysAudio(std::string_view identifier)
{
    return identifier.find('.') != identifier.npos && !identifier.starts_with("public.") &&
           (identifier.ends_with("-audio") || identifier.ends_with("audio-format"));
}

/// A type of the table, a MIME type of a family, or a vendor's type; `base` is empty if the type is unknown.
struct Resolved {
    std::string name;      // distinguishes types
    std::string_view base; // in the table: the type itself, or the one that its family stands for
};

/// Identifiers and MIME types ignore case, and a MIME type's parameters ("audio/L16;rate=48000") are dropped.
Resolved resolve(const String& identifier)
{
    std::string name = identifier.utf8();
    std::transform(name.begin(), name.end(), name.begin(), asciiLower);
    if (name.find('/') == name.npos) {
        const auto* known = std::find_if(std::begin(conformances), std::end(conformances),
                                         [&](const Conformance& entry) { return entry.type == name; });
        if (known != std::end(conformances))
            return {name, known->type};
        return {name, saysAudio(name) ? std::string_view("public.audio") : std::string_view()};
    }
    name.erase(std::min(name.find_first_of("; \t"), name.size()));
    for (const MIMEName& mime : mimeNames) {
        if (mime.isFamily && name.starts_with(mime.name) && name.size() > mime.name.size())
            return {name, mime.type};
        if (!mime.isFamily && name == mime.name)
            return {std::string(mime.type), mime.type};
    }
    return {};
}

bool conforms(std::string_view type, std::string_view other)
{
    if (type == other)
        return true;
    return std::any_of(std::begin(conformances), std::end(conformances), [&](const Conformance& entry) {
        return entry.type == type && !entry.parent.empty() && conforms(entry.parent, other);
    });
}

} // namespace

bool ContentType::conformsTo(const ContentType& other) const
{
    const Resolved type = resolve(identifier_);
    const Resolved target = resolve(other.identifier_);
    if (type.base.empty() || target.base.empty())
        return false;
    if (type.name == target.name)
        return true;
    return target.name == target.base && conforms(type.base, target.base);
}

const ContentType& ContentType::audio()
{
    static const ContentType type(String::fromUTF8("public.audio"));
    return type;
}

const ContentType& ContentType::flac()
{
    static const ContentType type(String::fromUTF8("org.xiph.flac"));
    return type;
}

} // namespace platform
