#include "media/ffmpeg/FrameSpans.h"

#include <algorithm>

namespace platform::ffmpeg {

void FrameSpans::add(std::uint64_t start, std::uint64_t end)
{
    if (start >= end)
        return;
    // Spans that it touches are merged with it.
    const auto first = std::lower_bound(all_.begin(), all_.end(), start,
                                        [](const Span& span, std::uint64_t value) { return span.end < value; });
    auto last = first;
    Span whole{start, end};
    for (; last != all_.end() && last->start <= end; ++last) {
        whole = {std::min(whole.start, last->start), std::max(whole.end, last->end)};
        count_ -= last->end - last->start;
    }
    count_ += whole.end - whole.start;
    if (first == last) {
        all_.insert(first, whole);
    } else {
        *first = whole;
        all_.erase(first + 1, last);
    }
}

} // namespace platform::ffmpeg
