#include "audiofile/ContainerEditor.h"

#include "audiofile/FileWindow.h"
#include "media/containers/ContainerEnd.h"
#include "platform/core/ByteOrder.h"

#include <algorithm>
#include <array>
#include <memory>
#include <new>
#include <optional>

namespace {

using platform::ChunkWalk;
using platform::WalkPolicy;

constexpr std::uint32_t kSizeElsewhere = 0xFFFFFFFF; // the size stands in the "ds64"
constexpr std::int64_t kLargestFORM = 0x7FFFFFFF;    // sizes are signed

std::int64_t padOf(std::int64_t size)
{
    return size & 1;
}

/// A failed read takes precedence over what was concluded from the missing bytes.
std::int32_t unlessUnreadable(const FileWindow& window, std::int32_t status)
{
    return window.failure() != kStatusOK ? window.failure() : status;
}

} // namespace

std::int32_t ContainerEditor::append(FourCC id, BytesView body, const ContainerEnd* atOpen)
{
    return isCAF() ? appendToCAF(id, body) : appendToContainer(id, body, atOpen);
}

/// Appends at the end of the file, without a pad byte: header and body in one write if they are small, otherwise the
/// header first. A body that was cut short is a chunk that runs past the end of the file. Kept: a last chunk "data"
/// whose size means "to the end of the file" is not closed first, so the new chunk becomes part of it; callers who may
/// meet one check before.
std::int32_t ContainerEditor::appendToCAF(FourCC id, BytesView body)
{
    long long end = 0;
    if (const std::int32_t status = file_.GetEOF(&end); status != kStatusOK)
        return status;
    CAFChunkHeader header{id, static_cast<std::int64_t>(body.size())};
    turnFields(std::endian::big, header.id, header.size);
    const BytesView pieces[] = {std::as_bytes(std::span(&header, 1)), body};
    return writeTogether(end, pieces) == kStatusOK ? kAdded : kChunkHeaderFailed;
}

/// Kept: the container's size decides which chunk is the last, so in a recording that was cut short, whose size is
/// still 0, a new chunk overwrites the samples; callers who may meet one check before.
std::int32_t ContainerEditor::findEnd(FileWindow& window, ContainerEnd& end)
{
    ChunkWalk walk(window, WalkPolicy::asStated);
    if (walk.begin() != kStatusOK)
        return walk.container().traits != nullptr ? kHeaderUnreadable : unlessUnreadable(window, kNoChunkedContainer);
    if (!walk.container().traits->isEditable)
        return kNoChunkedContainer;
    if (walk.statedEnd() < 0)
        return kStatusEndOfFile;
    while (walk.next()) {
        end.last = walk.chunk();
        end.insertion = walk.following();
        if (end.last.id == kData)
            end.dataSize = end.last.size;
    }
    end.header = walk.container().header;
    return walk.status() == kStatusOK ? kEndFound : walk.status();
}

