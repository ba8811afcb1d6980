#include "audiofile/metadata/CAFMarkers.h"

namespace {

constexpr auto kOrder = std::endian::big;
constexpr std::size_t kRegionHeaderSize = 12;

void putMarkers(ByteWriter& writer, const std::vector<CAFMarker>& markers)
{
    for (const CAFMarker& marker : markers)
        putRecord(writer, marker, kOrder);
}

} // namespace

std::optional<CAFMarkerList> CAFMarkerList::read(BytesView body)
{
    ByteReader reader(body);
    CAFMarkerList list;
    list.timecodeType = reader.read<std::uint32_t>();
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return std::nullopt;
    list.markers = takeRecords<CAFMarker>(reader, count, kOrder);
    list.missingMarkers = count - static_cast<std::uint32_t>(list.markers.size());
    list.behind = takeRest(reader);
    return list;
}

Bytes CAFMarkerList::write() const
{
    ByteWriter writer;
    writer.write(timecodeType);
    writer.write(static_cast<std::uint32_t>(markers.size()) + missingMarkers);
    putMarkers(writer, markers);
    writer.write(behind);
    return writer.take();
}

std::optional<CAFRegionList> CAFRegionList::read(BytesView body)
{
    ByteReader reader(body);
    CAFRegionList list;
    list.timecodeType = reader.read<std::uint32_t>();
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return std::nullopt;
    // If some markers are missing, no region follows.
    while (list.regions.size() < count && reader.remaining() >= kRegionHeaderSize &&
           (list.regions.empty() || list.regions.back().missingMarkers == 0)) {
        CAFRegion& region = list.regions.emplace_back();
        region.id = reader.read<std::uint32_t>();
        region.flags = reader.read<std::uint32_t>();
        const auto markers = reader.read<std::uint32_t>();
        region.markers = takeRecords<CAFMarker>(reader, markers, kOrder);
        region.missingMarkers = markers - static_cast<std::uint32_t>(region.markers.size());
    }
    list.missingRegions = count - static_cast<std::uint32_t>(list.regions.size());
    list.behind = takeRest(reader);
    return list;
}

Bytes CAFRegionList::write() const
{
    ByteWriter writer;
    writer.write(timecodeType);
    writer.write(static_cast<std::uint32_t>(regions.size()) + missingRegions);
    for (const CAFRegion& region : regions) {
        writer.write(region.id);
        writer.write(region.flags);
        writer.write(static_cast<std::uint32_t>(region.markers.size()) + region.missingMarkers);
        putMarkers(writer, region.markers);
    }
    writer.write(behind);
    return writer.take();
}
