#include "audiofile/metadata/AIFFInstrumentChunk.h"

std::optional<AIFFInstrumentChunk> AIFFInstrumentChunk::read(BytesView body)
{
    ByteReader reader(body);
    const auto fields = takeRecord<AIFFInstrumentFields>(reader, std::endian::big);
    if (!fields)
        return std::nullopt;
    return AIFFInstrumentChunk{*fields, takeRest(reader)};
}

Bytes AIFFInstrumentChunk::write() const
{
    ByteWriter writer;
    putRecord<AIFFInstrumentFields>(writer, *this, std::endian::big);
    writer.write(behind);
    return writer.take();
}