/// Appends a chunk to RIFF and its kin or to FORM. All sizes are computed first, so a container that cannot state them
/// is refused before anything is written. Then, in this order:
///
/// 1. Only if an RF64 file becomes RIFF: sizes that stood in the "ds64" go into the chunks' own headers. The header
///    still says RF64, and a reader takes a size field that is not 0xFFFFFFFF as it stands: the chunks are the same.
/// 2. Only if the size of the last chunk does not lead to the place of the new one: that size is corrected, so that the
///    chunk ends where its bytes end. In RF64 a size in the "ds64" follows with step 4.
/// 3. The new chunk, with its pad byte, goes behind the end that the container states. Readers that go by the
///    container's size do not look there.
/// 4. The container's header, in one write, counts the chunk. The same write turns RIFF into RF64 where a size passes 4
///    GiB, and back where none does any more.
///
/// A process that dies after 1 or 2 leaves the old chunks, which the next edit finds as if nothing had happened. After
/// any part of 3 the container is the old one too, with bytes behind it that nobody counts; the next append finds the
/// same end and overwrites them. A failed write leaves the file in the same states: nothing is rolled back. The steps
/// are not flushed to the disk one by one, so a power failure may leave them in another order; edits that have to
/// survive one work on a copy (CSafeEdit).
std::int32_t ContainerEditor::appendToContainer(FourCC id, BytesView body, const ContainerEnd* atOpen)
{
    FileStamp now;
    if (const std::int32_t status = file_.GetStamp(now); status != kStatusOK)
        return status;
    std::optional<ContainerEnd> found;
    if (atOpen == nullptr || now != file_.StampAtOpen()) {
        FileWindow window(file_, now.length);
        if (const std::int32_t status = findEnd(window, found.emplace()); status != kEndFound)
            return status;
    }
    const ContainerEnd& end = found ? *found : *atOpen;
    const ContainerChkExtended& before = end.header;
    ContainerChkExtended header = before;
    const auto size = static_cast<std::int64_t>(body.size());
    std::int64_t containerSize = 0;
    if (__builtin_add_overflow(end.insertion, size + padOf(size), &containerSize) ||
        header.SetSize(containerSize) != kStatusOK)
        return kChunkSizeTooLarge;
    if (!header.IsWAVE() && containerSize > kLargestFORM) // its size would be clamped, and the chunk not found again
        return kChunkSizeTooLarge;
    if (header.HasValidDs64() && !before.HasValidDs64()) {
        header.dataSize = static_cast<std::uint64_t>(end.dataSize);
        header.sampleCount = static_cast<std::uint64_t>(info_.frames);
    }
    ChkHeader chunk{id, {}};
    if (chunk.SetSize(size, header) != kStatusOK)
        return kChunkSizeTooLarge;

    if (before.HasValidDs64() && !header.HasValidDs64() && storeSizesOutright(before) != kStatusOK)
        return kHeaderNotWritten;
    if (storeLastSize(end, header) != kStatusOK)
        return kHeaderNotWritten;
    chunk.ByteOrder(header);
    if (const std::int32_t status = writeChunk(end.insertion, chunk, body, padOf(size) != 0); status != kStatusOK)
        return status;
    return writeContainerHeader(header) == kStatusOK ? kAdded : kHeaderNotWritten;
}

/// Corrects the size of the last chunk if it does not lead to the place of the new one.
std::int32_t ContainerEditor::storeLastSize(const ContainerEnd& end, ContainerChkExtended& header)
{
    ChkHeader chunk{end.last.id, end.last.field};
    const auto body = static_cast<std::int64_t>(end.last.body);
    std::int64_t extent = 0;
    const bool overflows = __builtin_add_overflow(body + padOf(end.last.size), end.last.size, &extent);
    if (!overflows && extent == end.insertion)
        return kStatusOK;
    chunk.SetSize(end.insertion - body, header);
    return writeChunkHeader(static_cast<std::int64_t>(end.last.position), chunk, header);
}

/// Writes consecutive pieces, in one system call if they are small.
std::int32_t ContainerEditor::writeTogether(std::int64_t position, std::span<const BytesView> pieces)
{
    std::array<std::byte, 8192> together;
    std::size_t filled = 0;
    for (const BytesView piece : pieces) {
        if (piece.size() > together.size() - filled)
            return writeApart(position, pieces);
        std::copy(piece.begin(), piece.end(), together.begin() + static_cast<std::ptrdiff_t>(filled));
        filled += piece.size();
    }
    const std::int32_t status = file_.Write(together.data(), position, static_cast<long>(filled));
    if (status == kStatusOK)
        info_.fileLength = std::max(info_.fileLength, position + static_cast<std::int64_t>(filled));
    return status;
}

std::int32_t ContainerEditor::writeApart(std::int64_t position, std::span<const BytesView> pieces)
{
    for (const BytesView piece : pieces) {
        const auto size = static_cast<long>(piece.size());
        if (const std::int32_t status = file_.Write(piece.data(), position, size); status != kStatusOK)
            return status;
        position += size;
    }
    info_.fileLength = std::max(info_.fileLength, position);
    return kStatusOK;
}

