#include "media/containers/ContainerLayout.h"

#include "platform/core/Packed.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

constexpr std::size_t kMaximumChunks = std::size_t{1} << 22;

} // namespace

std::array<std::byte, 12> ContainerLayout::header(FourCC id, std::uint64_t size) const
{
    std::array<std::byte, 12> bytes{};
    storeBE(bytes.data(), id);
    if (kind() == ContainerKind::caf)
        storeBE(bytes.data() + 4, size);
    else
        store(bytes.data() + 4, static_cast<std::uint32_t>(size), container.traits->order);
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
    ChunkWalk walk(window, WalkPolicy::toTheSound);
    if (const std::int32_t status = walk.begin(); status != kStatusOK)
        return status;
    if (walk.container().traits->readFormat == nullptr)
        return kStatusParameterError;
    layout.container = walk.container();
    bool goesOn = true;
    while (goesOn) {
        goesOn = walk.next();
        if (!layout.chunks.empty())
            layout.chunks.back().padMissing = walk.padIsMissing();
        if (!goesOn)
            break;
        if (layout.chunks.size() >= kMaximumChunks)
            return kStatusOutOfMemory;
        const WalkedChunk& chunk = walk.chunk();
        const std::uint64_t there = layout.fileLength - chunk.body;
        const auto size = static_cast<std::uint64_t>(chunk.size);
        layout.chunks.push_back(
            {.position = chunk.position, .size = std::min(size, there), .id = chunk.id, .sizeIsStale = size > there});
    }
    layout.end = walk.end();
    layout.isBroken = walk.isBroken();
    return window.failure();
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
