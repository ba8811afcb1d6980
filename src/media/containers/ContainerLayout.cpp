#include "media/containers/ContainerLayout.h"

#include "media/containers/StoredFormat.h"
#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>
#include <string_view>

namespace platform {

namespace {

constexpr std::size_t kMaximumChunks = std::size_t{1} << 22;
constexpr std::uint32_t kSizeIs64Bit = 0xFFFFFFFF;

/// What the "ds64" chunk says, if there is one that counts.
struct Sizes64 {
    std::uint64_t riffSize = 0;
    std::uint64_t dataSize = 0;
    struct Entry {
        FourCC id;
        std::uint64_t size;
    };
    std::array<Entry, 3> table{};
    std::size_t tableLength = 0;
};

/// The last 12 bytes of the identifiers in Wave64: of the file itself, and of all that have a name in RIFF.
constexpr std::string_view kWave64File("\x2E\x91\xCF\x11\xA5\xD6\x28\xDB\x04\xC1\0\0", 12);
constexpr std::string_view kWave64Name("\xF3\xAC\xD3\x11\x8C\xD1\0\xC0\x4F\x8E\xDB\x8A", 12);

/// Whether an identifier of 16 bytes is made of a name and these bytes.
bool isIdentifier(const std::byte* bytes, FourCC name, std::string_view rest)
{
    return loadBE<FourCC>(bytes) == name && std::memcmp(bytes + sizeof name, rest.data(), rest.size()) == 0;
}

class Scan {
public:
    Scan(HeaderWindow& reader, ContainerLayout& layout) : reader_(reader), layout_(layout) {}

    std::int32_t run()
    {
        const std::byte* start = reader_.at(0, 8);
        if (start == nullptr)
            return reader_.status() != kStatusOK ? reader_.status() : kStatusParameterError;
        const FourCC id = loadBE<FourCC>(start);
        if (id == fourCC("caff")) {
            layout_.kind = ContainerKind::caf;
            layout_.fileType = id;
            walkCAF();
        } else if (isWave64(id)) {
            layout_.kind = ContainerKind::wave64;
            layout_.fileType = fourCC("W64f");
            walkWave64();
        } else if (id == fourCC(".snd")) {
            layout_.kind = ContainerKind::au;
            layout_.fileType = fourCC("NeXT");
            walkAU();
        } else if (!recognize(id)) {
            return reader_.status() != kStatusOK ? reader_.status() : kStatusParameterError;
        } else {
            walk();
        }
        if (layout_.chunks.size() >= kMaximumChunks)
            return kStatusOutOfMemory;
        return reader_.status();
    }

private:
    bool recognize(FourCC id)
    {
        const std::byte* start = reader_.at(0, 12);
        if (start == nullptr)
            return false;
        layout_.fileType = loadBE<FourCC>(start + 8);
        if (id == fourCC("FORM")) {
            layout_.kind = ContainerKind::iff;
            const bool isOne = layout_.fileType >> 8 == fourCC("AIFF") >> 8; // Kept: the last character may be any
            if (isOne && layout_.fileType != fourCC("AIFC"))
                layout_.fileType = fourCC("AIFF");
            return isOne;
        }
        layout_.kind = ContainerKind::riff;
        if (id == fourCC("RIFX") && layout_.fileType == fourCC("WAVE")) {
            layout_.isBigEndian = true;
            layout_.fileType = id;
            return true;
        }
        return (id == fourCC("RIFF") || id == fourCC("RF64") || id == fourCC("BW64")) &&
               layout_.fileType == fourCC("WAVE");
    }

    void readSizes64(FourCC containerId)
    {
        const std::byte* first = reader_.at(12, 8 + 28);
        if (layout_.kind != ContainerKind::riff || first == nullptr)
            return;
        const auto id = loadBE<FourCC>(first);
        const auto size = loadLE<std::uint32_t>(first + 4);
        layout_.hasReservation = containerId == fourCC("RIFF") && id == fourCC("JUNK") && size >= 28;
        const bool is64Bit = containerId == fourCC("RF64") || containerId == fourCC("BW64");
        layout_.hasSizes64 = is64Bit && id == fourCC("ds64") && size >= 28;
        if (!layout_.hasSizes64)
            return;
        sizes64_.riffSize = loadLE<std::uint64_t>(first + 8);
        sizes64_.dataSize = loadLE<std::uint64_t>(first + 16);
        const std::size_t length = std::min<std::size_t>({loadLE<std::uint32_t>(first + 32), (size - 28) / 12, 3});
        const std::byte* table = reader_.at(48, length * 12);
        for (; table != nullptr && sizes64_.tableLength < length; table += 12)
            sizes64_.table[sizes64_.tableLength++] = {loadBE<FourCC>(table), loadLE<std::uint64_t>(table + 4)};
    }

