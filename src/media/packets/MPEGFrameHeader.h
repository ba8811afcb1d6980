// The four bytes that begin a frame of MPEG audio layer III: ISO/IEC 11172-3 (MPEG-1), 13818-3 (MPEG-2), and the
// extension to lower rates known as MPEG-2.5.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

namespace platform {

struct MPEGFrameHeader {
    static constexpr std::uint32_t size = 4;

    enum class Version : std::uint8_t { mpeg25 = 0, mpeg2 = 2, mpeg1 = 3 };

    Version version = Version::mpeg1;
    bool hasCRC = false;
    std::uint8_t channels = 0;
    std::uint16_t frameSize = 0;  // bytes, the header included
    std::uint32_t sampleRate = 0; // hertz

    /// None for other layers, "free format" and reserved values.
    static std::optional<MPEGFrameHeader> parse(const std::byte* bytes);

    /// Whether frames with these headers belong to one stream. All other fields may change from frame to frame.
    bool belongsWith(const MPEGFrameHeader& other) const
    {
        return version == other.version && sampleRate == other.sampleRate && channels == other.channels;
    }
    /// As SoundFacts::speakers.
    std::uint32_t speakers() const { return channels == 1 ? 0x4 : 0x3; }
    bool isMPEG1() const { return version == Version::mpeg1; }
    std::uint32_t framesPerPacket() const { return isMPEG1() ? 1152 : 576; }
    std::uint32_t sideInfoSize() const { return isMPEG1() ? (channels == 1 ? 17 : 32) : (channels == 1 ? 9 : 17); }
    /// The bytes of the frame that hold samples, its own or those of later frames ("bit reservoir").
    std::uint32_t mainDataSize() const
    {
        const std::uint32_t head = size + (hasCRC ? 2 : 0) + sideInfoSize();
        return frameSize > head ? frameSize - head : 0;
    }
    /// How many bytes of main data before a frame its own may begin, at most.
    std::uint32_t reservoirSize() const { return isMPEG1() ? 511 : 255; }
    /// Smallest and largest frame of the stream in bytes.
    std::uint32_t smallestFrame() const { return bytesAt(isMPEG1() ? 32 : 8); }
    std::uint32_t largestFrame() const { return bytesAt(isMPEG1() ? 320 : 160) + 1; }

private:
    std::uint32_t bytesAt(std::uint32_t kilobits) const { return framesPerPacket() / 8 * kilobits * 1000 / sampleRate; }
};

} // namespace platform