/// `chunk` is in file layout. After a failure, writing the header once more tells which part did not fit.
std::int32_t ContainerEditor::writeChunk(std::int64_t position, const ChkHeader& chunk, BytesView body, bool padded)
{
    constexpr std::byte pad{};
    const BytesView pieces[] = {std::as_bytes(std::span(&chunk, 1)), body, BytesView(&pad, padded ? 1 : 0)};
    if (writeTogether(position, pieces) == kStatusOK)
        return kStatusOK;
    const bool headerFits = file_.Write(&chunk, position, sizeof chunk) == kStatusOK;
    return headerFits ? kChunkBodyNotWritten : kChunkHeaderFailed;
}

std::int32_t ContainerEditor::writeChunkHeader(std::int64_t position, ChkHeader chunk,
                                               const ContainerChkExtended& header)
{
    chunk.ByteOrder(header);
    return file_.Write(&chunk, position, sizeof chunk);
}

std::int32_t ContainerEditor::writeContainerHeader(ContainerChkExtended header)
{
    const auto size = static_cast<long>(header.StoredSize());
    header.ByteOrder();
    return file_.Write(&header, 0, size);
}

/// A file that stops being 64-bit loses its "ds64": chunks whose sizes stand there get them in their own headers.
std::int32_t ContainerEditor::storeSizesOutright(const ContainerChkExtended& header)
{
    FileWindow window(file_, file_.GetEOF());
    ChunkWalk walk(window, WalkPolicy::asStated);
    walk.beginAs(header);
    std::int32_t status = kStatusOK;
    while (status == kStatusOK && walk.next()) {
        const platform::WalkedChunk& chunk = walk.chunk();
        if (chunk.field == kSizeElsewhere && chunk.size >= 0 && chunk.size < kSizeElsewhere) {
            const ChkHeader outright{chunk.id, static_cast<std::uint32_t>(chunk.size)};
            status = writeChunkHeader(static_cast<std::int64_t>(chunk.position), outright, header);
        }
    }
    return unlessUnreadable(window, status);
}

/// Finds all chunks in one pass, cuts those behind the samples' start together, and renames those ahead of it last. The
/// bytes are the same as from finding and removing the last one repeatedly, in linear time.
/// Nothing is rolled back, and a cut moves bytes in place: a process that dies in the middle leaves a file whose chunks
/// no longer line up. Edits that have to survive that work on a copy (CSafeEdit).
std::int32_t ContainerEditor::remove(FourCC id, OfCAF which)
{
    long long length = 0;
    if (const std::int32_t status = file_.GetEOF(&length); status != kStatusOK)
        return status;
    FileWindow window(file_, length);
    ContainerChkExtended header;
    if (platform::readContainerHeader(window, header) != kStatusOK)
        return kHeaderUnreadable;
    std::vector<Extent> found;
    if (const std::int32_t status = findAll(window, id, found); status != kStatusOK || found.empty())
        return status;
    if (!file_.IsOpenForWriting())
        return kStatusNotOpen;

    const auto firstCut = std::find_if(found.begin(), found.end(), [&](const Extent& extent) {
        return id == kFree || extent.position >= info_.dataOffset;
    });
    std::vector<Extent> holes(firstCut, found.end());
    found.erase(firstCut, found.end());
    if (isCAF() && which == OfCAF::first && holes.size() > 1)
        holes.resize(1); // Kept: hosts remove one at a time
    std::int32_t status = holes.empty() ? kStatusOK : cutOut(holes);
    if (status == kStatusOK && !holes.empty() && !isCAF())
        status = shrink(header, holes);
    for (auto extent = found.rbegin(); extent != found.rend() && status == kStatusOK; ++extent)
        status = renameToFree(extent->position, header);
    return status;
}

/// The chunks in file order. A chunk that lacks some of its bytes is not removed; in a container other than CAF, none
/// is removed then. Returns the status of a failed read: after an unreadable header the hole would seem to reach the
/// end of the file.
std::int32_t ContainerEditor::findAll(FileWindow& window, FourCC id, std::vector<Extent>& found) const
{
    ChunkWalk walk(window, WalkPolicy::asStated);
    if (walk.begin() != kStatusOK || !walk.container().traits->isEditable)
        return window.failure();
    bool isComplete = true;
    while ((isComplete || !isCAF()) && walk.next()) {
        const platform::WalkedChunk& chunk = walk.chunk();
        const bool isWanted = chunk.id == id && (!isCAF() || chunk.size > 0);
        if (isWanted || isCAF())
            isComplete = chunk.hasItsBytes(window.length()) || (isCAF() && chunk.size < 0);
        if (isWanted && (isComplete || !isCAF()))
            found.push_back({static_cast<std::int64_t>(chunk.position), walk.following()});
    }
    if (!isComplete && !isCAF())
        found.clear();
    return window.failure();
}

