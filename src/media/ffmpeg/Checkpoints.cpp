#include "media/ffmpeg/Checkpoints.h"

#include <algorithm>

namespace platform::ffmpeg {

void Checkpoints::offer(const Checkpoint& checkpoint)
{
    constexpr std::size_t most = 1u << 14;
    const bool isFirst = all_.empty();
    if (!isFirst && (checkpoint.frame - all_.back().frame < interval_ || checkpoint.time <= all_.back().time))
        return;
    if (all_.size() == most) {
        for (std::size_t i = 0; i < most / 2; ++i)
            all_[i] = all_[2 * i];
        all_.resize(most / 2);
        interval_ *= 2;
    }
    all_.push_back(checkpoint);
}

const Checkpoint* Checkpoints::find(std::int64_t time, std::int64_t position) const
{
    const auto found = std::lower_bound(all_.begin(), all_.end(), time,
                                        [](const Checkpoint& one, std::int64_t value) { return one.time < value; });
    return found != all_.end() && found->time == time && found->position == position ? &*found : nullptr;
}

std::size_t Checkpoints::countUpTo(std::uint64_t frame) const
{
    return static_cast<std::size_t>(
        std::upper_bound(all_.begin(), all_.end(), frame,
                         [](std::uint64_t value, const Checkpoint& one) { return value < one.frame; }) -
        all_.begin());
}

} // namespace platform::ffmpeg
