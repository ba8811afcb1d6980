#include "media/userdata/UserDataEditor.h"

#include "media/containers/ContainerSizes.h"
#include "media/userdata/ChunkEmitter.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace platform {

namespace {
/// How many bytes of other chunks an edit copies to keep their order; beyond that it replaces in two steps, without
/// copies.
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

/// Never the first chunk: in WAVE it may be the place of a "ds64", in CAF it is the description.
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

/// Whether a single filler between two positions would end where it should: readers take a zero after an odd size for
/// the pad byte. Odd sizes occur where chunks lack their pad byte, and only then can an id that begins with zero
/// follow.
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

/// The chunks from one on, without filler; none if they may not be copied.
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

/// Writes into filler before a chunk, together with the chunks between. The rest, up to and including the chunk to
/// hide, becomes filler.
std::optional<std::int32_t> UserDataEditor::placeInFrontOf(std::size_t hidden, const Content& content)
{
    const std::uint64_t hiddenEnd = hidden < layout_.chunks.size() ? runAround(hidden).end : layout_.end;
    Content backwards(content.rbegin(), content.rend());
    std::uint64_t copied = 0;
    std::size_t i = hidden;
    while (i > 1) {
        --i;
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

/// Writes into filler after a chunk, together with the chunks between. Everything before the content becomes filler.
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

/// Writes into filler between two places of the list, without hiding anything.
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

/// Writes after the last chunk. Everything from `hiddenFrom` on is hidden, and repeated in the content.
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

/// Writes ahead of the chunk `next`, at place `first` or later: into filler there, or else after the last chunk, where
/// `next` and all that follows it move along.
std::optional<std::int32_t> UserDataEditor::placeAheadOf(std::size_t next, std::size_t first, const Content& content)
{
    if (const auto status = placeBetween(first, next, content))
        return status;
    auto moved = everythingFrom(next);
    if (!moved)
        return std::nullopt;
    moved->insert(moved->begin(), content.begin(), content.end());
    return placeAtEnd(next, *moved);
}

// How content is written.

/// Writes the content over the front of a run of filler. What readers see after each step:
///
/// 1. mergeFiller: one header makes the run a single filler. The chunks are the same.
/// 2. The body of the first chunk, the further chunks and the header of the filler that will follow them are written
///    inside that filler, where nobody looks: it still has its own header.
/// 3. A flush, so that the next write cannot reach the disk ahead of these.
/// 4. One header, 8 bytes (CAF: 12), turns the filler into the first chunk. From here on readers walk from it to the
///    next one and on to the new filler, which ends at `hiddenEnd` and so hides the chunks up to there.
///
/// A process that dies before 4 leaves the old chunks and filler, which the next edit overwrites; after 4 it leaves the
/// new ones. finish() only cuts filler off at the end. If the write of the header fails in part, FileBytes::overwrite
/// puts the old bytes back.
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
    // The chunk before the run lacks its pad byte, so the first byte of the new id must not look like one.
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

/// Writes the content inside a run of filler, after the filler's header, with a header for each chunk and for the
/// filler that remains; flushes; then one header at `hiddenFrom` makes everything up to the content filler. Before that
/// last write readers find the old chunks, after it the new ones, as in fillFront.
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

/// Replaces a chunk that the samples separate from all room. Content is written by the ways above, so each step is
/// whole or absent:
///
/// 1. The new chunk is added as near behind the old one as there is room. Between the two steps both are there, the old
///    one first: readers that take the first of a type see the old one. If other chunks of the type stand between,
///    copies of them are added behind the new one, so that no index changes in the end.
/// 2. hideOld makes filler of the old ones, the last one first.
///
/// A process that dies after 1 leaves the old chunk under its index, and the new one as one more of its type, behind
/// it; chunks of the type that follow count on by as many as were added. Nothing removes that: the next edit by index
/// changes the old chunk, or whoever lists the chunks removes one of the two.
std::int32_t UserDataEditor::replaceByTwoSteps(std::size_t chunk, const Piece& piece)
{
    Content content{piece};
    std::vector<std::size_t> old{chunk};
    std::size_t next = nextOfType(chunk + 1, piece.id);
    std::optional<std::int32_t> status;
    for (; next < layout_.chunks.size(); next = nextOfType(next + 1, piece.id)) {
        if (status = placeAheadOf(next, old.back() + 1, content); status)
            break;
        content.push_back(pieceOf(next));
        old.push_back(next);
    }
    if (!status)
        status = appendContent(content);
    if (*status != kStatusOK)
        return *status;

    // The old chunks stand before everything that changed, so their indices in the list are the same.
    if (const std::int32_t scanned = rescan(); scanned != kStatusOK)
        return scanned;
    return hideOld(old, piece.id);
}

/// Hides the last chunk first, so that the first one stays the first until the end. If one cannot be hidden, the edit
/// is undone.
std::int32_t UserDataEditor::hideOld(const std::vector<std::size_t>& old, FourCC id)
{
    std::size_t left = old.size();
    std::int32_t status = file_.flush();
    while (status == kStatusOK && left > 0) {
        status = hide(old[left - 1]);
        if (status == kStatusOK)
            --left;
        if (const std::int32_t scanned = rescan(); scanned != kStatusOK)
            return scanned;
    }
    // Removes the new chunks whose old ones are still there.
    const std::size_t firstNew = left > 0 ? old[left - 1] + 1 : 0;
    for (; left > 0; --left) {
        const std::size_t added = nextOfType(firstNew, id);
        if (added == layout_.chunks.size() || hide(added) != kStatusOK || rescan() != kStatusOK)
            break;
    }
    return status;
}

std::size_t UserDataEditor::nextOfType(std::size_t from, FourCC id) const
{
    while (from < layout_.chunks.size() && layout_.chunks[from].id != id)
        ++from;
    return from;
}

/// Appends chunks of one type behind all others of that type.
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
    // Moving the last chunks into filler before them keeps the file from growing with every edit.
    if (!layout_.isBroken)
        if (const auto status = placeInFrontOf(count, content))
            return *status;
    if (const std::int32_t status = grow(extentOf(content)); status != kStatusOK)
        return status;
    const Run filler = run(count, count + 1);
    return *fillFront(filler, filler.end, content);
}

/// Makes filler of a chunk, merged with its neighbours.
std::int32_t UserDataEditor::hide(std::size_t chunk)
{
    return hideAll({chunk});
}

/// Hides chunks that only filler separates with a single header.
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

/// Adds filler of this size, header included, after the last chunk. In RIFF and AIFF nobody sees it until the
/// container's size, which is written last, counts it. In CAF the header counts at once, and for an instant the filler
/// runs past the end of the file. A process that dies in between leaves the same chunks and, at most, filler that is
/// cut short, which the next edit cuts off.
std::int32_t UserDataEditor::grow(std::uint64_t extent)
{
    if (layout_.isBroken || extent > layout_.largestChunk())
        return layout_.isBroken ? kStatusIOError : kStatusFileTooBig;
    if (layout_.chunks.empty() && layout_.kind() == ContainerKind::caf)
        return kStatusIOError; // the description must come first
    if (const std::int32_t status = checkContainerEnd(layout_, layout_.end + 1 + extent); status != kStatusOK)
        return status;
    // Bytes after the container belong to nobody, unless they are samples whose size was never filled in.
    if (!layout_.chunks.empty() && layout_.chunks.back().id == layout_.audioDataId() &&
        layout_.chunks.back().size == 0 && hasForeignTail(file_, layout_))
        return kStatusIOError;
    if (const std::int32_t status = settleLastChunk(file_, layout_); status != kStatusOK)
        return status;

    const Chunk filler{.position = layout_.end, .size = extent - layout_.headerSize(), .id = ContainerLayout::filler};
    const std::uint64_t formerLength = layout_.fileLength;
    // CAF readers see the header at once, and the file's length follows; other readers do not look there yet.
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

/// Called when the edit is done or undone. What is left to do is to cut filler off the end; failing to do so harms
/// nobody.
std::int32_t UserDataEditor::finish(std::int32_t status)
{
    if (rescan() == kStatusOK)
        trimEnd();
    return status;
}

/// Cuts filler off the end of the container: first its size, then the file's length, so that a process that dies in
/// between leaves bytes that nobody counts. Failing to cut is no error, failing to read the file is.
std::int32_t UserDataEditor::trimEnd()
{
    std::size_t first = layout_.chunks.size();
    while (first > 0 && isFiller(first - 1))
        --first;
    if (first == layout_.chunks.size() || layout_.end < layout_.fileLength)
        return kStatusOK; // nothing to cut, or foreign bytes behind it
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