/// Closes the holes, which are in file order: moves down what lies between them, then the rest of the file.
std::int32_t ContainerEditor::cutOut(const std::vector<Extent>& holes)
{
    std::int64_t to = holes.front().position;
    std::int64_t aheadOfSamples = 0;
    std::int32_t status = closeUp(holes, to);
    if (status == kStatusOK)
        status = file_.BlockMove(holes.back().next, to);
    for (const Extent& hole : holes) {
        if (hole.position < info_.dataOffset)
            aheadOfSamples += hole.next - hole.position;
    }
    if (status == kStatusOK) {
        info_.dataOffset -= aheadOfSamples;
        info_.fileLength = file_.GetEOF();
    }
    return status;
}

/// Moves what lies between the first hole and the last down to `to`, and `to` past it. Small parts between many holes
/// are moved together.
std::int32_t ContainerEditor::closeUp(const std::vector<Extent>& holes, std::int64_t& to)
{
    constexpr std::int64_t largestPiece = 1048576;
    const std::int64_t end = holes.back().position;
    std::int64_t position = holes.front().next;
    if (position >= end)
        return kStatusOK;
    const auto capacity = static_cast<std::size_t>(std::min(end - position, largestPiece));
    const std::unique_ptr<char[]> buffer(new (std::nothrow) char[capacity]);
    if (!buffer)
        return kStatusOutOfMemory;
    for (auto hole = holes.begin() + 1; position < end;) {
        const std::int64_t start = position, behind = std::min(end, start + largestPiece);
        if (const auto status = file_.Read(buffer.get(), start, static_cast<long>(behind - start), nullptr);
            status != kStatusOK)
            return status;
        char* filled = buffer.get();
        while (position < behind) {
            const std::int64_t keptEnd = std::min(hole->position, behind);
            filled = std::copy_n(buffer.get() + (position - start), keptEnd - position, filled);
            position = keptEnd == hole->position ? hole++->next : keptEnd;
        }
        const auto kept = static_cast<long>(filled - buffer.get());
        if (const std::int32_t status = file_.Write(buffer.get(), to, kept); status != kStatusOK)
            return status;
        to += kept;
    }
    return kStatusOK;
}

/// Stores the container's size after the cuts.
std::int32_t ContainerEditor::shrink(ContainerChkExtended header, const std::vector<Extent>& holes)
{
    const ContainerChkExtended before = header;
    std::int64_t size = header.EffectiveSize();
    for (const Extent& hole : holes)
        size -= hole.next - hole.position;
    if (holes.front().position == std::int64_t{sizeof(ContainerChk)})
        header.firstChunkId = 0; // the chunk that stands there now must not be taken for a reservation
    header.SetSize(size); // a size that was too small all along becomes "no size", which hides nothing that follows
    if (before.HasValidDs64() && !header.HasValidDs64()) {
        if (const std::int32_t status = storeSizesOutright(before); status != kStatusOK)
            return status;
    }
    return writeContainerHeader(header);
}

/// Writes only the id, unless the size stands in the "ds64" under it.
std::int32_t ContainerEditor::renameToFree(std::int64_t position, const ContainerChkExtended& header)
{
    ChkHeader chunk{kFree, {}};
    if (header.HasValidDs64()) {
        ChkHeader stored;
        if (const std::int32_t status = file_.Read(&stored, position, sizeof stored, nullptr); status != kStatusOK)
            return status;
        stored.ByteOrder(header);
        const std::int64_t size = stored.EffectiveSize(header);
        if (stored.size == kSizeElsewhere && size >= 0 && size < kSizeElsewhere) {
            chunk.size = static_cast<std::uint32_t>(size);
            return writeChunkHeader(position, chunk, header);
        }
    }
    turnFields(std::endian::big, chunk.id);
    return file_.Write(&chunk.id, position, sizeof chunk.id);
}
