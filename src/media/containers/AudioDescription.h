// What a container says about its samples: format, place, number. Everything that describes, plays or edits an audio
// file asks here, so that all agree. Published sources as in StoredFormat.h.
#pragma once

#include "media/containers/ContainerLayout.h"
#include "media/containers/StoredFormat.h"

#include <cstdint>
#include <optional>

namespace platform {

struct AudioDescription {
    std::optional<StoredFormat> format; // none if its chunk is missing or too short
    bool hasSound = false;              // there is a chunk of samples, which AIFF without frames may omit
    std::uint64_t dataOffset = 0;       // of the first sample byte
    std::uint64_t dataSize = 0;         // sample bytes that the file contains
    std::uint64_t missingDataSize = 0;  // sample bytes that the header promises beyond the end of the file
    std::uint64_t packetCount = 0;
    std::uint64_t frames = 0;
    bool framesAreStated = false; // only by the header; decoding would prove the number
    std::uint32_t layout = 0;     // speakers that the channels feed, as bits of WAVE's channel mask, whatever the
                                  // channels' order; 0 if the file does not say

    const StreamDescription& stream() const { return format->stream; }
    /// The sample bytes, without those that AIFF does not count.
    std::uint64_t byteCount() const;
};

/// The counts in the packet table of a CAF file.
struct PacketCounts {
    std::int64_t packets = 0;
    std::int64_t frames = 0; // without those that prime the decoder or fill its last packet
};

/// Builds a description from the chunks of a container, in file order. Does not own the window.
class AudioDescriber {
public:
    AudioDescriber(HeaderWindow& window, const Container& container) : window_(window), container_(container) {}

    /// Reads the chunk if it describes the samples; the first of several with one id counts.
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
    bool metFormat_ = false;     // a format chunk was met, even if it is incomplete
    std::uint32_t speakers_ = 0; // CAF only
    std::optional<std::uint32_t> factFrames_;
    std::optional<PacketCounts> packetTable_;
};

/// Describes a container that was scanned. kStatusIOError if format or samples are missing or contradict each other;
/// otherwise the status of a failed read.
std::int32_t describeAudio(HeaderWindow& window, const ContainerLayout& layout, AudioDescription& description);

/// Offset, in the body of "COMM", of the 32-bit frame count.
inline constexpr std::uint64_t kCommonFramesOffset = 2;

} // namespace platform
