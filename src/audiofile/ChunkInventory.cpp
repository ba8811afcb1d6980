#include "audiofile/ChunkInventory.h"

#include "audiofile/ContainerChanges.h"
#include "audiofile/ContainerTail.h"
#include "loops/tagging/ChunkIDs.h"
#include "platform/OwnedDescriptor.h"
#include "platform/SystemCalls.h"
#include "platform/core/CRC32.h"

#include <algorithm>
#include <cerrno>
#include <memory>
#include <string_view>

using Kind = ContainerProblem::Kind;

namespace {

constexpr std::int64_t kPiece = 1 << 20;
constexpr std::int64_t kDigestEnd = 64 << 10;              // bytes at either end of a body
constexpr std::int64_t kFirstChunk = sizeof(ContainerChk); // position of a "ds64" or of the room for it

ContainerProblem readExactly(int descriptor, void* to, std::int64_t offset, std::int64_t count)
{
    auto* bytes = static_cast<char*>(to);
    while (count > 0) {
        const std::int64_t got =
            platform::systemCalls().pread(descriptor, bytes, static_cast<std::size_t>(count), offset);
        if (got < 0 && errno == EINTR)
            continue;
        if (got <= 0)
            return {.kind = Kind::reading, .systemError = got < 0 ? errno : EIO};
        bytes += got;
        offset += got;
        count -= got;
    }
    return {};
}

/// Reads ahead, so that thousands of small chunks cost few calls.
class Pieces {
public:
    Pieces(int descriptor, std::int64_t fileLength) : descriptor_(descriptor), fileLength_(fileLength) {}

    /// Up to `count` bytes from `offset`, all of which the file has; at least one unless they cannot be read.
    std::string_view at(std::int64_t offset, std::int64_t count)
    {
        if (offset < start_ || offset >= start_ + size_) {
            size_ = 0;
            const std::int64_t wanted = std::min(kPiece, fileLength_ - offset);
            problem_ = readExactly(descriptor_, bytes_.get(), offset, wanted);
            if (problem_)
                return {};
            start_ = offset;
            size_ = wanted;
        }
        return {bytes_.get() + (offset - start_), static_cast<std::size_t>(std::min(count, start_ + size_ - offset))};
    }

    const ContainerProblem& problem() const { return problem_; }

private:
    int descriptor_;
    std::int64_t fileLength_;
    std::int64_t start_ = 0, size_ = 0;
    ContainerProblem problem_;
    std::unique_ptr<char[]> bytes_ = std::make_unique_for_overwrite<char[]>(kPiece);
};

bool areSame(Pieces& a, std::int64_t offsetInA, Pieces& b, std::int64_t offsetInB, std::int64_t size)
{
    while (size > 0) {
        const std::string_view inA = a.at(offsetInA, size);
        const std::string_view inB = b.at(offsetInB, static_cast<std::int64_t>(inA.size()));
        if (inA.empty() || inB.empty() || inA.substr(0, inB.size()) != inB)
            return false;
        const auto done = static_cast<std::int64_t>(inB.size());
        offsetInA += done;
        offsetInB += done;
        size -= done;
    }
    return true;
}

// Fields that change with the size of a container that may pass 4 GiB.
bool isRoomForSizes(const ContainerExtent& extent, const ChunkEntry& chunk)
{
    return extent.id != kCaff && chunk.offset == kFirstChunk && (chunk.id == kDs64 || chunk.id == kJUNK);
}

} // namespace

ContainerProblem ChunkInventory::Take(int descriptor, const EditScope& scope, Bodies bodies)
{
    descriptor_ = descriptor;
    bodies_ = bodies;
    ContainerProblem problem = walk(scope);
    if (bodies_ == Bodies::digests)
        for (auto entry = entries_.begin(); entry != entries_.end() && !problem; ++entry)
            problem = takeDigest(*entry);
    return problem;
}

