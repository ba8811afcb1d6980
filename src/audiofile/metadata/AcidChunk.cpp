#include "audiofile/metadata/AcidChunk.h"

std::optional<AcidChunk> AcidChunk::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto fields = takeRecord<AcidFields>(reader, order);
    if (!fields)
        return std::nullopt;
    return AcidChunk{*fields, takeRest(reader)};
}

Bytes AcidChunk::write(std::endian order) const
{
    ByteWriter writer(order);
    putRecord<AcidFields>(writer, *this, order);
    writer.write(behind);
    return writer.take();
}
