#include "media/containers/AudioDescription.h"

#include "media/containers/ChannelLayouts.h"
#include "platform/core/ByteReader.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <array>

namespace platform {

namespace {

/// Whether the data consists of well-formed ADPCM blocks, including the last. Otherwise only the decoder can tell how
/// many frames there are.
bool areWholeBlocks(const StoredFormat& format, std::uint64_t dataSize)
{
    constexpr FourCC microsoft = fourCC('m', 's', 0, 2);
    const StreamDescription& stream = format.stream;
    const std::uint64_t channels = stream.channelsPerFrame, bytes = stream.bytesPerPacket;
    // A block begins with a few bytes per channel, which hold one frame or two.
    const std::uint64_t headerSize = (format.coding == microsoft ? 7 : 4) * channels;
    const std::uint64_t inHeader = format.coding == microsoft ? 2 : 1;
    return channels > 0 && bytes > headerSize && dataSize % bytes == 0 && stream.bitsPerChannel == 4 &&
           stream.framesPerPacket == (bytes - headerSize) * 2 / channels + inHeader;
}

} // namespace

std::uint64_t AudioDescription::byteCount() const
{
    const std::uint64_t counted = format->countedPackets, packetSize = stream().bytesPerPacket;
    const bool countsFewer = stream().isLinearPCM() && counted > 0 && packetSize > 0 && counted < dataSize / packetSize;
    return countsFewer ? counted * packetSize : dataSize;
}

bool AudioDescriber::isLikeWAVE() const
{
    return container_.traits->formatId == fourCC("fmt ");
}

void AudioDescriber::meet(const WalkedChunk& chunk)
{
    const ContainerTraits& traits = *container_.traits;
    if (traits.readFormat == nullptr) // nothing is known about its sound
        return;
    if (chunk.id == traits.formatId && !metFormat_)
        readFormat(chunk);
    else if (chunk.id == traits.soundId && !found_.hasSound)
        locateSound(chunk);
    else if (chunk.id == fourCC("fact") && isLikeWAVE() && !factFrames_ && !isComplete()) {
        std::array<std::byte, 4> frames;
        if (window_.get(frames, chunk.body))
            factFrames_ = load<std::uint32_t>(frames.data(), traits.order);
    } else if (traits.kind == ContainerKind::caf && chunk.id == fourCC("pakt") && !packetTable_)
        readPacketTable(chunk);
    else if (traits.kind == ContainerKind::caf && chunk.id == fourCC("chan"))
        readLayout(chunk);
}

/// A packet table may stand behind the data that it describes.
bool AudioDescriber::isComplete() const
{
    return metFormat_ && found_.hasSound &&
           (container_.traits->kind != ContainerKind::caf || !found_.format || found_.stream().isLinearPCM() ||
            packetTable_);
}

void AudioDescriber::readFormat(const WalkedChunk& chunk)
{
    metFormat_ = true;
    std::array<std::byte, kMostOfStoredFormat> bytes;
    const auto wanted = static_cast<std::size_t>(std::clamp<std::int64_t>(chunk.size, 0, std::int64_t{bytes.size()}));
    const std::size_t there = window_.readSome(bytes.data(), chunk.body, wanted);
    found_.format = container_.traits->readFormat(BytesView(bytes).first(there), container_.formType);
}

void AudioDescriber::locateSound(const WalkedChunk& chunk)
{
    constexpr std::uint64_t editCountSize = 4; // CAF's edit count
    constexpr std::int64_t toTheEnd = INT64_MAX;
    const auto size = static_cast<std::uint64_t>(chunk.size);
    const std::uint64_t there = std::min(size, window_.length() - chunk.body);
    std::uint64_t lead = 0; // bytes in the body ahead of the samples
    if (container_.traits->kind == ContainerKind::caf)
        lead = std::min(editCountSize, there);
    if (container_.traits->kind == ContainerKind::iff) {
        std::array<std::byte, 4> start;
        const std::size_t got = window_.readSome(start.data(), chunk.body, start.size());
        lead = soundDataLead(there, BytesView(start).first(got));
    }
    found_.hasSound = true;
    found_.dataOffset = chunk.body + lead;
    found_.dataSize = there - lead;
    found_.missingDataSize = chunk.size == toTheEnd ? 0 : size - there;
}

void AudioDescriber::readPacketTable(const WalkedChunk& chunk)
{
    std::array<std::byte, 24> bytes;
    if (!window_.get(bytes, chunk.body))
        return;
    ByteReader reader(bytes);
    packetTable_.emplace();
    packetTable_->packets = reader.read<std::int64_t>();
    packetTable_->frames = reader.read<std::int64_t>();
}

/// Only a bitmap also tells the order of the channels.
void AudioDescriber::readLayout(const WalkedChunk& chunk)
{
    constexpr std::uint32_t byBitmap = 0x10000;
    std::array<std::byte, 8> bytes;
    speakers_ = found_.layout = 0;
    if (!window_.get(bytes, chunk.body))
        return;
    const auto tag = loadBE<std::uint32_t>(bytes.data());
    const auto bitmap = loadBE<std::uint32_t>(bytes.data() + 4);
    found_.layout = speakersOfLayout(tag, bitmap);
    speakers_ = tag == byBitmap ? bitmap : 0;
}

AudioDescription AudioDescriber::description() const
{
    AudioDescription description = found_;
    if (!description.format)
        return description;
    if (container_.traits->kind == ContainerKind::caf)
        description.format->speakers = speakers_;
    else
        description.layout = description.format->speakers.value_or(0);
    count(description);
    return description;
}

void AudioDescriber::count(AudioDescription& description) const
{
    const StreamDescription& stream = description.stream();
    const std::uint64_t counted = description.format->countedPackets;
    const std::uint64_t there = stream.bytesPerPacket > 0 ? description.dataSize / stream.bytesPerPacket : 0;
    if (stream.bytesPerPacket > 0)
        description.packetCount = there;
    else if (container_.traits->kind == ContainerKind::caf)
        description.packetCount =
            packetTable_ ? static_cast<std::uint64_t>(std::max<std::int64_t>(packetTable_->packets, 0)) : 0;
    else
        description.packetCount = counted;

    if (stream.isLinearPCM()) {
        // AIFF counts its frames, of which those are used that are present; a count of 0 despite samples was never
        // filled in.
        if (counted > 0)
            description.packetCount = std::min(counted, there);
        description.frames = description.packetCount;
    } else if (container_.traits->kind == ContainerKind::caf) {
        countPacketsOfCAF(description);
    } else if (container_.traits->kind == ContainerKind::iff) {
        // Packets of one size are counted from the data: some writers state frames instead, or the packets of all
        // channels together.
        description.framesAreStated = stream.bytesPerPacket == 0;
        description.frames = description.framesAreStated ? counted : there * stream.framesPerPacket;
    } else {
        countBlocks(description);
    }
}

/// Counts the frames of compressed data in WAVE and its kin. If the size of the blocks is known, a "fact" is trusted
/// only if its frames need all blocks that are present: some writers count the frames of IMA ADPCM once for all
/// channels.
void AudioDescriber::countBlocks(AudioDescription& description) const
{
    const StreamDescription& stream = description.stream();
    const std::uint64_t framesPerBlock = stream.framesPerPacket;
    const std::uint64_t blocks = stream.bytesPerPacket > 0 ? description.packetCount : 0;
    const std::uint64_t inBlocks = blocks * framesPerBlock;
    const ContainerChkExtended& header = container_.header;
    const bool isLong = factFrames_ == 0xFFFFFFFFU && header.HasValidDs64();
    const std::uint64_t said = isLong ? std::uint64_t{header.sampleCount} : factFrames_.value_or(0);
    description.framesAreStated = inBlocks == 0 || description.missingDataSize > 0 ||
                                  (framesPerBlock > 1 && !areWholeBlocks(*description.format, description.dataSize));
    // At most what the blocks can hold, including one that is cut short.
    if (description.framesAreStated) {
        const std::uint64_t most =
            framesPerBlock > 0 && stream.bytesPerPacket > 0 ? inBlocks + framesPerBlock : INT64_MAX;
        description.frames = factFrames_ ? std::min(said, most) : inBlocks;
        return;
    }
    description.frames = said + framesPerBlock > inBlocks && said < inBlocks ? said : inBlocks;
}

/// At most the frames of as many packets as can be present, each of at least one byte.
void AudioDescriber::countPacketsOfCAF(AudioDescription& description) const
{
    const StreamDescription& stream = description.stream();
    const auto packetsThere =
        static_cast<std::int64_t>(description.dataSize / std::max<std::uint64_t>(stream.bytesPerPacket, 1));
    const std::int64_t packets =
        packetTable_ ? std::clamp<std::int64_t>(packetTable_->packets, 0, packetsThere) : packetsThere;
    std::int64_t capacity = 0;
    if (stream.framesPerPacket == 0 || __builtin_mul_overflow(packets, std::int64_t{stream.framesPerPacket}, &capacity))
        capacity = INT64_MAX;
    const bool isKnown = stream.bytesPerPacket > 0 && stream.framesPerPacket > 0;
    const std::int64_t frames = packetTable_ ? std::clamp<std::int64_t>(packetTable_->frames, 0, capacity)
                                : isKnown    ? capacity
                                             : 0;
    description.frames = static_cast<std::uint64_t>(frames);
    description.framesAreStated = true;
}

std::int32_t describeAudio(HeaderWindow& window, const ContainerLayout& layout, AudioDescription& description)
{
    AudioDescriber describer(window, layout.container);
    for (const Chunk& chunk : layout.chunks) {
        describer.meet({.id = chunk.id,
                        .position = chunk.position,
                        .body = layout.bodyOf(chunk),
                        .size = static_cast<std::int64_t>(chunk.size)});
    }
    description = describer.description();
    if (window.failure() != kStatusOK)
        return window.failure();
    const bool needsSound =
        layout.kind() != ContainerKind::iff || !description.format || description.format->countedPackets > 0;
    if (!description.format || (needsSound && !description.hasSound))
        return kStatusIOError;
    const StreamDescription& stream = description.stream();
    const bool isSound = stream.channelsPerFrame > 0 && (!stream.isLinearPCM() || stream.bytesPerPacket > 0);
    return isSound ? kStatusOK : kStatusIOError;
}

} // namespace platform
