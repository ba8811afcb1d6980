#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"
#include "tool/meta/MetaReaders.h"
#include "tool/meta/TagReader.h"

bool readText(const MetaChunk& chunk, const MetaSource&, MetaFields& fields)
{
    const std::string_view text = textOf(chunk.body);
    fields.text("", text.substr(0, text.find_last_not_of('\0') + 1));
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
    return true;
}
