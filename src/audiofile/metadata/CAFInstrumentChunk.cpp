#include "audiofile/metadata/CAFInstrumentChunk.h"

std::optional<CAFInstrumentChunk> CAFInstrumentChunk::read(BytesView body)
{
    ByteReader reader(body);
    const auto fields = takeRecord<CAFInstrumentFields>(reader, std::endian::big);
    if (!fields)
        return std::nullopt;
    return CAFInstrumentChunk{*fields, takeRest(reader)};
}

Bytes CAFInstrumentChunk::write() const
{
    ByteWriter writer;
    putRecord<CAFInstrumentFields>(writer, *this, std::endian::big);
    writer.write(behind);
    return writer.take();
}
