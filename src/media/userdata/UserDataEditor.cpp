#include "media/userdata/UserDataEditor.h"

#include "media/containers/ContainerSizes.h"
#include "media/userdata/ChunkEmitter.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace platform {

namespace {
/// How much of other chunks an edit copies to keep their order; beyond it the edit takes the road without copies.
constexpr std::uint64_t kLargestCopy = 16 * 1024 * 1024;
} // namespace

std::int32_t UserDataEditor::replace(std::size_t chunk, BytesView body)
{
    const Chunk old = layout_.chunks[chunk]; // a copy: the list changes
    if (old.size == body.size()) {
        const std::int32_t status = file_.overwrite(layout_.bodyOf(old), body);
        rescan();
        return status;
    }
    if (body.size() > layout_.largestChunk())
        return kStatusFileTooBig;
    if (layout_.chunks.back().sizeIsStale && layout_.chunks.back().id == ContainerLayout::filler)
        if (const std::int32_t status = trimEnd(); status != kStatusOK)
            return status;
    const Piece piece{old.id, body.size(), body};
    if (const auto status = placeInFrontOf(chunk, {piece}))
        return finish(*status);
    if (const auto status = placeBehind(chunk, piece))
        return finish(*status);
    if (auto content = everythingFrom(chunk + 1)) {
        content->insert(content->begin(), piece);
        if (const auto status = placeAtEnd(chunk, *content))
            return finish(*status);
    }
    return finish(replaceByTwoSteps(chunk, piece));
}

std::int32_t UserDataEditor::append(FourCC id, BytesView body)
{
    return body.size() > layout_.largestChunk() ? kStatusFileTooBig : finish(appendContent({{id, body.size(), body}}));
}

std::int32_t UserDataEditor::remove(const std::vector<std::size_t>& chunks)
{
    return finish(hideAll(chunks));
}

// What chunks are to an edit.

/// The first chunk stays what it is: in WAVE it may be the place of a "ds64", in CAF it is the description.
bool UserDataEditor::isFiller(std::size_t chunk) const
{
    return chunk > 0 && layout_.chunks[chunk].id == ContainerLayout::filler;
}

bool UserDataEditor::isMovable(std::size_t chunk) const
{
    const Chunk& asked = layout_.chunks[chunk];
    return chunk > 0 && asked.id != layout_.audioDataId() && !asked.sizeIsStale;
}

UserDataEditor::Run UserDataEditor::runAround(std::size_t chunk) const
{
    std::size_t first = chunk, past = chunk + 1;
    while (first > 0 && isFiller(first - 1))
        --first;
    while (past < layout_.chunks.size() && isFiller(past))
        ++past;
    return run(first, past);
}

UserDataEditor::Run UserDataEditor::run(std::size_t first, std::size_t past) const
{
    return {first, past, layout_.chunks[first].position, layout_.nextOf(layout_.chunks[past - 1])};
}

UserDataEditor::Piece UserDataEditor::pieceOf(std::size_t chunk) const
{
    const Chunk& asked = layout_.chunks[chunk];
    return {asked.id, asked.size, {}, layout_.bodyOf(asked)};
}

/// Whether one filler between two places would end where it should: readers take a zero behind an odd size for the pad
/// byte. Sizes are odd where chunks lack theirs, and only there can an id that begins with zero follow.
bool UserDataEditor::canBeFiller(std::uint64_t position, std::uint64_t end, std::optional<FourCC> nextId) const
{
    if (layout_.padOf(end - position) == 0)
        return true;
    const auto next = std::lower_bound(layout_.chunks.begin(), layout_.chunks.end(), end,
                                       [](const Chunk& chunk, std::uint64_t place) { return chunk.position < place; });
    if (!nextId && next != layout_.chunks.end() && next->position == end)
        nextId = next->id;
    return !nextId || *nextId >> 24 != 0;
}

std::uint64_t UserDataEditor::extentOf(const Content& content) const
{
    return std::accumulate(
        content.begin(), content.end(), std::uint64_t{0},
        [this](std::uint64_t sum, const Piece& piece) { return sum + layout_.extentOf(piece.size); });
}

/// The chunks from one on, without filler; nullopt when they may not be copied.
std::optional<UserDataEditor::Content> UserDataEditor::everythingFrom(std::size_t chunk) const
{
    Content content;
    std::uint64_t copied = 0;
    for (; chunk < layout_.chunks.size(); ++chunk) {
        if (isFiller(chunk))
            continue;
        copied += layout_.chunks[chunk].size;
        if (!isMovable(chunk) || copied > kLargestCopy)
            return std::nullopt;
        content.push_back(pieceOf(chunk));
    }
    return content;
}

// Where new bytes find room.

