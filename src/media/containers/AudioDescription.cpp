#include "media/containers/AudioDescription.h"

#include "media/containers/StoredFormat.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

/// The first bytes of a chunk's body, at most `most`; empty when it has fewer than `least`.
Bytes bodyOf(const BodyReader& readBody, const Chunk* chunk, std::size_t least, std::size_t most)
{
    if (chunk == nullptr || chunk->size < least)
        return {};
    Bytes body(static_cast<std::size_t>(std::min<std::uint64_t>(chunk->size, most)));
    if (readBody(*chunk, body.data(), body.size()) != kStatusOK)
        return {};
    return body;
}

std::optional<StoredFormat> readFormat(const BodyReader& readBody, const ContainerLayout& layout)
{
    const auto body = [&](FourCC id) { return bodyOf(readBody, layout.find(id), 0, kMostOfStoredFormat); };
    switch (layout.kind) {
    case ContainerKind::riff:
    case ContainerKind::wave64:
        return storedFormatOfWAVE(body(fourCC("fmt ")), layout.order());
    case ContainerKind::iff:
        return storedFormatOfAIFF(body(fourCC("COMM")), layout.fileType == fourCC("AIFC"));
    case ContainerKind::caf:
        return storedFormatOfCAF(body(fourCC("desc")));
    case ContainerKind::au:
        return storedFormatOfAU(body(fourCC(".snd")));
    case ContainerKind::rex2:
        break;
    }
    return std::nullopt;
}

/// The packets that a CAF file of packets in differing sizes counts in its packet table.
std::uint64_t packetsOfTable(const BodyReader& readBody, const ContainerLayout& layout)
{
    const Bytes body = bodyOf(readBody, layout.find(fourCC("pakt")), 24, 24);
    return body.empty() ? 0 : static_cast<std::uint64_t>(std::max<std::int64_t>(0, loadBE<std::int64_t>(body.data())));
}

/// Finds the samples in "data" or "SSND". AIFF that counts no frames need have none.
std::int32_t locateData(const BodyReader& readBody, const ContainerLayout& layout, const StoredFormat& format,
                        AudioDescription& description)
{
    constexpr std::uint64_t editCountSize = 4;
    const Chunk* data = layout.find(layout.audioDataId());
    if (data == nullptr)
        return layout.kind == ContainerKind::iff && format.countedPackets == 0 ? kStatusOK : kStatusIOError;
    std::uint64_t lead = 0; // ahead of the samples, in the body
    if (layout.kind == ContainerKind::caf)
        lead = std::min(editCountSize, data->size);
    if (layout.kind == ContainerKind::iff)
        lead = soundDataLead(data->size, bodyOf(readBody, data, 4, 4));
    description.dataOffset = layout.bodyOf(*data) + lead;
    description.byteCount = data->size - lead;
    return kStatusOK;
}

} // namespace

std::int32_t describeAudio(const BodyReader& readBody, const ContainerLayout& layout, AudioDescription& description)
{
    description = {};
    const auto stored = readFormat(readBody, layout);
    if (!stored)
        return kStatusIOError;
    const StreamDescription& format = description.format = stored->stream;
    if (format.channelsPerFrame == 0 || (format.isLinearPCM() && format.bytesPerPacket == 0))
        return kStatusIOError;
    if (const std::int32_t located = locateData(readBody, layout, *stored, description); located != kStatusOK)
        return located;
    const std::uint64_t counted = stored->countedPackets;
    if (format.bytesPerPacket > 0) {
        description.packetCount = description.byteCount / format.bytesPerPacket;
        if (counted > 0 && counted < description.packetCount && format.isLinearPCM()) {
            description.packetCount = counted;
            description.byteCount = counted * format.bytesPerPacket;
        }
    } else {
        description.packetCount = layout.kind == ContainerKind::caf ? packetsOfTable(readBody, layout) : counted;
    }
    return kStatusOK;
}

} // namespace platform
