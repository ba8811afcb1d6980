#include "media/packets/WavPackInfo.h"

#include "media/packets/TagExtents.h"
#include "media/packets/WavPackBlock.h"
#include "platform/core/Status.h"

#include <array>
#include <bit>
#include <optional>
#include <vector>

namespace platform {

namespace {

constexpr std::uint32_t kMostFrames = 1u << 17; // per block, as encoders write them

class WavPackEnds {
public:
    explicit WavPackEnds(PacketFile& file) : file_(file) {}

    /// 0, or as describeByEnds.
    std::int32_t describe(CompressedAudio& audio)
    {
        if (walk() && isProven()) {
            tell(audio);
            return kStatusOK;
        }
        return status_ != kStatusOK && status_ != kStatusEndOfFile ? status_ : file_.takeStatus(false);
    }

private:
    struct Place {
        std::uint64_t position;
        std::uint64_t first, end; // frames
        std::size_t size;
    };

    bool walk();
    bool follows(const WavPackBlock& block);
    bool isProven();
    void tell(CompressedAudio& audio) const;

    PacketFile& file_;
    std::int32_t status_ = kStatusOK;
    std::vector<Place> places_; // of blocks with sound
    std::uint64_t frames_ = 0;  // in these
    bool isInside_ = false;     // more blocks of the same frames follow
    WavPackBlock last_, first_; // with sound
};

/// Whether blocks with sound follow one another, each time for all channels.
bool WavPackEnds::follows(const WavPackBlock& block)
{
    if (block.isInitial == isInside_ || block.isDSD || block.frames > kMostFrames ||
        (isInside_ ? block.first != last_.first || block.frames != last_.frames : block.first != frames_))
        return false;
    isInside_ = !block.isFinal;
    frames_ = block.first + block.frames;
    last_ = block;
    return true;
}

/// Walks from header to header; each costs a read, because blocks are longer than a window.
bool WavPackEnds::walk()
{
    constexpr std::size_t mostBlocks = 1u << 17;
    const std::uint64_t end = startOfTrailingTags(file_, 0);
    std::array<std::byte, WavPackBlock::kHeaderSize> header;
    std::uint64_t at = 0;
    for (std::size_t i = 0; i < mostBlocks && end - at >= header.size(); ++i) {
        status_ = file_.bytes().read(at, header.data(), header.size());
        const auto block = status_ == kStatusOK ? WavPackBlock::parseHeader(header) : std::nullopt;
        if (!block || block->size > end - at || (block->frames > 0 ? !follows(*block) : isInside_))
            return false;
        if (block->frames > 0)
            places_.push_back({at, block->first, frames_, block->size});
        at += block->size;
    }
    return at == end && !isInside_ && frames_ > 0;
}

/// Whether the first and last blocks have valid checksums, and the first knows the number of all frames.
bool WavPackEnds::isProven()
{
    constexpr std::uint32_t mostChannels = 32;
    Bytes bytes;
    for (const Place& place : places_) {
        if (place.first > 0 && place.end + kProvenFrames <= frames_)
            continue;
        status_ = file_.read(place.position, place.size, bytes);
        const auto block = status_ == kStatusOK ? WavPackBlock::parse(bytes) : std::nullopt;
        if (!block)
            return false;
        if (&place == &places_.front())
            first_ = *block;
    }
    return first_.total == frames_ && first_.sampleRate > 0 && first_.bits > 0 && first_.channels <= mostChannels;
}

void WavPackEnds::tell(CompressedAudio& audio) const
{
    constexpr std::uint32_t inWAVE = 0x3FFFF; // bits that every mask numbers alike
    audio = {};
    audio.fileType = audio.format.formatId = fourCC("wvpk");
    audio.format.sampleRate = first_.sampleRate;
    audio.format.channelsPerFrame = first_.channels;
    audio.format.bitsPerChannel = first_.bits;
    audio.frames = frames_;
    const bool areAll = std::popcount(first_.speakers) == static_cast<int>(first_.channels);
    audio.facts.speakers = areAll && (first_.speakers & ~inWAVE) == 0 ? first_.speakers : 0;
}

} // namespace

std::int32_t readWavPackInfo(PacketFile& file, CompressedAudio& audio)
{
    return WavPackEnds(file).describe(audio);
}

} // namespace platform
