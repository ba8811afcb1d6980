#include "media/ffmpeg/FLACFrames.h"

#include "media/ffmpeg/FLACChecksum.h"

#include <algorithm>
#include <cstring>
#include <new>
#include <utility>

extern "C" {
#include <libavcodec/packet.h>
#include <libavformat/avio.h>
#include <libavutil/error.h>
}

namespace platform::ffmpeg {

namespace {

constexpr std::size_t kStreamInfoSize = 34;
constexpr std::size_t kMostOfHeader = 16, kLeastOfFrame = 10;
constexpr std::size_t kPiece = 1 << 18;
/// More than any frame: 65,535 samples of 8 channels of 32 bits, as they are.
constexpr std::size_t kLongestFrame = std::size_t{65535} * 8 * 4 + 4096;

} // namespace

std::optional<FLACFrames> FLACFrames::from(std::int64_t place, std::span<const std::uint8_t> streamInfo)
{
    if (place < 0 || streamInfo.size() < kStreamInfoSize)
        return std::nullopt;
    FLACFrames frames;
    frames.place_ = place;
    const auto smallest = static_cast<std::uint32_t>(streamInfo[0] << 8 | streamInfo[1]);
    const auto largest = static_cast<std::uint32_t>(streamInfo[2] << 8 | streamInfo[3]);
    if (smallest != largest) // a frame that is only counted does not tell the number of its first sample
        return std::nullopt;
    frames.blockSize_ = largest;
    frames.shortest_ = static_cast<std::size_t>(streamInfo[4] << 16 | streamInfo[5] << 8 | streamInfo[6]);
    return frames;
}

/// Makes `count` bytes of the next frame available, or all that are there; false when the file cannot be read.
bool FLACFrames::fill(AVIOContext& file, std::size_t count)
{
    while (buffer_.size() - begin_ < count && !isAtEnd_) {
        const auto have = static_cast<std::int64_t>(buffer_.size());
        if (begin_ > kPiece) {
            buffer_.erase(buffer_.begin(), buffer_.begin() + static_cast<std::ptrdiff_t>(begin_));
            place_ += static_cast<std::int64_t>(begin_);
            begin_ = 0;
            continue;
        }
        if (avio_seek(&file, place_ + have, SEEK_SET) < 0)
            return false;
        buffer_.resize(buffer_.size() + kPiece);
        const int got = avio_read(&file, buffer_.data() + have, kPiece);
        buffer_.resize(static_cast<std::size_t>(have + std::max(got, 0)));
        if (got < 0 && got != AVERROR_EOF)
            return false;
        isAtEnd_ = got <= 0;
    }
    return true;
}

/// The header there, if it is that of the next frame.
std::optional<FLACFrame> FLACFrames::nextAt(std::size_t offset) const
{
    const BytesView bytes = std::as_bytes(std::span(buffer_).subspan(std::min(offset, buffer_.size())));
    if (bytes.size() < (isAtEnd_ ? kLeastOfFrame : kMostOfHeader))
        return std::nullopt;
    const auto frame = parseFLACFrame(bytes, blockSize_);
    const bool follows = frame && frame->first == next_ &&
                         (!last_ || (frame->sampleRate == last_->sampleRate && frame->bits == last_->bits));
    return follows ? frame : std::nullopt;
}

/// Where the header of a frame stands that follows `next_`; 0 without one in the buffer.
std::size_t FLACFrames::findNext(std::size_t from) const
{
    const std::uint8_t* const all = buffer_.data();
    const std::size_t least = isAtEnd_ ? kLeastOfFrame : kMostOfHeader;
    while (from + least <= buffer_.size()) {
        const void* const found = std::memchr(all + from, 0xFF, buffer_.size() - least + 1 - from);
        if (found == nullptr)
            return 0;
        from = static_cast<std::size_t>(static_cast<const std::uint8_t*>(found) - all);
        if ((all[from + 1] & 0xFE) == 0xF8 && nextAt(from))
            return from;
        ++from;
    }
    return 0;
}

FLACFrames::Result FLACFrames::read(AVIOContext& file, AVPacket& packet)
{
    if (!fill(file, kMostOfHeader))
        return Result::stopped;
    if (begin_ == buffer_.size())
        return Result::end;
    const auto header = nextAt(begin_);
    if (!header)
        return Result::stopped;
    const std::optional<FLACFrame> before = std::exchange(last_, header);
    next_ = header->first + header->samples;
    std::size_t known = std::max(shortest_, kMostOfHeader / 2);
    std::size_t end = 0;
    for (;;) {
        end = findNext(begin_ + known);
        const std::size_t have = buffer_.size() - begin_;
        if (end != 0 || isAtEnd_)
            break;
        known = std::max(known, have > kMostOfHeader ? have - kMostOfHeader : std::size_t{0});
        if (have > kLongestFrame || !fill(file, have + kPiece))
            break;
    }
    const auto frame = std::span(buffer_).subspan(begin_, (end != 0 ? end : buffer_.size()) - begin_);
    // Of the last one its CRC tells that it goes to the end of the file.
    if (frame.size() > kLongestFrame || (end == 0 && !(isAtEnd_ && flacCRC16(std::as_bytes(frame)) == 0))) {
        next_ = header->first;
        last_ = before;
        return Result::stopped;
    }
    av_packet_unref(&packet);
    if (av_new_packet(&packet, static_cast<int>(frame.size())) < 0)
        throw std::bad_alloc();
    std::memcpy(packet.data, frame.data(), frame.size());
    packet.pts = packet.dts = static_cast<std::int64_t>(header->first);
    packet.duration = header->samples;
    packet.pos = place_ + static_cast<std::int64_t>(begin_);
    packet.flags |= AV_PKT_FLAG_KEY;
    begin_ += frame.size();
    return Result::packet;
}

} // namespace platform::ffmpeg