    std::uint64_t effectiveSize(FourCC id, std::uint32_t field) const
    {
        if (field != kSizeIs64Bit || !layout_.hasSizes64)
            return field;
        if (id == fourCC("data"))
            return sizes64_.dataSize;
        for (std::size_t i = 0; i < sizes64_.tableLength; ++i)
            if (sizes64_.table[i].id == id)
                return sizes64_.table[i].size;
        return field;
    }

    /// What the container says of its size; 0 when that is open.
    std::int64_t statedSize()
    {
        const std::byte* start = reader_.at(0, 12);
        if (start == nullptr)
            return 0;
        const auto field = load<std::uint32_t>(start + 4, layout_.order());
        if (field == kSizeIs64Bit && layout_.kind == ContainerKind::riff)
            return layout_.hasSizes64 ? static_cast<std::int64_t>(sizes64_.riffSize) : 0;
        return layout_.kind == ContainerKind::iff ? std::int64_t{static_cast<std::int32_t>(field)}
                                                  : std::int64_t{field};
    }

    void walk()
    {
        const std::byte* start = reader_.at(0, 12);
        readSizes64(start != nullptr ? loadBE<FourCC>(start) : 0);
        const std::int64_t stated = statedSize();
        const auto length = static_cast<std::int64_t>(layout_.fileLength);
        // A size that was never filled in means the end of the file.
        const auto limit = static_cast<std::uint64_t>(stated <= 0 || stated > length - 8 ? length : stated + 8);
        layout_.end = 12;
        while (layout_.end + 8 <= limit || isAheadOfSamples()) {
            const std::byte* header = reader_.at(layout_.end, 8);
            if (header == nullptr) {
                layout_.isBroken = true; // the file became shorter meanwhile
                return;
            }
            if (layout_.end + 8 > limit)
                layout_.isBroken = true; // the container is longer than it says
            const auto id = loadBE<FourCC>(header);
            const auto field = load<std::uint32_t>(header + 4, layout_.order());
            std::uint64_t size = effectiveSize(id, field);
            if (meetsSamples(id))
                size = sizeOfSamples({.body = layout_.end + 8,
                                      .size = static_cast<std::int64_t>(size),
                                      .isOpen = field == kSizeIs64Bit && !layout_.hasSizes64,
                                      .containerSize = stated});
            if (!append(id, size))
                return;
            Chunk& chunk = layout_.chunks.back();
            // Kept: some writers leave the pad byte out. A byte that is not zero begins the next header.
            if (chunk.size & 1) {
                const std::byte* pad = reader_.at(layout_.bodyOf(chunk) + chunk.size, 1);
                chunk.padMissing = pad == nullptr || *pad != std::byte{0};
            }
            layout_.end = layout_.nextOf(chunk);
        }
    }

    /// Samples are looked for beyond the end that the container states, too: there are readers that never look at it.
    bool isAheadOfSamples() const { return !layout_.hasSamples && layout_.end + 8 <= layout_.fileLength; }

    /// Whether this is the chunk of samples: the first of its id.
    bool meetsSamples(FourCC id)
    {
        const bool isFirst = id == layout_.audioDataId() && !layout_.hasSamples;
        layout_.hasSamples = layout_.hasSamples || isFirst;
        return isFirst;
    }

    /// Those of an unfinished recording go on to the end of the file. Nothing is put behind samples that a size of none
    /// hides: whoever goes by the sizes would not find the way to it.
    std::uint64_t sizeOfSamples(const SoundChunk& chunk)
    {
        const auto stated = static_cast<std::uint64_t>(chunk.size);
        const std::uint64_t there = layout_.fileLength - chunk.body;
        if (!isUnfinished(layout_.kind, chunk) || stated == there)
            return stated;
        layout_.isBroken = layout_.isBroken || stated < there;
        return UINT64_MAX; // becomes what is there
    }

    void walkCAF()
    {
        layout_.end = 8;
        while (layout_.end + 12 <= layout_.fileLength) {
            const std::byte* header = reader_.at(layout_.end, 12);
            const auto id = header != nullptr ? loadBE<FourCC>(header) : 0;
            const auto stated = header != nullptr ? loadBE<std::int64_t>(header + 4) : std::int64_t{-1};
            const bool isSound = meetsSamples(id);
            if (stated < 0 && !isSound) {
                layout_.isBroken = true;
                return;
            }
            // Samples of which none is there would have a size of 0 if anything followed them, which makes them
            // unfinished: what followed would be taken for sound.
            if (isSound && layout_.end + 12 == layout_.fileLength)
                layout_.isBroken = true;
            const std::uint64_t size = isSound ? sizeOfSamples({.body = layout_.end + 12, .size = stated})
                                               : static_cast<std::uint64_t>(stated);
            if (!append(id, size))
                return;
            layout_.end = layout_.nextOf(layout_.chunks.back());
        }
    }