/// Into filler that stands ahead of a chunk, together with the chunks between them; the rest, through the chunk that
/// becomes hidden, becomes filler.
std::optional<std::int32_t> UserDataEditor::placeInFrontOf(std::size_t hidden, const Content& content)
{
    const std::uint64_t hiddenEnd = hidden < layout_.chunks.size() ? runAround(hidden).end : layout_.end;
    Content backwards(content.rbegin(), content.rend());
    std::uint64_t copied = 0;
    for (std::size_t i = hidden; i-- > 1;) {
        if (isFiller(i)) {
            const Run filler = runAround(i);
            if (const auto status = fillFront(filler, hiddenEnd, {backwards.rbegin(), backwards.rend()}))
                return status;
            i = filler.first;
            continue;
        }
        copied += layout_.chunks[i].size;
        if (!isMovable(i) || copied > kLargestCopy)
            break;
        backwards.push_back(pieceOf(i));
    }
    return std::nullopt;
}

/// Into filler that stands behind a chunk, together with the chunks between them; all ahead of it becomes filler.
std::optional<std::int32_t> UserDataEditor::placeBehind(std::size_t hidden, const Piece& piece)
{
    const std::uint64_t hiddenFrom = runAround(hidden).position;
    Content content{piece};
    std::uint64_t copied = 0;
    for (std::size_t i = hidden + 1; i < layout_.chunks.size(); ++i) {
        if (isFiller(i)) {
            const Run filler = runAround(i);
            if (const auto status = fillBehind(hiddenFrom, filler, content))
                return status;
            i = filler.past - 1;
            continue;
        }
        copied += layout_.chunks[i].size;
        if (!isMovable(i) || copied > kLargestCopy)
            break;
        content.push_back(pieceOf(i));
    }
    return std::nullopt;
}

/// Into filler between two places of the list, where nothing is hidden for it.
std::optional<std::int32_t> UserDataEditor::placeBetween(std::size_t first, std::size_t past, const Content& content)
{
    for (std::size_t i = first; i < past; ++i) {
        if (!isFiller(i))
            continue;
        const Run filler = runAround(i);
        if (const auto status = fillFront(filler, filler.end, content))
            return status;
        i = filler.past - 1;
    }
    return std::nullopt;
}

/// Behind the last chunk; everything from a chunk on is hidden, and comes back in the content.
std::optional<std::int32_t> UserDataEditor::placeAtEnd(std::size_t hiddenFrom, const Content& content)
{
    const std::uint64_t position = runAround(hiddenFrom).position;
    const std::uint64_t extent = layout_.headerSize() + extentOf(content);
    if (layout_.end + 1 - position > layout_.largestChunk())
        return std::nullopt;
    if (const std::int32_t status = grow(extent); status != kStatusOK)
        return status;
    const std::size_t last = layout_.chunks.size() - 1;
    return fillBehind(position, run(last, last + 1), content);
}

// How it is written.

/// Writes the content over the front of filler. The header of its first chunk comes last: until then the filler hides
/// everything, afterwards new filler behind the content hides the rest, up to `hiddenEnd`.
std::optional<std::int32_t> UserDataEditor::fillFront(const Run& filler, std::uint64_t hiddenEnd,
                                                      const Content& content)
{
    const std::uint64_t room = filler.end - filler.position;
    const std::uint64_t extent = extentOf(content);
    const bool exact = extent == room && hiddenEnd == filler.end;
    if (!exact && extent + layout_.headerSize() > room)
        return std::nullopt;
    const std::uint64_t restSize = exact ? 0 : hiddenEnd - filler.position - extent - layout_.headerSize();
    if (restSize > layout_.largestChunk() || room > layout_.largestChunk())
        return std::nullopt;
    // Nor may the pad byte that the chunk ahead lacks appear.
    if (filler.first > 0 && layout_.chunks[filler.first - 1].padMissing && content.front().id >> 24 == 0)
        return std::nullopt;
    if (!canBeFiller(filler.position, filler.end) || (!exact && !canBeFiller(filler.position + extent, hiddenEnd)))
        return std::nullopt;
    if (const std::int32_t status = mergeFiller(filler); status != kStatusOK)
        return status;

    ChunkEmitter emitter(file_, layout_, filler.position + layout_.headerSize());
    for (const Piece& piece : content) {
        if (&piece != &content.front())
            emitter.header(piece.id, piece.size);
        piece.bodyInFile ? emitter.copy(*piece.bodyInFile, piece.size) : emitter.bytes(piece.newBody);
        emitter.pad(piece.size);
    }
    if (!exact)
        emitter.header(ContainerLayout::filler, restSize);
    if (const std::int32_t status = emitter.flush(); status != kStatusOK)
        return status;
    if (const std::int32_t status = file_.flush(); status != kStatusOK)
        return status;
    return writeHeader(filler.position, content.front().id, content.front().size);
}

