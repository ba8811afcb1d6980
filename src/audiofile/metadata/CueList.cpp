#include "audiofile/metadata/CueList.h"

std::optional<CueList> CueList::read(BytesView body, std::endian order)
{
    ByteReader reader(body, order);
    const auto count = reader.read<std::uint32_t>();
    if (!reader.ok())
        return std::nullopt;
    CueList list;
    list.points = takeRecords<CuePoint>(reader, count, order);
    list.missingPoints = count - static_cast<std::uint32_t>(list.points.size());
    list.behind = takeRest(reader);
    return list;
}

Bytes CueList::write(std::endian order) const
{
    ByteWriter writer(order);
    writer.write(static_cast<std::uint32_t>(points.size()) + missingPoints);
    for (const CuePoint& point : points)
        putRecord(writer, point, order);
    writer.write(behind);
    return writer.take();
}

const CuePoint* CueList::find(std::uint32_t id) const
{
    const auto found = std::ranges::find_if(points, [id](const CuePoint& point) { return point.id == id; });
    return found == points.end() ? nullptr : &*found;
}
