#include "audiofile/metadata/InstrumentChunk.h"

std::optional<InstrumentChunk> InstrumentChunk::read(BytesView body)
{
    ByteReader reader(body);
    const auto fields = takeRecord<InstrumentFields>(reader, std::endian::big);
    if (!fields)
        return std::nullopt;
    return InstrumentChunk{*fields, takeRest(reader)};
}

Bytes InstrumentChunk::write() const
{
    ByteWriter writer;
    putRecord<InstrumentFields>(writer, *this, std::endian::big);
    writer.write(behind);
    return writer.take();
}
