// What a container says of its samples: format, place, number. Whoever describes, plays or edits an audio file asks
// here, so that what one tells of is what the other reads. Published sources as in StoredFormat.h.
#pragma once

#include "media/containers/ContainerLayout.h"
#include "media/containers/StoredFormat.h"

#include <cstdint>
#include <optional>

namespace platform {

struct AudioDescription {
    std::optional<StoredFormat> format; // none: its chunk is missing, or too short
    bool hasSound = false;              // there is a chunk of samples; one that counts none need not be there in AIFF
    std::uint64_t dataOffset = 0;       // of the first sample byte
    std::uint64_t dataSize = 0;         // sample bytes that are in the file
    std::uint64_t missingDataSize = 0;  // sample bytes that the header promises and the file ends ahead of
    std::uint64_t packetCount = 0;
    std::uint64_t frames = 0;
    bool framesAreStated = false; // by a header alone; only decoding proves them
    std::uint32_t layout = 0;     // the speakers that the channels feed, as bits of WAVE's channel mask, whatever the
                                  // channels' order; 0 when the file does not say

    const StreamDescription& stream() const { return format->stream; }
    /// The sample bytes without those that AIFF does not count.
    std::uint64_t byteCount() const;
};

/// What the packet table of a CAF file counts.
struct PacketCounts {
    std::int64_t packets = 0;
    std::int64_t frames = 0; // without those that prime the decoder and fill its last packet
};

/// Makes a description of the chunks of a container, which it meets in file order. Does not own the window.
class AudioDescriber {
public:
    AudioDescriber(HeaderWindow& window, const Container& container) : window_(window), container_(container) {}

    /// Reads what the chunk tells, if it tells anything; of several of an id the first counts.
    void meet(const WalkedChunk& chunk);
    /// Whether no further chunk is needed.
    bool isComplete() const;
    AudioDescription description() const;

private:
    bool isLikeWAVE() const;
    void readFormat(const WalkedChunk& chunk);
    void locateSound(const WalkedChunk& chunk);
    void readPacketTable(const WalkedChunk& chunk);
    void readLayout(const WalkedChunk& chunk);
    void count(AudioDescription& description) const;
    void countBlocks(AudioDescription& description) const;
    void countPacketsOfCAF(AudioDescription& description) const;

    HeaderWindow& window_;
    const Container& container_;
    AudioDescription found_;
    bool metFormat_ = false;     // a chunk of that id, if only the start of one
    std::uint32_t speakers_ = 0; // of CAF
    std::optional<std::uint32_t> factFrames_;
    std::optional<PacketCounts> packetTable_;
};

/// The same of a container that was scanned. kStatusIOError when format or samples are missing, or contradict each
/// other; else the status of a read that failed.
std::int32_t describeAudio(HeaderWindow& window, const ContainerLayout& layout, AudioDescription& description);

/// Offset, in the body of "COMM", of the 32-bit frame count.
inline constexpr std::uint64_t kCommonFramesOffset = 2;

} // namespace platform
