#include "media/containers/ChunkBodyCheck.h"

#include "media/containers/ChunkRules.h"

#include <algorithm>

namespace platform {

namespace {

using Kind = ContainerFinding::Kind;

class BodyCheck {
public:
    BodyCheck(HeaderWindow& window, const ContainerTraits& traits,
              const std::function<void(const ContainerFinding&)>& add)
        : window_(window),
          traits_(traits),
          add_(add)
    {
    }

    void check(const WalkedChunk& chunk);

private:
    void checkTable(const WalkedChunk& chunk);
    void checkList(const WalkedChunk& chunk);
    void checkOffset(const WalkedChunk& chunk);

    HeaderWindow& window_;
    const ContainerTraits& traits_;
    const std::function<void(const ContainerFinding&)>& add_;
};

void BodyCheck::check(const WalkedChunk& chunk)
{
    const std::byte* const name = traits_.hasChunks ? window_.at(chunk.position, sizeof(FourCC)) : nullptr;
    if (name != nullptr && !isChunkName(name))
        add_({.kind = Kind::idIsNoName, .chunk = chunk.id, .offset = chunk.position});
    const auto size = static_cast<std::uint64_t>(chunk.size);
    if (const std::uint32_t least = leastSizeOfChunk(traits_.kind, chunk.id); size < least)
        add_({.kind = Kind::chunkIsShort, .chunk = chunk.id, .offset = chunk.position, .stated = least, .found = size});
    if (chunk.id == kDs64 && chunk.position == traits_.firstChunk)
        checkTable(chunk);
    if (chunk.id == fourCC("SSND"))
        checkOffset(chunk);
    if (chunk.id == fourCC("LIST") && traits_.chunkHeaderSize == sizeof(ChkHeader))
        checkList(chunk);
}

/// Checks the sizes of further chunks, which follow those that every "ds64" has.
void BodyCheck::checkTable(const WalkedChunk& chunk)
{
    constexpr std::uint64_t fixedSize = 28, entrySize = 12;
    const std::byte* const count = chunk.size >= std::int64_t{fixedSize} ? window_.at(chunk.body + 24, 4) : nullptr;
    if (count == nullptr)
        return;
    const std::uint64_t room = (static_cast<std::uint64_t>(chunk.size) - fixedSize) / entrySize;
    if (const auto entries = loadLE<std::uint32_t>(count); entries > room)
        add_({.kind = Kind::tableIsShort,
              .chunk = chunk.id,
              .offset = chunk.position,
              .stated = entries,
              .found = room});
}

/// Checks the chunks inside a chunk. The first that does not fit ends the check, as it ends reading.
void BodyCheck::checkList(const WalkedChunk& chunk)
{
    const std::uint64_t end = chunk.body + static_cast<std::uint64_t>(chunk.size);
    for (std::uint64_t at = chunk.body + sizeof(FourCC); at + sizeof(ChkHeader) <= end;) {
        const std::byte* const header = window_.at(at, sizeof(ChkHeader));
        if (header == nullptr || loadBE<FourCC>(header) == 0) // padding behind the last item
            return;
        const auto id = loadBE<FourCC>(header);
        const std::uint64_t size = load<std::uint32_t>(header + sizeof(FourCC), traits_.order);
        const std::uint64_t bodyEnd = at + sizeof(ChkHeader) + size;
        if (bodyEnd > end) {
            add_({.kind = Kind::chunkReachesOut, .chunk = id, .offset = at, .stated = end, .found = bodyEnd});
            return;
        }
        const std::byte* const next =
            (size & 1) != 0 && bodyEnd + sizeof(ChkHeader) <= end ? window_.at(bodyEnd, sizeof(ChkHeader)) : nullptr;
        const bool isPadless = isChunkName(next) && load<std::uint32_t>(next + sizeof(FourCC), traits_.order) <=
                                                        end - bodyEnd - sizeof(ChkHeader);
        if (isPadless)
            add_({.kind = Kind::padIsMissing, .chunk = id, .offset = at, .found = size});
        at = bodyEnd + (isPadless ? 0 : size & 1);
    }
}

/// Samples may begin after the start of their chunk's body, but not after its end.
void BodyCheck::checkOffset(const WalkedChunk& chunk)
{
    constexpr std::uint64_t fixedSize = 8;
    const std::byte* const field = chunk.size >= std::int64_t{fixedSize} ? window_.at(chunk.body, 4) : nullptr;
    const std::uint64_t offset = field != nullptr ? loadBE<std::uint32_t>(field) : 0;
    const std::uint64_t there = static_cast<std::uint64_t>(chunk.size) - fixedSize;
    if (field != nullptr && offset > there)
        add_({.kind = Kind::offsetIsWrong,
              .chunk = chunk.id,
              .offset = chunk.position,
              .stated = offset,
              .found = there});
}

} // namespace

bool isChunkName(const std::byte* bytes)
{
    return bytes != nullptr && std::all_of(bytes, bytes + 4, [](std::byte byte) {
               return byte >= std::byte{' '} && byte <= std::byte{'~'};
           });
}

void checkChunkBody(HeaderWindow& window, const Container& container, const WalkedChunk& chunk,
                    const std::function<void(const ContainerFinding&)>& add)
{
    BodyCheck(window, *container.traits, add).check(chunk);
}

} // namespace platform
