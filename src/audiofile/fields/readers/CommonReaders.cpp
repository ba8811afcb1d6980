#include "audiofile/fields/readers/MetaReaders.h"
#include "audiofile/fields/readers/TagReader.h"
#include "audiofile/metadata/ListChunk.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstdio>

bool readText(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const std::string_view text = textOf(chunk.body);
    fields.text("", text.substr(0, text.find_last_not_of('\0') + 1));
    return true;
}

bool anySet(BytesView bytes)
{
    return std::ranges::any_of(bytes, [](std::byte byte) { return byte != std::byte{0}; });
}

std::string clockFields(std::initializer_list<int> numbers)
{
    std::string text;
    for (const int number : numbers) {
        char digits[16];
        const int size = std::snprintf(digits, sizeof digits, "%s%02d", text.empty() ? "" : ":", number);
        text.append(digits, static_cast<std::size_t>(size));
    }
    return text;
}

/// SMPTE ST 330: a label, the length of the rest, an instance number and a material number; with 64 bytes also place
/// and time.
void addUMID(const std::string& name, BytesView umid, MetaFields& fields)
{
    constexpr std::size_t basic = 32;
    const bool isExtended = anySet(umid.subspan(basic));
    const auto nameOf = [&](std::string_view word) {
        std::string text = name + std::string(word);
        if (name.empty())
            text.front() = static_cast<char>(text.front() - 'A' + 'a');
        return text;
    };
    fields.hex(name, isExtended ? umid : umid.first(basic));
    fields.hex(nameOf("Label"), umid.first(12));
    fields.hex(nameOf("Instance"), umid.subspan(13, 3));
    fields.hex(nameOf("Material"), umid.subspan(16, 16));
    if (!isExtended)
        return;
    fields.hex(nameOf("Time"), umid.subspan(32, 8));
    fields.hex(nameOf("Place"), umid.subspan(40, 12));
    fields.text(nameOf("Country"), textUpToNUL(umid.subspan(52, 4)));
    fields.text(nameOf("Organization"), textUpToNUL(umid.subspan(56, 4)));
    fields.text(nameOf("User"), textUpToNUL(umid.subspan(60, 4)));
}

bool readUMID(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    constexpr std::size_t basic = 32, extended = 64;
    if (chunk.body.size() != basic && chunk.body.size() != extended)
        return false;
    Bytes umid = chunk.body;
    umid.resize(extended);
    addUMID("", umid, fields);
    return true;
}

bool readHex(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    constexpr std::size_t most = 64;
    if (chunk.body.size() > most)
        return false;
    fields.hex("", chunk.body);
    return true;
}

bool readPreview(const MetaChunk&, const MetaSource&, MetaFields&)
{
    return false;
}

bool readID3(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    std::vector<platform::EmbeddedTag> tags;
    platform::Error error;
    if (platform::readID3Chunk(chunk.body, tags, &error) != kStatusOK) {
        fields.preview("", chunk.body, chunk.body.size(), error.description);
        return true;
    }
    if (tags.empty())
        return false;
    for (const platform::EmbeddedTag& tag : tags)
        addTag(tag, fields);
    return true;
}

bool readPeaks(const MetaChunk& chunk, const MetaSource& source, MetaFields& fields)
{
    constexpr std::size_t peakSize = 8;
    ByteReader reader(chunk.body, source.order);
    const auto version = reader.read<std::uint32_t>(), time = reader.read<std::uint32_t>();
    if (!reader.ok())
        return false;
    fields.number("version", version);
    fields.number("timeStamp", time, "seconds since 1970");
    for (std::size_t channel = 0; reader.remaining() >= peakSize; ++channel) {
        const std::string item = itemName("channel", channel);
        fields.number(item + "value", reader.read<float>());
        fields.frames(item + "position", std::uint64_t{reader.read<std::uint32_t>()});
    }
    fields.behind(reader.take(reader.remaining()));
    return true;
}
