#include "media/packets/VorbisCoding.h"

#include "platform/core/ByteReader.h"

namespace platform {

namespace {

/// Reads a packet's bits from its end to its start.
class BitsBackwards {
public:
    explicit BitsBackwards(BytesView bytes) : bytes_(bytes), left_(bytes.size() * 8) {}

    std::size_t left() const { return left_; }
    /// The `count` bits before those taken so far, as the number that was written; there are enough.
    std::uint32_t take(unsigned count)
    {
        std::uint32_t value = 0;
        for (; count > 0; --count) {
            --left_;
            value = value << 1 | (std::to_integer<std::uint32_t>(bytes_[left_ / 8]) >> (left_ % 8) & 1);
        }
        return value;
    }

private:
    BytesView bytes_;
    std::size_t left_;
};

bool isHeader(BytesView packet, char kind)
{
    const char begin[] = {kind, 'v', 'o', 'r', 'b', 'i', 's'};
    return packet.size() > sizeof begin && textOf(packet.first(sizeof begin)) == std::string_view(begin, sizeof begin);
}

} // namespace

std::uint32_t speakersOfVorbis(std::uint32_t channels)
{
    constexpr std::array<std::uint32_t, 9> speakers{0, 0x4, 0x3, 0x7, 0x33, 0x37, 0x3F, 0x70F, 0x63F};
    return channels < speakers.size() ? speakers[channels] : 0;
}

std::unique_ptr<OggCoding> VorbisCoding::of(BytesView first)
{
    constexpr std::size_t headerSize = 30;
    constexpr std::uint32_t mostRate = 1 << 24;
    constexpr unsigned smallest = 6, largest = 13; // powers of 2
    if (first.size() != headerSize || !isHeader(first, 1))
        return nullptr;
    ByteReader reader(first.subspan(7), std::endian::little);
    const auto version = reader.read<std::uint32_t>();
    const std::uint32_t channels = reader.read<std::uint8_t>();
    const auto rate = reader.read<std::uint32_t>();
    reader.skip(12); // bit rates
    const unsigned sizes = reader.read<std::uint8_t>();
    const bool isFramed = (reader.read<std::uint8_t>() & 1) != 0;
    const unsigned shorter = sizes & 15, longer = sizes >> 4;
    const bool isOne = version == 0 && isFramed && channels > 0 && rate > 0 && rate <= mostRate &&
                       shorter >= smallest && shorter <= longer && longer <= largest && speakersOfVorbis(channels) != 0;
    if (!isOne)
        return nullptr;
    auto coding = std::make_unique<VorbisCoding>();
    coding->format_.formatId = fourCC("vorb");
    coding->format_.sampleRate = rate;
    coding->format_.channelsPerFrame = channels;
    coding->speakers_ = speakersOfVorbis(channels);
    coding->blockSizes_ = {1U << shorter, 1U << longer};
    return coding;
}

bool VorbisCoding::takeHeader(BytesView packet)
{
    constexpr char comments = 3, setup = 5;
    ++headers_;
    return isHeader(packet, headers_ == 2 ? comments : setup) && (headers_ < 3 || readModes(packet));
}

/// Finds the modes, which end the setup header, without parsing the codebooks before them. Each mode has a bit that
/// tells whether its block is long, 16 for the window and 16 for the transform, all zeros, and 8 for the mapping; the 6
/// bits before the modes are their number less one. Mapping bits may look like that number, so the largest match wins.
/// Encoders make one or two modes; more are in doubt.
bool VorbisCoding::readModes(BytesView setup)
{
    constexpr std::size_t modeBits = 41, countBits = 6;
    constexpr std::uint32_t mostMapping = 63;
    BitsBackwards bits(setup);
    while (bits.left() > 0 && bits.take(1) == 0) // up to the framing bit
        continue;
    std::array<bool, 64> flags{}; // last mode first
    std::size_t found = 0;
    for (std::size_t i = 0; i < flags.size() && bits.left() > modeBits + countBits; ++i) {
        if (bits.take(8) > mostMapping || bits.take(16) != 0 || bits.take(16) != 0)
            break;
        flags[i] = bits.take(1) != 0;
        if (BitsBackwards(bits).take(countBits) == i)
            found = i + 1;
    }
    if (found == 0 || found > isLong_.size())
        return false;
    hasTwoModes_ = found == 2;
    isLong_ = {flags[found - 1], flags[0]};
    return true;
}

std::optional<std::uint32_t> VorbisCoding::framesOf(BytesView packet)
{
    if (packet.empty() || (std::to_integer<unsigned>(packet[0]) & 1) != 0) // a header
        return {};
    // Bits: 0, the mode if there are two, and for long blocks whether the neighbours are long.
    const auto bits = std::to_integer<unsigned>(packet[0]) >> 1;
    const bool isLong = isLong_[hasTwoModes_ ? bits & 1 : 0];
    const std::uint32_t size = blockSizes_[isLong ? 1 : 0];
    const std::uint32_t stated = blockSizes_[bits >> (hasTwoModes_ ? 1 : 0) & 1];
    if (isLong && previous_ != 0 && stated != previous_)
        return {};
    const std::uint32_t frames = previous_ == 0 ? 0 : (previous_ + size) / 4;
    previous_ = size;
    return frames;
}

} // namespace platform
