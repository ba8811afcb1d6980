#include "media/packets/MP4Boxes.h"

#include "platform/core/Packed.h"

#include <algorithm>

namespace platform {

MP4Boxes::MP4Boxes(PacketFile& file, const MP4Box& parent, std::uint64_t fields)
    : MP4Boxes(file, parent.body + std::min(fields, parent.size()), parent.end)
{
}

bool MP4Boxes::next(MP4Box& box)
{
    constexpr std::uint64_t kHeaderSize = 8;
    const std::uint64_t room = end_ - position_;
    if (room < kHeaderSize)
        return false;
    const BytesView header = file_.at(position_, 2 * kHeaderSize);
    if (header.size() < kHeaderSize)
        return false;
    std::uint64_t size = loadBE<std::uint32_t>(header.data());
    std::uint64_t headerSize = kHeaderSize;
    if (size == 1 && room >= 2 * kHeaderSize && header.size() == 2 * kHeaderSize) {
        headerSize = 2 * kHeaderSize;
        size = loadBE<std::uint64_t>(header.data() + kHeaderSize);
    } else if (size == 0) {
        size = room;
    }
    if (size < headerSize)
        return false;
    box.type = loadBE<FourCC>(header.data() + 4);
    box.body = position_ + headerSize;
    box.end = position_ + std::min(size, room);
    position_ = box.end;
    return true;
}

std::optional<MP4Box> MP4Boxes::find(FourCC type)
{
    MP4Box box;
    while (next(box))
        if (box.type == type)
            return box;
    return {};
}

} // namespace platform