    bool isWave64(FourCC id)
    {
        const std::byte* start = id == fourCC("riff") ? reader_.at(0, 40) : nullptr;
        return start != nullptr && isIdentifier(start, id, kWave64File) &&
               isIdentifier(start + 24, fourCC("wave"), kWave64Name);
    }

    /// Sizes count the header of 24 bytes. A chunk with another identifier than a name in RIFF goes by its first four
    /// bytes, too.
    void walkWave64()
    {
        constexpr std::uint64_t headerSize = 24, fileHeaderSize = 40;
        const std::byte* start = reader_.at(0, fileHeaderSize);
        const std::uint64_t stated = start != nullptr ? loadLE<std::uint64_t>(start + 16) : 0;
        const bool isOpenFile = stated >= INT64_MAX;
        layout_.end = fileHeaderSize;
        while (layout_.end + headerSize <= layout_.fileLength) {
            const std::byte* header = reader_.at(layout_.end, headerSize);
            if (header == nullptr) {
                layout_.isBroken = true;
                return;
            }
            const FourCC id = loadBE<FourCC>(header);
            const auto extent = loadLE<std::uint64_t>(header + 16);
            std::uint64_t size = extent - std::min(extent, headerSize);
            if (meetsSamples(id))
                size = sizeOfSamples({.body = layout_.end + headerSize,
                                      .size = static_cast<std::int64_t>(std::min<std::uint64_t>(size, INT64_MAX)),
                                      .isOpen = extent >= INT64_MAX,
                                      .containerSize = isOpenFile ? 0 : static_cast<std::int64_t>(stated) - 8});
            else if (extent < headerSize) {
                layout_.isBroken = true;
                return;
            }
            if (!append(id, size))
                return;
            layout_.end = layout_.nextOf(layout_.chunks.back());
        }
    }

    void walkAU()
    {
        constexpr std::uint64_t headerSize = 24;
        const std::byte* start = reader_.at(0, headerSize);
        if (start == nullptr) {
            layout_.isBroken = true;
            return;
        }
        const std::uint64_t body = loadBE<std::uint32_t>(start + 4);
        const auto stated = loadBE<std::uint32_t>(start + 8);
        append(fourCC(".snd"), headerSize);
        layout_.end = body;
        if (body < headerSize || body > layout_.fileLength) {
            layout_.isBroken = true;
            return;
        }
        layout_.hasSamples = true;
        append(fourCC("data"),
               sizeOfSamples({.body = body, .size = std::int64_t{stated}, .isOpen = stated == kSizeIs64Bit}));
        layout_.end = layout_.nextOf(layout_.chunks.back());
    }

    /// Records the chunk at the end; false when there is none, and no more can follow.
    bool append(FourCC id, std::uint64_t size)
    {
        const std::uint64_t available = layout_.fileLength - layout_.end - layout_.headerSize();
        // Zeros are no chunk, nor is what would be zeros with a size that is put right.
        if ((id == 0 && std::min(size, available) == 0) || layout_.chunks.size() >= kMaximumChunks) {
            layout_.isBroken = true;
            return false;
        }
        layout_.chunks.push_back(
            {.position = layout_.end, .size = std::min(size, available), .id = id, .sizeIsStale = size > available});
        return true;
    }

    HeaderWindow& reader_;
    ContainerLayout& layout_;
    Sizes64 sizes64_;
};

} // namespace

std::array<std::byte, 12> ContainerLayout::header(FourCC id, std::uint64_t size) const
{
    std::array<std::byte, 12> bytes{};
    storeBE(bytes.data(), id);
    if (kind == ContainerKind::caf)
        storeBE(bytes.data() + 4, size);
    else
        store(bytes.data() + 4, static_cast<std::uint32_t>(size), order());
    return bytes;
}

const Chunk* ContainerLayout::find(FourCC id) const
{
    const auto found = std::ranges::find(chunks, id, &Chunk::id);
    return found == chunks.end() ? nullptr : &*found;
}

std::int32_t scanChunks(HeaderWindow& window, ContainerLayout& layout)
{
    layout = {};
    layout.fileLength = window.length();
    return Scan(window, layout).run();
}

std::int32_t scanChunks(const FileBytes& file, ContainerLayout& layout)
{
    std::uint64_t length = 0;
    if (const std::int32_t status = file.length(length); status != kStatusOK)
        return status;
    HeaderWindow window(file, length);
    return scanChunks(window, layout);
}

} // namespace platform