/// Writes the content inside filler; then one header makes filler of all between `hiddenFrom` and the content.
std::optional<std::int32_t> UserDataEditor::fillBehind(std::uint64_t hiddenFrom, const Run& filler,
                                                       const Content& content)
{
    const std::uint64_t start = filler.position + layout_.headerSize();
    const std::uint64_t end = start + extentOf(content);
    if (end != filler.end && end + layout_.headerSize() > filler.end)
        return std::nullopt;
    if (filler.end - hiddenFrom > layout_.largestChunk())
        return std::nullopt;
    if (!canBeFiller(filler.position, filler.end) || !canBeFiller(hiddenFrom, start, content.front().id) ||
        (end != filler.end && !canBeFiller(end, filler.end)))
        return std::nullopt;
    if (const std::int32_t status = mergeFiller(filler); status != kStatusOK)
        return status;

    ChunkEmitter emitter(file_, layout_, start);
    for (const Piece& piece : content) {
        emitter.header(piece.id, piece.size);
        piece.bodyInFile ? emitter.copy(*piece.bodyInFile, piece.size) : emitter.bytes(piece.newBody);
        emitter.pad(piece.size);
    }
    if (end != filler.end)
        emitter.header(ContainerLayout::filler, filler.end - end - layout_.headerSize());
    if (const std::int32_t status = emitter.flush(); status != kStatusOK)
        return status;
    if (const std::int32_t status = file_.flush(); status != kStatusOK)
        return status;
    return writeHeader(hiddenFrom, ContainerLayout::filler, start - hiddenFrom - layout_.headerSize());
}

/// For a chunk that the samples hold apart from all room: the new one first, then the old one becomes filler. Between
/// the two both are there, the old one first. Others of its type for which there is no room behind the new one either
/// are copied along, so that every item keeps its index.
std::int32_t UserDataEditor::replaceByTwoSteps(std::size_t chunk, const Piece& piece)
{
    Content content{piece};
    std::vector<std::size_t> old{chunk};
    std::optional<std::int32_t> status;
    while (!status) {
        const std::size_t next = nextOfType(old.back() + 1, piece.id);
        if (next == layout_.chunks.size()) {
            status = appendContent(content);
        } else if (status = placeBetween(old.back() + 1, next, content); !status) {
            if (auto moved = everythingFrom(next)) {
                moved->insert(moved->begin(), content.begin(), content.end());
                status = placeAtEnd(next, *moved);
            }
            if (!status) {
                content.push_back(pieceOf(next));
                old.push_back(next);
            }
        }
    }
    if (*status != kStatusOK)
        return *status;

    // The old ones stand ahead of all that changed, so that their places in the list are the same.
    if (const std::int32_t scanned = rescan(); scanned != kStatusOK)
        return scanned;
    return hideOld(old, piece.id);
}

/// The last one first: until the end the first one is the first. What cannot be finished is undone.
std::int32_t UserDataEditor::hideOld(const std::vector<std::size_t>& old, FourCC id)
{
    std::size_t left = old.size();
    std::int32_t status = file_.flush();
    while (status == kStatusOK && left > 0) {
        status = hide(old[left - 1]);
        left -= status == kStatusOK ? 1 : 0;
        if (const std::int32_t scanned = rescan(); scanned != kStatusOK)
            return scanned;
    }
    // Of the new ones those go whose old ones are still there.
    const std::size_t last = left > 0 ? old[left - 1] : 0;
    for (std::size_t next; left > 0; --left)
        if (next = nextOfType(last + 1, id);
            next == layout_.chunks.size() || hide(next) != kStatusOK || rescan() != kStatusOK)
            break;
    return status;
}

std::size_t UserDataEditor::nextOfType(std::size_t from, FourCC id) const
{
    while (from < layout_.chunks.size() && layout_.chunks[from].id != id)
        ++from;
    return from;
}

/// Chunks of one type.
std::int32_t UserDataEditor::appendContent(const Content& content)
{
    if (const std::int32_t status = trimEnd(); status != kStatusOK)
        return status;
    const std::size_t count = layout_.chunks.size();
    std::size_t behindItsType = count;
    while (behindItsType > 0 && layout_.chunks[behindItsType - 1].id != content.front().id)
        --behindItsType;
    if (const auto status = placeBetween(behindItsType, count, content))
        return *status;
    // Moving the last chunks into filler ahead of them keeps a file from growing with every edit.
    if (!layout_.isBroken)
        if (const auto status = placeInFrontOf(count, content))
            return *status;
    if (const std::int32_t status = grow(extentOf(content)); status != kStatusOK)
        return status;
    const Run filler = run(count, count + 1);
    return *fillFront(filler, filler.end, content);
}

