#include "loops/tagging/CAFPayloads.h"

#include "loops/tagging/Chunks.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>
#include <new>
#include <stdexcept>

namespace {

/// Runs a builder on an empty writer; null if memory is short.
template <class Build>
std::optional<Bytes> built(Build build)
try {
    ByteWriter writer;
    build(writer);
    return writer.take();
} catch (const std::bad_alloc&) {
    return std::nullopt;
} catch (const std::length_error&) {
    return std::nullopt;
}

void writeUUID(ByteWriter& writer, FourCC chunkID)
{
    writer.write(std::as_bytes(std::span(*chunkIDToCafChunkUUID(chunkID))));
}

void writeCString(ByteWriter& writer, std::string_view text)
{
    writer.write(bytesOf(text.substr(0, text.find('\0'))));
    writer.write(std::uint8_t{0});
}

void writePairs(ByteWriter& writer, const tagging::StringPairs& strings)
{
    writer.write(static_cast<std::uint32_t>(strings.size()));
    for (const auto& [key, value] : strings) {
        writeCString(writer, key);
        writeCString(writer, value);
    }
}

std::optional<Bytes> dataBehindUUID(FourCC chunkID, BytesView data)
{
    return built([&](ByteWriter& writer) {
        writeUUID(writer, chunkID);
        writer.write(data);
    });
}

} // namespace

void tagging::ForEachCAFInfoString(BytesView payload,
                                   const std::function<void(std::string_view key, std::string_view value)>& visit)
{
    ByteReader reader(payload);
    const auto count = reader.read<std::uint32_t>();
    std::string_view rest = textOf(reader.rest());
    const auto nextText = [&rest] {
        const std::string_view text = rest.substr(0, rest.find('\0'));
        rest.remove_prefix(std::min(text.size() + 1, rest.size()));
        return text;
    };
    for (std::uint32_t i = 0; i < count && !rest.empty(); ++i) {
        const std::string_view key = nextText();
        if (rest.empty())
            return; // a key without a value
        visit(key, nextText());
    }
}

std::optional<Bytes> CAFInfoStringsData(const tagging::StringPairs& strings)
{
    return built([&](ByteWriter& writer) { writePairs(writer, strings); });
}

std::optional<Bytes> CAFBasicUUIDChunkData(const tagging::StringPairs& strings)
{
    return built([&](ByteWriter& writer) {
        writeUUID(writer, tagging::kBasicTagging);
        writePairs(writer, strings);
    });
}

std::optional<Bytes> CAFTransientUUIDChunkData(const std::int64_t* positions, std::int64_t count)
{
    constexpr std::int64_t most = UINT32_MAX / sizeof(tagging::CAFTransientRecord); // an item's size has 32 bits
    const std::int64_t records = std::max<std::int64_t>(count, 0);
    if (records > most || (positions == nullptr && records > 0))
        return std::nullopt;
    return built([&](ByteWriter& writer) {
        writer.reserve(tagging::kUUIDSize + sizeof(tagging::CAFTransientsPayload) +
                       static_cast<std::size_t>(records) * sizeof(tagging::CAFTransientRecord));
        writeUUID(writer, tagging::kTransients);
        writer.writeZeros(4);
        writer.write(std::uint16_t{1}); // version
        writer.writeZeros(6);           // reserved, detection percentage, force division
        writer.write(records);
        for (std::int64_t i = 0; i < records; ++i) {
            writer.write(std::uint16_t{1}); // type
            writer.writeZeros(2);
            writer.write(static_cast<std::uint64_t>(positions[i]));
        }
    });
}

std::optional<Bytes> CAFGenerativeInstrumentsUUIDChunkData(BytesView data)
{
    return dataBehindUUID(tagging::kGenerativeInstrument, data);
}

std::optional<Bytes> CAFStepSequencerUUIDChunkData(BytesView data)
{
    return dataBehindUUID(tagging::kStepSequencer, data);
}

std::optional<Bytes> CAFAdditionalLoopDataUUIDChunkData(BytesView data)
{
    return dataBehindUUID(tagging::kEventSequence, data);
}
