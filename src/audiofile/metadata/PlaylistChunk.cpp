#include "audiofile/metadata/PlaylistChunk.h"

std::optional<PlaylistChunk> PlaylistChunk::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return std::nullopt;
    PlaylistChunk list;
    list.segments = takeRecords<PlaylistSegment>(reader, count, order);
    list.missingSegments = count - static_cast<std::uint32_t>(list.segments.size());
    list.behind = takeRest(reader);
    return list;
}

Bytes PlaylistChunk::write(std::endian order) const
{
    ByteWriter writer(order);
    writer.write(static_cast<std::uint32_t>(segments.size()) + missingSegments);
    for (const PlaylistSegment& segment : segments)
        putRecord(writer, segment, order);
    writer.write(behind);
    return writer.take();
}