/// Makes filler of a chunk, and one filler of it and its neighbours.
std::int32_t UserDataEditor::hide(std::size_t chunk)
{
    return hideAll({chunk});
}

/// Chunks that stand in a row, with nothing but filler between them, become one filler by a single header.
std::int32_t UserDataEditor::hideAll(const std::vector<std::size_t>& chunks)
{
    std::int32_t status = kStatusOK;
    for (std::size_t left = chunks.size(); left > 0 && status == kStatusOK;) {
        const std::size_t past = runAround(chunks[left - 1]).past;
        std::size_t first = runAround(chunks[--left]).first;
        const std::size_t last = left;
        for (; left > 0 && chunks[left - 1] + 1 == first; --left)
            first = runAround(chunks[left - 1]).first;
        const Run row = run(first, past);
        if (row.end - row.position <= layout_.largestChunk() && canBeFiller(row.position, row.end)) {
            status = hideRun(row);
            continue;
        }
        for (std::size_t i = last + 1; i-- > left && status == kStatusOK;)
            status = hideRun(run(chunks[i], chunks[i] + 1));
    }
    return status;
}

std::int32_t UserDataEditor::hideRun(const Run& hidden)
{
    const std::uint64_t size = hidden.end - hidden.position - layout_.headerSize();
    return size <= layout_.largestChunk() ? writeHeader(hidden.position, ContainerLayout::filler, size)
                                          : kStatusFileTooBig;
}

/// Puts filler of this extent, header included, behind the last chunk.
std::int32_t UserDataEditor::grow(std::uint64_t extent)
{
    if (layout_.isBroken || extent > layout_.largestChunk())
        return layout_.isBroken ? kStatusIOError : kStatusFileTooBig;
    if (layout_.chunks.empty() && layout_.kind() == ContainerKind::caf)
        return kStatusIOError; // the description must be the first chunk
    if (const std::int32_t status = checkContainerEnd(layout_, layout_.end + 1 + extent); status != kStatusOK)
        return status;
    // The bytes behind the container are nobody's, unless they are samples whose size was never filled in.
    if (!layout_.chunks.empty() && layout_.chunks.back().id == layout_.audioDataId() &&
        layout_.chunks.back().size == 0 && hasForeignTail(file_, layout_))
        return kStatusIOError;
    if (const std::int32_t status = settleLastChunk(file_, layout_); status != kStatusOK)
        return status;

    const Chunk filler{.position = layout_.end, .size = extent - layout_.headerSize(), .id = ContainerLayout::filler};
    const std::uint64_t formerLength = layout_.fileLength;
    // In CAF the header is in force at once, and the file catches up with it; elsewhere nobody looks there yet.
    std::int32_t status = file_.write(filler.position, layout_.header(filler.id, filler.size).data(),
                                      static_cast<std::size_t>(layout_.headerSize()));
    if (status == kStatusOK)
        status = file_.setLength(filler.position + extent);
    if (status == kStatusOK)
        status = writeContainerEnd(file_, layout_, filler.position + extent);
    if (status != kStatusOK) {
        file_.setLength(std::max(formerLength, filler.position));
        return status;
    }
    layout_.chunks.push_back(filler);
    layout_.fileLength = layout_.end = filler.position + extent;
    return kStatusOK;
}

std::int32_t UserDataEditor::mergeFiller(const Run& filler)
{
    return filler.past - filler.first == 1 ? kStatusOK
                                           : writeHeader(filler.position, ContainerLayout::filler,
                                                         filler.end - filler.position - layout_.headerSize());
}

std::int32_t UserDataEditor::writeHeader(std::uint64_t position, FourCC id, std::uint64_t size)
{
    const auto header = layout_.header(id, size);
    return file_.overwrite(position, BytesView(header).first(static_cast<std::size_t>(layout_.headerSize())));
}

/// The edit is done, or undone, before this: what is left is filler at the end, and a failure to cut it off harms
/// nobody.
std::int32_t UserDataEditor::finish(std::int32_t status)
{
    if (rescan() == kStatusOK)
        trimEnd();
    return status;
}

/// Cuts filler off the end of the container. That it cannot be cut is no failure, that the file cannot be read is.
std::int32_t UserDataEditor::trimEnd()
{
    std::size_t first = layout_.chunks.size();
    while (first > 0 && isFiller(first - 1))
        --first;
    if (first == layout_.chunks.size() || layout_.end < layout_.fileLength)
        return kStatusOK; // nothing to cut, or bytes behind it that are not ours
    const std::uint64_t end = layout_.chunks[first].position;
    if (file_.flush() == kStatusOK && writeContainerEnd(file_, layout_, end) == kStatusOK)
        file_.setLength(end);
    return rescan();
}

std::int32_t UserDataEditor::rescan()
{
    return scanChunks(file_, layout_);
}

} // namespace platform