ContainerProblem ChunkInventory::walk(const EditScope& scope)
{
    CAudioFileIO file;
    ContainerProblem problem = OpenContainer(file, CFileRef(platform::pathOfDescriptor(descriptor_).c_str(), false), 0);
    if (problem)
        return problem;
    ContainerExtent extent;
    const auto visit = [&](const ChunkEntry& chunk) {
        const std::int64_t body = chunk.body;
        const std::int64_t there = std::max<std::int64_t>(extent.fileLength - body, 0);
        const std::int64_t size = std::clamp<std::int64_t>(chunk.size, 0, there);
        const bool inScope = isInScope(scope, chunk.id, body, size, problem);
        if (problem)
            return false;
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
    const std::int32_t status = file.ForEachChunk(visit, &extent);
    if (status != kStatusOK && !problem)
        problem = ContainerProblem::ofStatus(status, Kind::chunks);
    if (problem)
        return problem;
    fileLength_ = extent.fileLength;
    // Fewer bytes than a chunk header are at most a stray pad byte.
    const auto headerSize = static_cast<std::int64_t>(extent.id == kCaff ? sizeof(CAFChunkHeader) : sizeof(ChkHeader));
    if (isUnfinished_ || fileLength_ - end_ < headerSize)
        return {};
    ContainerTail tail;
    if (ExamineContainerTail(file, tail) != kStatusOK || tail.fault != ContainerTail::Fault::none)
        entries_.push_back({0, end_, fileLength_ - end_}); // bytes that are not the room of an edit that was killed
    return {};
}

bool ChunkInventory::isInScope(const EditScope& scope, FourCC id, std::int64_t body, std::int64_t size,
                               ContainerProblem& problem) const
{
    if (id == kFree || std::find(scope.ids.begin(), scope.ids.end(), id) != scope.ids.end())
        return true;
    if (!scope.loopChunks || id != kUuid || size < static_cast<std::int64_t>(tagging::kUUIDSize))
        return false;
    tagging::UUIDBytes uuid;
    problem = readExactly(descriptor_, uuid, body, sizeof uuid);
    return problem || cafChunkUUIDToChunkID(&uuid) != 0 || UUIDIsEqual(uuid, tagging::kSilenceUUID);
}

ContainerProblem ChunkInventory::takeDigest(Entry& entry) const
{
    const auto bytes = std::make_unique_for_overwrite<unsigned char[]>(kDigestEnd);
    const std::int64_t first = std::min(entry.size, kDigestEnd);
    const std::int64_t last = std::min(entry.size - first, kDigestEnd);
    for (const auto& [offset, count] :
         {std::pair(entry.offset, first), std::pair(entry.offset + entry.size - last, last)}) {
        if (ContainerProblem problem = readExactly(descriptor_, bytes.get(), offset, count))
            return problem;
        entry.digest = ECCRC32(entry.digest, bytes.get(), static_cast<std::size_t>(count));
    }
    return {};
}

ContainerProblem ChunkInventory::Compare(const ChunkInventory& after) const
{
    const auto changed = [](const Entry& entry) {
        return ContainerProblem{.kind = entry.id == 0 ? Kind::tailChanged : Kind::changed, .id = entry.id};
    };
    if (after.isUnfinished_ && !isUnfinished_)
        return {Kind::cutShort};
    Pieces ours(descriptor_, fileLength_), theirs(after.descriptor_, after.fileLength_);
    for (std::size_t i = 0; i < std::max(entries_.size(), after.entries_.size()); ++i) {
        if (i >= entries_.size())
            return changed(after.entries_[i]);
        const Entry& before = entries_[i];
        if (i >= after.entries_.size())
            return changed(before);
        const Entry& now = after.entries_[i];
        if (now.id != before.id || now.size != before.size)
            return changed(before);
        const bool same = bodies_ == Bodies::digests ? now.digest == before.digest
                                                     : areSame(ours, before.offset, theirs, now.offset, before.size);
        for (const Pieces* pieces : {&ours, &theirs})
            if (!same && pieces->problem())
                return pieces->problem();
        if (!same)
            return changed(before);
    }
    return {};
}
