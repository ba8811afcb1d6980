#include "media/containers/ContainerCheck.h"

#include "media/containers/AudioDescription.h"
#include "media/containers/ChunkBodyCheck.h"
#include "media/containers/ChunkRules.h"
#include "media/containers/ChunkWalk.h"

#include <algorithm>
#include <optional>
#include <unordered_map>
#include <utility>

namespace platform {

namespace {

using Kind = ContainerFinding::Kind;

constexpr std::uint32_t kOpenField = 0xFFFFFFFF;

/// One look through one file.
class Check {
public:
    Check(HeaderWindow& window, std::vector<ContainerFinding>& findings) : window_(window), findings_(findings) {}

    std::int32_t run();

private:
    const Container& container() const { return walk_.container(); }
    const ContainerTraits& traits() const { return *container().traits; }
    bool isSound(const WalkedChunk& chunk) const { return chunk.id == traits().soundId && chunk.position == soundAt_; }
    void add(const ContainerFinding& finding);
    void checkContainerSize();
    void checkPlace(const WalkedChunk& chunk);
    void checkSize(const WalkedChunk& chunk);
    bool checkPad(const WalkedChunk& chunk);
    void checkEnd();
    std::uint64_t chunksBehind(std::uint64_t position);
    void checkSound(const AudioDescription& sound);
    void checkCounts(const AudioDescription& sound);
    void checkFact(const AudioDescription& sound);
    void checkByteRate(const StreamDescription& stream);

