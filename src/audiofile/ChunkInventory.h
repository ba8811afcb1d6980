// The chunks that an edit of a container must leave as they are, listed before and after it.
#pragma once

#include "audiofile/ContainerProblem.h"
#include "audiofile/EditScope.h"

#include <cstdint>
#include <vector>

/// The chunks of an open file, which is borrowed: comparing two inventories reads bodies from it. A damaged last
/// chunk counts for as long as it is, and unused room ("free") does not count.
class KT_EXPORT ChunkInventory {
public:
    /// How bodies are compared: byte by byte with the file of the other inventory; or by digests of their first and
    /// last bytes, taken in advance, since a file that is changed in place leaves nothing else to compare.
    enum class Bodies { whole, digests };

    /// Lists the chunks. Call it once. Problems: status, empty, noContainer, chunks, reading.
    ContainerProblem Take(int descriptor, const EditScope& scope, Bodies bodies);

    /// Compares with an inventory of the same file after the edit. Problems: changed, tailChanged, cutShort, reading.
    ContainerProblem Compare(const ChunkInventory& after) const;

    /// Where the last whole chunk ends; what follows is no chunk. A chunk of the edit itself that is not all there is
    /// not whole.
    std::int64_t End() const { return end_; }
    /// In bytes, when the inventory was taken.
    std::int64_t FileLength() const { return fileLength_; }

private:
    struct Entry {
        FourCC id = 0; // 0: the bytes behind the last chunk
        std::int64_t offset = 0;
        std::int64_t size = 0; // of the body's bytes that are there
        std::uint32_t digest = 0;
    };

    ContainerProblem walk(const EditScope& scope);
    bool isInScope(const EditScope& scope, FourCC id, std::int64_t body, std::int64_t size,
                   ContainerProblem& problem) const;
    ContainerProblem takeDigest(Entry& entry) const;

    int descriptor_ = -1;
    Bodies bodies_ = Bodies::whole;
    std::vector<Entry> entries_;
    std::int64_t end_ = 0;
    std::int64_t fileLength_ = 0;
    bool isUnfinished_ = false; // the last chunk is the edit's own, and not all there
};
