#include "media/packets/FrameIndex.h"

#include "media/packets/TagExtents.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace platform {

namespace {

constexpr std::uint64_t kMostJunk = std::uint64_t{1} << 20;
constexpr std::size_t kReach = FrameIndex::kLargestFrame + FrameIndex::kHeaderSize; // a frame and the next header
static_assert(2 * kReach <= PacketFile::kMostAtOnce);

} // namespace

FrameIndex::FrameIndex(PacketFile& file, std::uint64_t start, std::uint64_t end, Measure measure)
    : file_(file),
      end_(std::min(end, file.length())),
      measure_(std::move(measure)),
      next_(start)
{
}

std::int32_t FrameIndex::find(std::uint64_t frame, Place& place)
{
    while (positions_.size() <= frame)
        if (const std::int32_t status = step(); status != kStatusOK)
            return status;
    place.position = positions_[frame];
    const BytesView header = file_.at(place.position, kHeaderSize);
    place.size = frameAt(header);
    if (place.size > 0)
        return kStatusOK;
    const std::int32_t status = file_.takeStatus();
    return status != kStatusOK ? status : kStatusIOError; // the file was changed meanwhile
}

std::int32_t FrameIndex::count(std::uint64_t& frames)
{
    std::int32_t status = kStatusOK;
    while (status == kStatusOK)
        status = step();
    frames = positions_.size();
    return status == kStatusEndOfFile ? kStatusOK : status;
}

std::int32_t FrameIndex::step()
{
    while (!isComplete_) {
        const BytesView header = next_ < end_ ? file_.at(next_, kHeaderSize) : BytesView{};
        const std::uint32_t size = frameAt(header);
        if (size > 0 && size <= end_ - next_) {
            positions_.push_back(next_);
            next_ += size;
            return kStatusOK;
        }
        const bool goesOn = next_ < end_ && (skipTag() || skipJunk());
        if (const std::int32_t status = file_.takeStatus(); status != kStatusOK)
            return status;
        isComplete_ = !goesOn;
    }
    return kStatusEndOfFile;
}

std::uint32_t FrameIndex::frameAt(BytesView bytes) const
{
    return bytes.size() >= kHeaderSize ? measure_(bytes.data()) : 0;
}

bool FrameIndex::skipTag()
{
    const std::uint64_t size = leadingTagSize(file_, next_);
    if (size == 0 || size > end_ - next_)
        return false;
    next_ += size;
    return true;
}

/// Moves to the next frame that is followed by another one or by the end of the stream; a single header may be chance.
bool FrameIndex::skipJunk()
{
    const std::uint64_t limit = std::min(end_, next_ + kMostJunk);
    for (std::uint64_t from = next_ + 1; from < limit;) {
        const auto wanted = static_cast<std::size_t>(std::min<std::uint64_t>(2 * kReach, end_ - from));
        const BytesView bytes = file_.at(from, wanted);
        if (bytes.size() < wanted)
            return false;
        const std::size_t starts = wanted == end_ - from ? wanted : wanted - kReach; // whole candidates
        for (std::size_t i = 0; i < starts; ++i) {
            const void* found = std::memchr(bytes.data() + i, 0xFF, starts - i);
            if (found == nullptr)
                break;
            i = static_cast<std::size_t>(static_cast<const std::byte*>(found) - bytes.data());
            const std::uint32_t size = frameAt(bytes.subspan(i));
            if (size == 0 || size > bytes.size() - i)
                continue;
            if (from + i + size == end_ || frameAt(bytes.subspan(i + size)) > 0) {
                next_ = from + i;
                return true;
            }
        }
        from += starts;
    }
    return false;
}

} // namespace platform