    HeaderWindow& window_;
    std::vector<ContainerFinding>& findings_;
    ChunkWalk walk_{window_, WalkPolicy::toTheSound};
    std::optional<std::uint64_t> statedEnd_;           // none if the container's size is open or its kind has none
    std::unordered_map<FourCC, std::uint64_t> places_; // first position of each id that may occur only once
    std::uint64_t formatAt_ = 0, soundAt_ = 0, factAt_ = 0;
    std::optional<std::uint32_t> factFrames_, byteRate_;
};

void Check::add(const ContainerFinding& finding)
{
    if (findings_.size() < kMostFindings)
        findings_.push_back(finding);
}

std::int32_t Check::run()
{
    if (const std::int32_t status = walk_.begin(); status != kStatusOK)
        return status;
    AudioDescriber describer(window_, container());
    checkContainerSize();
    bool isLost = false; // nobody can tell where the chunks continue
    while (!isLost && walk_.next()) {
        const WalkedChunk chunk = walk_.chunk();
        describer.meet(chunk);
        checkPlace(chunk);
        checkSize(chunk);
        if (chunk.hasItsBytes(window_.length()))
            checkChunkBody(window_, container(), chunk, [this](const ContainerFinding& finding) { add(finding); });
        isLost = !checkPad(chunk);
    }
    if (!isLost)
        checkEnd();
    const AudioDescription sound = describer.description();
    if (traits().formatId != 0 && (!isLost || (sound.format && sound.hasSound)))
        checkSound(sound);
    return window_.failure();
}

void Check::checkContainerSize()
{
    constexpr std::uint64_t aheadOfSize = 8, openSize64 = INT64_MAX;
    const ContainerKind kind = traits().kind;
    if (kind == ContainerKind::caf || kind == ContainerKind::au)
        return;
    if ((container().id == kRF64 || container().id == kBW64) && !container().header.HasValidDs64())
        add({.kind = Kind::sizes64AreMissing, .chunk = container().id, .offset = 0});
    std::uint64_t stated = 0; // 0 if it is open
    if (kind == ContainerKind::wave64) {
        const std::byte* size = window_.at(16, sizeof stated);
        const std::uint64_t whole = size != nullptr ? loadLE<std::uint64_t>(size) : 0;
        stated = whole > aheadOfSize && whole < openSize64 ? whole - aheadOfSize : 0;
    } else if (const std::byte* size = window_.at(4, sizeof(std::uint32_t)); size != nullptr) {
        const auto field = load<std::uint32_t>(size, traits().order);
        const std::uint64_t size64 = container().header.HasValidDs64() ? std::uint64_t{container().header.riffSize} : 0;
        if (size64 != 0 && field != kOpenField && field != size64)
            add({.kind = Kind::sizes64Differ, .chunk = container().id, .stated = field, .found = size64});
        const bool isElsewhere = field == kOpenField && container().header.HasValidDs64();
        stated = isElsewhere ? std::uint64_t{container().header.riffSize} : field == kOpenField ? 0 : field;
    }
    if (stated == 0 || stated >= openSize64) {
        add({.kind = Kind::sizeIsOpen, .chunk = container().id, .found = window_.length() - aheadOfSize});
        return;
    }
    statedEnd_ = aheadOfSize + stated;
    if (*statedEnd_ > window_.length())
        add({.kind = Kind::containerIsCut, .chunk = container().id, .stated = *statedEnd_, .found = window_.length()});
}

/// Checks order and number of chunks.
void Check::checkPlace(const WalkedChunk& chunk)
{
    const ContainerKind kind = traits().kind;
    const bool isSingle = isSingleChunk(kind, chunk.id);
    const auto [first, isFirst] = isSingle ? places_.emplace(chunk.id, chunk.position) : std::pair(places_.end(), true);
    if (!isFirst) {
        add({.kind = Kind::repeated, .chunk = chunk.id, .offset = chunk.position, .stated = first->second});
        return;
    }
    if (statedEnd_ && chunk.position >= *statedEnd_)
        add({.kind = Kind::chunkBehind, .chunk = chunk.id, .offset = chunk.position, .stated = *statedEnd_});
    if (chunk.id == traits().formatId) {
        formatAt_ = chunk.position;
        const bool isWAVE = traits().formatId == fourCC("fmt ");
        if (const std::byte* rate = isWAVE && chunk.size >= 12 ? window_.at(chunk.body + 8, 4) : nullptr;
            rate != nullptr)
            byteRate_ = load<std::uint32_t>(rate, traits().order);
        const bool mustBeFirst = kind == ContainerKind::caf && chunk.position != traits().firstChunk;
        const bool isBehindSound = kind != ContainerKind::iff && soundAt_ != 0;
        if (mustBeFirst || isBehindSound)
            add({.kind = Kind::formatIsLate, .chunk = chunk.id, .offset = chunk.position});
    } else if (chunk.id == traits().soundId) {
        soundAt_ = chunk.position;
    } else if (chunk.id == fourCC("fact")) {
        factAt_ = chunk.position;
        if (const std::byte* frames = chunk.size >= 4 ? window_.at(chunk.body, 4) : nullptr; frames != nullptr)
            factFrames_ = load<std::uint32_t>(frames, traits().order);
    }
}

void Check::checkSize(const WalkedChunk& chunk)
{
    const ContainerKind kind = traits().kind;
    const std::uint64_t there = window_.length() - std::min(chunk.body, window_.length());
    const std::uint64_t sizes64 = container().header.dataSize;
    if (isSound(chunk) && container().header.HasValidDs64() && chunk.field != kOpenField && sizes64 != 0 &&
        sizes64 != chunk.field)
        add({.kind = Kind::sizes64Differ,
             .chunk = chunk.id,
             .offset = chunk.position,
             .stated = chunk.field,
             .found = sizes64});
    if (isSound(chunk) && chunk.size == INT64_MAX) {
        // In CAF and AU the last chunk may extend to the end of the file; in CAF only with a size of -1.
        const std::byte* const field = kind == ContainerKind::caf ? window_.at(chunk.position + 4, 8) : nullptr;
        const bool isByRule = kind == ContainerKind::au || (field != nullptr && loadBE<std::int64_t>(field) == -1);
        if (!isByRule)
            add({.kind = Kind::sizeIsOpen, .chunk = chunk.id, .offset = chunk.position, .found = there});
        return;
    }
    const auto size = static_cast<std::uint64_t>(chunk.size);
    if (size > there)
        add({.kind = Kind::chunkIsCut, .chunk = chunk.id, .offset = chunk.position, .stated = size, .found = there});
    else if (statedEnd_ && chunk.position < *statedEnd_ && chunk.body + size > *statedEnd_)
        add({.kind = Kind::chunkReachesOut,
             .chunk = chunk.id,
             .offset = chunk.position,
             .stated = *statedEnd_,
             .found = chunk.body + size});
}

/// False if nobody can tell where the chunks continue: readers that know about missing pad bytes take a byte that is
/// not zero for the start of the next chunk, all others for a pad byte.
bool Check::checkPad(const WalkedChunk& chunk)
{
    if (traits().alignment != 2 || chunk.size % 2 == 0 || !chunk.hasItsBytes(window_.length()))
        return true;
    const auto size = static_cast<std::uint64_t>(chunk.size);
    const std::uint64_t end = chunk.body + size;
    const std::byte* found = window_.at(end, 1);
    if (found != nullptr && *found == std::byte{0})
        return true;
    const auto byte = found != nullptr ? static_cast<std::uint64_t>(*found) : 0;
    const bool isPad = found != nullptr && !isChunkName(window_.at(end, 4)) && isChunkName(window_.at(end + 1, 4));
    if (isPad)
        add({.kind = Kind::padIsNotZero, .chunk = chunk.id, .offset = end, .found = byte});
    else
        add({.kind = Kind::padIsMissing, .chunk = chunk.id, .offset = chunk.position, .found = size});
    return !isPad;
}

void Check::checkEnd()
{
    const std::uint64_t length = window_.length(), end = walk_.end();
    const std::uint64_t limit = std::min(statedEnd_.value_or(length), length);
    if (traits().kind == ContainerKind::au) {
        if (soundAt_ != 0 && end < length)
            add({.kind = Kind::bytesBehind,
                 .chunk = container().id,
                 .offset = end,
                 .stated = end,
                 .found = length - end});
        return;
    }
    const bool isFill = traits().kind == ContainerKind::caf && length - end == 1; // writers make lengths even
    if (end < limit && !isFill)
        add({.kind = Kind::noChunk, .chunk = container().id, .offset = end, .found = limit - end});
    const bool isOwnPad =
        statedEnd_ && end == length && length - *statedEnd_ == 1; // a last byte that the container does not count
    if (!statedEnd_ || *statedEnd_ >= length || isOwnPad)
        return;
    if (const std::uint64_t behind = chunksBehind(*statedEnd_); behind < length)
        add({.kind = Kind::bytesBehind,
             .chunk = container().id,
             .offset = behind,
             .stated = *statedEnd_,
             .found = length - behind});
}

/// Reports chunks behind the container, which programs leave that do not update its size, and returns the end of the
/// last. Bytes that only look like a chunk do not lead to the end of the file or to another chunk.
std::uint64_t Check::chunksBehind(std::uint64_t position)
{
    const std::uint64_t length = window_.length();
    while (traits().chunkHeaderSize == sizeof(ChkHeader) && length - position >= sizeof(ChkHeader)) {
        const std::byte* const header = window_.at(position, sizeof(ChkHeader));
        if (!isChunkName(header))
            break;
        const std::uint64_t size = load<std::uint32_t>(header + sizeof(FourCC), traits().order);
        if (size > length - position - sizeof(ChkHeader))
            break;
        const FourCC id = loadBE<FourCC>(header);
        if (id != traits().formatId && id != traits().soundId) // these were met, because readers look for them there
            add({.kind = Kind::chunkBehind, .chunk = id, .offset = position, .stated = statedEnd_.value_or(0)});
        position = std::min(position + sizeof(ChkHeader) + size + (size & 1), length);
    }
    return position;
}

void Check::checkSound(const AudioDescription& sound)
{
    const FourCC formatId = traits().formatId, soundId = traits().soundId;
    if (!sound.format) {
        add({.kind = Kind::formatIsMissing, .chunk = formatId, .offset = formatAt_});
        return;
    }
    if (container().formType == fourCC("AIFC") && !places_.contains(fourCC("FVER")))
        add({.kind = Kind::versionIsMissing, .chunk = fourCC("FVER")});
    const StreamDescription& stream = sound.stream();
    const bool isPCM = stream.isLinearPCM();
    if (stream.channelsPerFrame == 0 || !(stream.sampleRate > 0) || (isPCM && stream.bytesPerFrame == 0)) {
        add({.kind = Kind::formatIsWrong, .chunk = formatId, .offset = formatAt_});
        return;
    }
    if (!sound.hasSound) {
        if (traits().kind != ContainerKind::iff || sound.format->countedPackets > 0)
            add({.kind = Kind::soundIsMissing, .chunk = soundId});
        return;
    }
    if (sound.missingDataSize > 0) // after a cut no count agrees
        return;
    const std::uint64_t rest = isPCM ? sound.dataSize % stream.bytesPerFrame : 0;
    const bool isCounted = sound.format->countedPackets > 0; // and a pad byte may be part of the chunk
    if (rest > (isCounted ? 1 : 0))
        add({.kind = Kind::soundIsUneven,
             .chunk = soundId,
             .offset = soundAt_,
             .stated = stream.bytesPerFrame,
             .found = rest});
    checkCounts(sound);
}

/// Checks the numbers of frames that other chunks state.
void Check::checkCounts(const AudioDescription& sound)
{
    const StreamDescription& stream = sound.stream();
    if (factFrames_)
        checkFact(sound);
    else if (factAt_ == 0 && stream.framesPerPacket != 1 && traits().formatId == fourCC("fmt ") &&
             !container().header.HasValidDs64())
        add({.kind = Kind::factIsMissing, .chunk = fourCC("fact")});
    if (!stream.isLinearPCM())
        return;
    if (byteRate_)
        checkByteRate(stream);
    const std::uint64_t there = sound.dataSize / stream.bytesPerFrame;
    if (traits().kind == ContainerKind::iff) {
        const std::uint64_t counted = sound.format->countedPackets;
        const Kind kind = counted == 0 ? Kind::countIsOpen : Kind::framesDiffer;
        if (counted != there)
            add({.kind = kind, .chunk = traits().formatId, .offset = formatAt_, .stated = counted, .found = there});
    }
    const ContainerChkExtended& header = container().header;
    if (header.HasValidDs64() && header.sampleCount != 0 && header.sampleCount != there)
        add({.kind = Kind::framesDiffer,
             .chunk = kDs64,
             .offset = traits().firstChunk,
             .stated = header.sampleCount,
             .found = there});
}

/// Checks the byte rate, from which players compute the length of sound that they do not measure.
void Check::checkByteRate(const StreamDescription& stream)
{
    const auto real = static_cast<std::uint64_t>(stream.sampleRate * stream.bytesPerFrame);
    if (*byteRate_ != real)
        add({.kind = Kind::byteRateDiffers,
             .chunk = traits().formatId,
             .offset = formatAt_,
             .stated = *byteRate_,
             .found = real});
}

/// For codings without packets of one size only the decoder could tell.
void Check::checkFact(const AudioDescription& sound)
{
    const StreamDescription& stream = sound.stream();
    const ContainerChkExtended& header = container().header;
    const bool isElsewhere = *factFrames_ == kOpenField && header.HasValidDs64();
    const std::uint64_t stated = isElsewhere ? std::uint64_t{header.sampleCount} : *factFrames_;
    if (stream.bytesPerPacket == 0 || stream.framesPerPacket == 0)
        return;
    const std::uint64_t inPackets = sound.dataSize / stream.bytesPerPacket * stream.framesPerPacket;
    if (stated > inPackets || stated + stream.framesPerPacket <= inPackets)
        add({.kind = stated == 0 ? Kind::countIsOpen : Kind::framesDiffer,
             .chunk = fourCC("fact"),
             .offset = factAt_,
             .stated = stated,
             .found = inPackets});
}

} // namespace

std::int32_t checkContainer(HeaderWindow& window, std::vector<ContainerFinding>& findings)
{
    return Check(window, findings).run();
}

} // namespace platform
