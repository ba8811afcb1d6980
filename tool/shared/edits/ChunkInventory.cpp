#include "tool/shared/edits/ChunkInventory.h"

#include "loops/tagging/ChunkIDs.h"
#include "platform/core/CRC32.h"
#include "tool/shared/access/Descriptor.h"
#include "tool/shared/input/ChunkBody.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>
#include <unistd.h>

namespace {

constexpr std::int64_t kPiece = 1 << 20;
constexpr std::int64_t kDigestEnd = 64 << 10;              // bytes of either end of a body
constexpr std::int64_t kFirstChunk = sizeof(ContainerChk); // where a "ds64", or the room for it, stands

void readExactly(int descriptor, void* to, std::int64_t offset, std::int64_t count)
{
    auto* bytes = static_cast<char*>(to);
    while (count > 0) {
        const ssize_t got = ::pread(descriptor, bytes, static_cast<std::size_t>(count), offset);
        if (got < 0 && errno == EINTR)
            continue;
        if (got <= 0)
            throw Failure("cannot be read to compare it: " + systemErrorText(got < 0 ? errno : EIO));
        bytes += got;
        offset += got;
        count -= got;
    }
}

/// Reads ahead, so that thousands of small chunks cost few calls.
class Pieces {
public:
    Pieces(int descriptor, std::int64_t fileLength) : descriptor_(descriptor), fileLength_(fileLength) {}

    /// At most `count` bytes from `offset` on, which are in the file; at least one.
    std::string_view at(std::int64_t offset, std::int64_t count)
    {
        if (offset < start_ || offset >= start_ + size_) {
            size_ = 0;
            const std::int64_t wanted = std::min(kPiece, fileLength_ - offset);
            readExactly(descriptor_, bytes_.get(), offset, wanted);
            start_ = offset;
            size_ = wanted;
        }
        return {bytes_.get() + (offset - start_), static_cast<std::size_t>(std::min(count, start_ + size_ - offset))};
    }

private:
    int descriptor_;
    std::int64_t fileLength_;
    std::int64_t start_ = 0, size_ = 0;
    std::unique_ptr<char[]> bytes_ = std::make_unique<char[]>(kPiece);
};

bool areSame(Pieces& a, std::int64_t offsetInA, Pieces& b, std::int64_t offsetInB, std::int64_t size)
{
    while (size > 0) {
        const std::string_view inA = a.at(offsetInA, size);
        const std::string_view inB = b.at(offsetInB, static_cast<std::int64_t>(inA.size()));
        if (inA.substr(0, inB.size()) != inB)
            return false;
        const auto done = static_cast<std::int64_t>(inB.size());
        offsetInA += done;
        offsetInB += done;
        size -= done;
    }
    return true;
}

// What changes with the size of a container that may pass 4 GiB.
bool isRoomForSizes(const ContainerExtent& extent, const ChunkEntry& chunk)
{
    return extent.id != kCaff && chunk.offset == kFirstChunk && (chunk.id == kDs64 || chunk.id == kJUNK);
}

} // namespace

ChunkInventory::ChunkInventory(int descriptor, const EditScope& scope, Bodies bodies)
    : descriptor_(descriptor),
      bodies_(bodies)
{
    walk(scope);
    if (bodies_ == Bodies::digests)
        for (Entry& entry : entries_)
            entry.digest = digestOf(entry);
}

void ChunkInventory::walk(const EditScope& scope)
{
    CAudioFileIO file;
    openContainer(file, pathOfDescriptor(descriptor_), 0);
    ContainerExtent extent;
    const auto visit = [&](const ChunkEntry& chunk) {
        const std::int64_t body = bodyOffset(chunk, extent);
        const std::int64_t there = std::max<std::int64_t>(extent.fileLength - body, 0);
        const std::int64_t size = std::clamp<std::int64_t>(chunk.size, 0, there);
        const bool inScope = isInScope(scope, chunk.id, body, size);
        if (inScope && chunk.size > there) {
            isUnfinished_ = true;
            return false;
        }
        end_ = std::min(body + size + (extent.id == kCaff ? 0 : size & 1), extent.fileLength);
        if (isRoomForSizes(extent, chunk))
            entries_.push_back({kDs64, body, 0});
        else if (!inScope)
            entries_.push_back({chunk.id, body, size});
        return true;
    };
    if (file.ForEachChunk(visit, &extent) != kStatusOK)
        throw Failure("its chunks cannot be read");
    fileLength_ = extent.fileLength;
    // Less than a chunk header is no more than a pad byte that went astray.
    const auto headerSize = static_cast<std::int64_t>(extent.id == kCaff ? sizeof(CAFChunkHeader) : sizeof(ChkHeader));
    if (!isUnfinished_ && fileLength_ - end_ >= headerSize)
        entries_.push_back({0, end_, fileLength_ - end_});
}

bool ChunkInventory::isInScope(const EditScope& scope, FourCC id, std::int64_t body, std::int64_t size) const
{
    if (id == kFree || std::find(scope.ids.begin(), scope.ids.end(), id) != scope.ids.end())
        return true;
    if (!scope.loopChunks || id != kUuid || size < static_cast<std::int64_t>(tagging::kUUIDSize))
        return false;
    tagging::UUIDBytes uuid;
    readExactly(descriptor_, uuid, body, sizeof uuid);
    return cafChunkUUIDToChunkID(&uuid) != 0 || UUIDIsEqual(uuid, tagging::kSilenceUUID);
}

std::uint32_t ChunkInventory::digestOf(const Entry& entry) const
{
    const auto bytes = std::make_unique<unsigned char[]>(kDigestEnd);
    std::uint32_t digest = 0;
    const std::int64_t first = std::min(entry.size, kDigestEnd);
    const std::int64_t last = std::min(entry.size - first, kDigestEnd);
    for (const auto& [offset, count] :
         {std::pair(entry.offset, first), std::pair(entry.offset + entry.size - last, last)}) {
        readExactly(descriptor_, bytes.get(), offset, count);
        digest = ECCRC32(digest, bytes.get(), static_cast<std::size_t>(count));
    }
    return digest;
}

std::string ChunkInventory::nameOf(const Entry& entry)
{
    return entry.id == 0 ? "what stands behind its chunks" : "the chunk \"" + fourCCText(entry.id) + "\"";
}

void ChunkInventory::requireSameIn(const ChunkInventory& after) const
{
    const auto fail = [](const Entry& entry) { throw Failure(nameOf(entry) + " is not as it was"); };
    if (after.isUnfinished_ && !isUnfinished_)
        throw Failure("its last chunk is not whole");
    Pieces ours(descriptor_, fileLength_), theirs(after.descriptor_, after.fileLength_);
    for (std::size_t i = 0; i < std::max(entries_.size(), after.entries_.size()); ++i) {
        if (i >= entries_.size())
            fail(after.entries_[i]);
        const Entry& before = entries_[i];
        if (i >= after.entries_.size())
            fail(before);
        const Entry& now = after.entries_[i];
        if (now.id != before.id || now.size != before.size)
            fail(before);
        const bool same = bodies_ == Bodies::digests ? now.digest == before.digest
                                                     : areSame(ours, before.offset, theirs, now.offset, before.size);
        if (!same)
            fail(before);
    }
}
