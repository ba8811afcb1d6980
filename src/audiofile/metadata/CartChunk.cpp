#include "audiofile/metadata/CartChunk.h"

std::optional<CartChunk> CartChunk::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto fields = takeRecord<CartFields>(reader, order);
    if (!fields)
        return std::nullopt;
    return CartChunk{*fields, takeRest(reader)};
}

Bytes CartChunk::write(std::endian order) const
{
    ByteWriter writer(order);
    putRecord<CartFields>(writer, *this, order);
    writer.write(tagText);
    return writer.take();
}
