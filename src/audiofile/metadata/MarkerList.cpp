#include "audiofile/metadata/MarkerList.h"

#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>

namespace {

constexpr std::size_t kLongestName = 255;

bool needsPad(std::size_t nameLength)
{
    return (1 + nameLength) % 2 != 0;
}

/// Reads those of `count` markers that are complete; the last may lack its pad byte.
MarkerList markersOf(ByteReader reader, std::uint16_t count, bool padded)
{
    MarkerList list;
    list.namesArePadded = padded;
    BytesView behind = reader.rest();
    while (list.markers.size() < count) {
        AIFFMarker marker;
        marker.id = reader.read<std::int16_t>();
        marker.position = reader.read<std::uint32_t>();
        const BytesView name = reader.take(reader.read<std::uint8_t>());
        marker.name = textOf(name);
        if (padded && needsPad(name.size()))
            marker.pad = static_cast<std::byte>(reader.read<std::uint8_t>());
        if (!reader.ok())
            break;
        list.markers.push_back(std::move(marker));
        behind = reader.rest();
    }
    list.missingMarkers = static_cast<std::uint16_t>(count - list.markers.size());
    list.behind.assign(behind.begin(), behind.end());
    return list;
}

} // namespace

std::optional<MarkerList> MarkerList::read(BytesView body)
{
    ByteReader reader(body);
    const auto count = reader.read<std::uint16_t>();
    if (!reader.ok())
        return std::nullopt;
    MarkerList padded = markersOf(reader, count, true);
    if (padded.missingMarkers == 0)
        return padded;
    // A writer that omits pad bytes fills the chunk to its last byte with markers that are not padded.
    MarkerList unpadded = markersOf(reader, count, false);
    return unpadded.missingMarkers == 0 && unpadded.behind.size() <= 1 ? unpadded : padded;
}

Bytes MarkerList::write() const
{
    const std::size_t count = std::min(markers.size(), kMostMarkers);
    ByteWriter writer;
    writer.write(static_cast<std::uint16_t>(std::min<std::size_t>(count + missingMarkers, kMostMarkers)));
    for (const AIFFMarker& marker : std::span(markers).first(count)) {
        const std::string_view name = std::string_view(marker.name).substr(0, kLongestName);
        writer.write(marker.id);
        writer.write(marker.position);
        writer.write(static_cast<std::uint8_t>(name.size()));
        writer.write(bytesOf(name));
        if (namesArePadded && needsPad(name.size()))
            writer.write(static_cast<std::uint8_t>(marker.pad));
    }
    writer.write(behind);
    return writer.take();
}

const AIFFMarker* MarkerList::find(std::int16_t id) const
{
    const auto found = std::ranges::find(markers, id, &AIFFMarker::id);
    return found == markers.end() ? nullptr : &*found;
}
