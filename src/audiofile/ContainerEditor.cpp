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

constexpr std::uint32_t kSizeElsewhere = 0xFFFFFFFF; // in the "ds64"
constexpr std::int64_t kLargestFORM = 0x7FFFFFFF;    // sizes are signed

std::int64_t padOf(std::int64_t size)
{
    return size & 1;
}

/// A read that failed comes ahead of what was made of its absence.
std::int32_t unlessUnreadable(const FileWindow& window, std::int32_t status)
{
    return window.failure() != kStatusOK ? window.failure() : status;
}

} // namespace

std::int32_t ContainerEditor::append(FourCC id, BytesView body, const ContainerEnd* atOpen)
{
    return isCAF() ? appendToCAF(id, body) : appendToContainer(id, body, atOpen);
}

/// At the end of the file, without a pad byte. Kept: a last chunk "data" whose size says "to the end of the file" is
/// not closed first, so that what is put behind it becomes part of it; callers who may meet one look before.
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

/// Kept: the container's size decides which chunk is the last, so that in a recording that was cut short, whose size is
/// still 0, a new chunk goes over the samples; callers who may meet one look before.
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

/// Whether the sizes can be said is known before anything is written.
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

/// Repairs a last chunk whose size is stale.
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

/// Pieces that follow each other in the file, in one system call when they are small.
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

/// `chunk` is in file layout. Which part could not be written is found out by writing the header once more.
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

/// A file that stops being 64-bit loses its "ds64": the chunks whose sizes stand there get them in their own headers.
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

/// One pass finds all of them, the cuts are made together, and what stands ahead of the samples is renamed at last: the
/// same bytes as finding and removing the last one again and again, in linear time.
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
        holes.resize(1); // Kept: hosts have one at a time cut out
    std::int32_t status = holes.empty() ? kStatusOK : cutOut(holes);
    if (status == kStatusOK && !holes.empty() && !isCAF())
        status = shrink(header, holes);
    for (auto extent = found.rbegin(); extent != found.rend() && status == kStatusOK; ++extent)
        status = renameToFree(extent->position, header);
    return status;
}

/// In file order. A chunk that has not all of its bytes is not removed; of a container other than CAF, none is then.
/// The status of a read that failed: behind an unreadable header the hole would seem to reach to the end of the file.
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

/// Closes the holes, which are in file order: what lies between them is moved down, at last the rest of the file.
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

/// Moves what lies between the first hole and the last towards the start of the file, to `to`, which goes behind it.
/// What lies between many is moved together.
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

/// Stores the container's size after a cut.
std::int32_t ContainerEditor::shrink(ContainerChkExtended header, const std::vector<Extent>& holes)
{
    const ContainerChkExtended before = header;
    std::int64_t size = header.EffectiveSize();
    for (const Extent& hole : holes)
        size -= hole.next - hole.position;
    if (holes.front().position == std::int64_t{sizeof(ContainerChk)})
        header.firstChunkId = 0; // another stands there now, which must not be taken for a reservation
    header.SetSize(size); // one that was too small all along becomes no size at all: what follows is not hidden by it
    if (before.HasValidDs64() && !header.HasValidDs64()) {
        if (const std::int32_t status = storeSizesOutright(before); status != kStatusOK)
            return status;
    }
    return writeContainerHeader(header);
}

/// Only the id is written, unless the size stands in the "ds64" under it.
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
