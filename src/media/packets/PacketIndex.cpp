#include "media/packets/PacketIndex.h"

#include <algorithm>

namespace platform {

void PacketIndex::setConstant(std::uint64_t size, std::uint64_t count)
{
    constantSize_ = size;
    count_ = count;
}

void PacketIndex::append(std::uint32_t size)
{
    sums_.push_back(sum(count_) + size);
    ++count_;
}

void PacketIndex::addRun(std::uint64_t first, std::uint64_t position)
{
    const bool goesOn = !runs_.empty() && runs_.back().position + bytes(runs_.back().first, first) == position;
    if (!goesOn)
        runs_.push_back({first, position});
}

void PacketIndex::cut(std::uint64_t count)
{
    count_ = std::min(count_, count);
    if (constantSize_ == 0)
        sums_.resize(static_cast<std::size_t>(count_));
}

std::uint64_t PacketIndex::countFitting(std::uint64_t first, std::uint64_t end, std::uint64_t size) const
{
    if (constantSize_ > 0)
        return std::min(end - first, size / constantSize_);
    const auto from = sums_.begin() + static_cast<std::ptrdiff_t>(first);
    const auto to = sums_.begin() + static_cast<std::ptrdiff_t>(end);
    const std::uint64_t before = sum(first);
    const auto beyond = std::partition_point(from, to, [&](std::uint64_t sum) { return sum - before <= size; });
    return static_cast<std::uint64_t>(beyond - from);
}

PacketIndex::Place PacketIndex::place(std::uint64_t packet) const
{
    const auto behind = std::ranges::upper_bound(runs_, packet, {}, &Run::first);
    const Run& run = *std::prev(behind);
    return {.position = run.position + bytes(run.first, packet), .size = bytes(packet, packet + 1)};
}

} // namespace platform
