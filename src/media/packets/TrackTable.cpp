#include "media/packets/TrackTable.h"

#include "platform/core/Status.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace platform {

namespace {

/// How many of `rest`, the frames after an edit's start, the edit makes audible.
std::uint64_t heardFrames(const TrackFrames& frames, std::uint64_t duration, std::uint64_t rest)
{
    if (duration == 0 || frames.movieTimescale == 0)
        return rest;
    // The movie's unit is usually a millisecond, so an edit that ends within one unit of the track's end ends there.
    const double unit = static_cast<double>(frames.sampleRate) / frames.movieTimescale;
    const double heard = static_cast<double>(duration) * unit;
    return heard + unit + 1 >= static_cast<double>(rest) ? rest : static_cast<std::uint64_t>(std::llround(heard));
}

/// Whether the numbers add up to the packets that the file lists; the last packet may have fewer frames.
bool fits(const GaplessItem& item, const TrackFrames& frames)
{
    const std::uint64_t around = std::uint64_t{item.priming} + item.remainder;
    if (item.validFrames > frames.inListed || around > frames.inListed - item.validFrames)
        return false;
    return frames.inListed - item.validFrames - around < frames.perPacket;
}

} // namespace

std::int32_t makePacketTable(std::uint64_t inPackets, std::uint64_t priming, std::uint64_t valid, PacketTable& table)
{
    constexpr std::uint64_t most = std::numeric_limits<std::int32_t>::max();
    if (priming > most || inPackets > static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()))
        return AudioHandle::kFormatNotSupported;
    const std::uint64_t rest = inPackets - std::min(priming, inPackets);
    valid = std::min(valid, rest);
    if (rest - valid > most)
        return AudioHandle::kFormatNotSupported;
    table.validFrames = static_cast<std::int64_t>(valid);
    table.primingFrames = static_cast<std::int32_t>(priming);
    table.remainderFrames = static_cast<std::int32_t>(rest - valid);
    return kStatusOK;
}

std::int32_t makePacketTable(const TrackFrames& frames, PacketTable& table)
{
    if (frames.gapless && !frames.edit && fits(*frames.gapless, frames))
        return makePacketTable(frames.inPackets, frames.gapless->priming, frames.gapless->validFrames, table);
    const std::uint64_t start = frames.edit ? frames.edit->start : 0;
    const std::uint64_t rest = frames.stated - std::min(start, frames.stated);
    return makePacketTable(frames.inPackets, start, heardFrames(frames, frames.edit ? frames.edit->duration : 0, rest),
                           table);
}

} // namespace platform
