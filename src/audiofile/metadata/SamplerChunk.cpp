#include "audiofile/metadata/SamplerChunk.h"

std::optional<SamplerChunk> SamplerChunk::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto fields = takeRecord<SamplerFields>(reader, order);
    const auto loopCount = reader.read<std::uint32_t>();
    const auto dataSize = reader.read<std::uint32_t>();
    if (!fields || !reader.ok())
        return std::nullopt;
    SamplerChunk chunk;
    static_cast<SamplerFields&>(chunk) = *fields;
    chunk.loops = takeRecords<SamplerLoop>(reader, loopCount, order);
    chunk.missingLoops = loopCount - static_cast<std::uint32_t>(chunk.loops.size());
    // Half a loop is not data of the manufacturer.
    if (chunk.missingLoops == 0) {
        const BytesView data = reader.take(std::min<std::size_t>(dataSize, reader.remaining()));
        chunk.samplerData.assign(data.begin(), data.end());
    }
    chunk.missingSamplerData = dataSize - static_cast<std::uint32_t>(chunk.samplerData.size());
    chunk.behind = takeRest(reader);
    return chunk;
}

Bytes SamplerChunk::write(std::endian order) const
{
    ByteWriter writer(order);
    putRecord<SamplerFields>(writer, *this, order);
    writer.write(static_cast<std::uint32_t>(loops.size()) + missingLoops);
    writer.write(static_cast<std::uint32_t>(samplerData.size()) + missingSamplerData);
    for (const SamplerLoop& loop : loops)
        putRecord(writer, loop, order);
    writer.write(samplerData);
    writer.write(behind);
    return writer.take();
}
