#include "media/containers/ChunkWalk.h"

#include "media/containers/StoredFormat.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>

namespace platform {

namespace {

constexpr std::uint32_t kSizeElsewhere = 0xFFFFFFFF; // the size stands in the "ds64", or is open
constexpr std::int64_t kToTheEnd = INT64_MAX;
constexpr std::uint64_t kAUHeaderSize = 24;
constexpr std::int64_t kAheadOfSize = 8; // the container's size counts from here

/// Some writers omit the pad byte after an odd size, so a byte counts as padding only if it is zero.
bool isPad(HeaderWindow& window, std::uint64_t position)
{
    const std::byte* byte = window.at(position, 1);
    return byte != nullptr && *byte == std::byte{0};
}

std::int64_t atMost63Bits(std::uint64_t size)
{
    return static_cast<std::int64_t>(std::min<std::uint64_t>(size, kToTheEnd));
}

} // namespace

std::int32_t readContainerHeader(HeaderWindow& window, ContainerChkExtended& header)
{
    header = {};
    const std::byte* bytes = window.at(0, ContainerChkExtended::kHeadersSize);
    if (bytes == nullptr)
        return window.reason();
    std::memcpy(static_cast<void*>(&header), bytes, ContainerChkExtended::kHeadersSize);
    const auto id = loadBE<FourCC>(bytes);
    const FourCC sizesChunk = id == kRF64 || id == kBW64 ? kDs64 : kJUNK;
    if (loadBE<FourCC>(bytes + 8) == kWAVE && loadBE<FourCC>(bytes + 12) == sizesChunk) {
        const auto size = loadLE<std::uint32_t>(bytes + 16);
        const std::size_t held = std::min<std::size_t>(size, ContainerChkExtended::kBodyCapacity);
        const std::int32_t status = window.read(&header.riffSize, ContainerChkExtended::kHeadersSize, held);
        if (status != kStatusOK)
            return status;
    }
    header.ByteOrder();
    return kStatusOK;
}

std::int64_t nextChunkHeader(HeaderWindow& window, const ContainerChkExtended& header, std::int64_t position,
                             const ChkHeader& current, ChkHeader& next, std::int32_t& error)
{
    const auto length = static_cast<std::int64_t>(window.length());
    const auto read = [&](std::int64_t at) {
        if (at < 0)
            return std::int32_t{kStatusParameterError};
        return window.get(next, static_cast<std::uint64_t>(at)) ? std::int32_t{kStatusOK} : window.reason();
    };
    std::int64_t size = 0;
    std::int64_t candidate = sizeof(ContainerChk);
    if (position == 0) {
        error = read(candidate);
    } else if (current.id == 0 && current.size == 0) {
        error = kStatusParameterError;
    } else if (size = current.EffectiveSize(header);
               __builtin_add_overflow(position + std::int64_t{sizeof current}, size, &candidate)) {
        error = kStatusEndOfFile;
    } else {
        if ((size & 1) != 0 && candidate >= 0 && isPad(window, static_cast<std::uint64_t>(candidate)))
            ++candidate;
        error = read(candidate);
    }
    if (error == kStatusOK)
        next.ByteOrder(header);
    else
        next = {};
    if (position == 0)
        return candidate;
    return error != kStatusOK || size < 0 || candidate > length ? length : candidate;
}

std::int32_t ChunkWalk::begin()
{
    constexpr std::uint64_t least = 16; // Kept: as stated, a shorter file is no container
    const auto there = static_cast<std::size_t>(std::min<std::uint64_t>(window_.length(), kMostOfContainerStart));
    const std::byte* start = window_.at(0, there);
    if (start == nullptr)
        return window_.reason();
    const ContainerTraits* traits = recogniseContainer({start, there});
    const bool isTooShort = policy_ == WalkPolicy::asStated && there < least;
    if (traits == nullptr || (isTooShort && traits->kind != ContainerKind::caf))
        return kStatusParameterError;
    container_.traits = traits;
    container_.id = loadBE<FourCC>(start);
    limit_ = window_.length();
    statedEnd_ = atMost63Bits(limit_);
    if (traits->kind == ContainerKind::wave64) {
        const auto stated = loadLE<std::uint64_t>(start + 16);
        containerSize_ = stated >= kToTheEnd ? 0 : static_cast<std::int64_t>(stated) - kAheadOfSize;
    }
    return isChunked() ? beginChunked() : std::int32_t{kStatusOK};
}

void ChunkWalk::beginAs(const ContainerChkExtended& header)
{
    container_ = {&traitsOf(ContainerKind::riff), header.id, header.formType, header};
    containerSize_ = header.EffectiveSize();
    setStatedEnd();
}

std::int32_t ChunkWalk::beginChunked()
{
    const std::byte* start = window_.at(0, sizeof(ContainerChk));
    const auto field = load<std::uint32_t>(start + 4, container_.traits->order);
    container_.formType = loadBE<FourCC>(start + 8);
    if (container_.traits->kind == ContainerKind::rifx) {
        containerSize_ = field;
    } else {
        const std::int32_t status = readContainerHeader(window_, container_.header);
        if (status != kStatusOK && (policy_ == WalkPolicy::asStated || status != kStatusEndOfFile))
            return status;
        if (status != kStatusOK) { // too short for a first chunk that holds sizes
            container_.header = {};
            container_.header.id = container_.id;
            container_.header.size = field;
            container_.header.formType = container_.formType;
        }
        containerSize_ = container_.header.EffectiveSize();
    }
    setStatedEnd();
    const bool isSigned = container_.traits->kind == ContainerKind::iff;
    if (field == kSizeElsewhere && !isSigned && !container_.header.HasValidDs64())
        containerSize_ = 0;
    if (containerSize_ > 0)
        limit_ = static_cast<std::uint64_t>(statedEnd_);
    return kStatusOK;
}

void ChunkWalk::setStatedEnd()
{
    const auto length = static_cast<std::int64_t>(window_.length());
    statedEnd_ = containerSize_ > length - kAheadOfSize ? length : containerSize_ + kAheadOfSize;
}

bool ChunkWalk::next()
{
    if (policy_ == WalkPolicy::toTheSound)
        return container_.traits->kind == ContainerKind::au ? nextOfAU() : nextToTheSound();
    return isChunked() && container_.traits->kind != ContainerKind::rifx ? nextBySteps() : nextAsStated();
}

bool ChunkWalk::nextBySteps()
{
    std::int32_t error = kStatusOK;
    if (!hasBegun_)
        following_ = nextChunkHeader(window_, container_.header, 0, {}, ahead_, error);
    else if (following_ >= statedEnd_)
        return false;
    hasBegun_ = true;
    const ChkHeader current = ahead_;
    const std::int64_t position = following_;
    if (error == kStatusOK)
        following_ = nextChunkHeader(window_, container_.header, position, current, ahead_, error);
    // A parameter error means zeros, or a size that leads to before the file.
    if (error != kStatusOK && error != kStatusEndOfFile && error != kStatusParameterError) {
        status_ = error;
        return false;
    }
    chunk_ = {.id = current.id,
              .field = current.size,
              .position = static_cast<std::uint64_t>(position),
              .body = static_cast<std::uint64_t>(position) + sizeof current,
              .size = current.EffectiveSize(container_.header)};
    return true;
}

bool ChunkWalk::nextAsStated()
{
    if (!hasBegun_)
        following_ = container_.traits->firstChunk;
    hasBegun_ = true;
    if (following_ >= statedEnd_)
        return false;
    const std::byte* header = readHeader(static_cast<std::uint64_t>(following_));
    if (header == nullptr) {
        status_ = window_.reason() == kStatusEndOfFile ? std::int32_t{kStatusOK} : window_.reason();
        return false;
    }
    chunk_.size = statedSize(header);
    if (chunk_.size < 0 || __builtin_add_overflow(static_cast<std::int64_t>(chunk_.body), chunk_.size, &following_)) {
        following_ = kToTheEnd;
        return true;
    }
    if (following_ < statedEnd_)
        following_ = static_cast<std::int64_t>(padded(static_cast<std::uint64_t>(following_)));
    return true;
}

/// Null if the file does not hold all of it.
const std::byte* ChunkWalk::readHeader(std::uint64_t position)
{
    const std::size_t size = container_.traits->chunkHeaderSize;
    const std::byte* header = window_.at(position, size);
    if (header != nullptr)
        chunk_ = {.id = loadBE<FourCC>(header), .position = position, .body = position + size};
    return header;
}

/// The size in the header; negative if it is impossible.
std::int64_t ChunkWalk::statedSize(const std::byte* header)
{
    switch (container_.traits->kind) {
    case ContainerKind::caf:
        return loadBE<std::int64_t>(header + 4);
    // Its sizes include the header.
    case ContainerKind::wave64: {
        const std::int64_t extent = atMost63Bits(loadLE<std::uint64_t>(header + 16));
        return extent == kToTheEnd ? kToTheEnd : extent - container_.traits->chunkHeaderSize;
    }
    default:
        break;
    }
    chunk_.field = load<std::uint32_t>(header + 4, container_.traits->order);
    if (container_.traits->kind != ContainerKind::riff)
        return chunk_.field;
    const std::int64_t size = ChkHeader{chunk_.id, chunk_.field}.EffectiveSize(container_.header);
    return size < 0 ? kToTheEnd : size; // a size from a "ds64" that is larger than any file
}

/// The position of the chunk after one that ends at `end`.
std::uint64_t ChunkWalk::padded(std::uint64_t end)
{
    const std::uint64_t pad = container_.traits->padOf(end - chunk_.body);
    padIsMissing_ = container_.traits->alignment == 2 && pad != 0 && !isPad(window_, end);
    return padIsMissing_ ? end : end + pad;
}

/// Moves past the chunk, which ends with the file at the latest.
void ChunkWalk::pass()
{
    const auto size = static_cast<std::uint64_t>(chunk_.size);
    end_ = padded(chunk_.body + std::min(size, window_.length() - chunk_.body));
}

bool ChunkWalk::nextToTheSound()
{
    const ContainerTraits& traits = *container_.traits;
    if (hasBegun_)
        pass();
    else
        end_ = traits.firstChunk;
    hasBegun_ = true;
    const std::uint64_t behindHeader = end_ + traits.chunkHeaderSize;
    const bool isLooking = !(metSound_ && metFormat_) && behindHeader <= window_.length();
    if (behindHeader > limit_ && !isLooking)
        return false;
    isBroken_ = isBroken_ || behindHeader > limit_; // the container is longer than it says
    const std::byte* header = readHeader(end_);
    if (header == nullptr) { // the file was cut meanwhile, or cannot be read
        status_ = window_.failure();
        return endAsBroken();
    }
    std::int64_t size = statedSize(header);
    const bool isSound = chunk_.id == traits.soundId && !metSound_;
    if (isSound)
        size = sizeOfSound(size);
    const std::uint64_t there = window_.length() - chunk_.body;
    // Zeros are no chunk, and neither is an id of zero whose size would be corrected.
    if (size < 0 || (chunk_.id == 0 && (size == 0 || there == 0)))
        return endAsBroken();
    chunk_.size = size;
    metSound_ = metSound_ || isSound;
    metFormat_ = metFormat_ || chunk_.id == traits.formatId;
    return true;
}

bool ChunkWalk::endAsBroken()
{
    isBroken_ = true;
    return false;
}

/// The size of the samples; in an unfinished recording they extend to the end of the file. The walk counts as broken if
/// an empty size hides samples, because a reader that goes by sizes would not find a chunk put behind them.
std::int64_t ChunkWalk::sizeOfSound(std::int64_t stated)
{
    const ContainerKind kind = container_.traits->kind;
    const std::uint64_t there = window_.length() - chunk_.body;
    SoundChunk sound{.body = chunk_.body, .size = stated, .containerSize = containerSize_};
    if (isChunked() || kind == ContainerKind::au)
        sound.isOpen = chunk_.field == kSizeElsewhere && !container_.header.HasValidDs64();
    if (kind == ContainerKind::wave64) {
        sound.isOpen = stated == kToTheEnd;
        sound.size = std::max<std::int64_t>(stated, 0);
    }
    // An empty sound chunk at the end of a CAF file becomes unfinished as soon as anything follows it, and what follows
    // would be taken for sound.
    if (kind == ContainerKind::caf && there == 0)
        isBroken_ = true;
    if (!isUnfinished(kind, sound) || static_cast<std::uint64_t>(sound.size) == there)
        return sound.size;
    isBroken_ = isBroken_ || static_cast<std::uint64_t>(sound.size) < there;
    return kToTheEnd;
}

/// First the header, then the samples.
bool ChunkWalk::nextOfAU()
{
    if (!hasBegun_) {
        const std::byte* header = window_.at(0, kAUHeaderSize);
        if (header == nullptr) {
            status_ = window_.failure();
            return endAsBroken();
        }
        hasBegun_ = metFormat_ = true;
        chunk_ = {.id = container_.traits->formatId, .size = kAUHeaderSize};
        end_ = loadBE<std::uint32_t>(header + 4);
        ahead_.size = loadBE<std::uint32_t>(header + 8);
        return true;
    }
    if (metSound_) {
        pass();
        return false;
    }
    if (end_ < kAUHeaderSize || end_ > window_.length())
        return endAsBroken();
    chunk_ = {.id = container_.traits->soundId, .field = ahead_.size, .position = end_, .body = end_};
    chunk_.size = sizeOfSound(chunk_.field);
    return metSound_ = true;
}

} // namespace platform
