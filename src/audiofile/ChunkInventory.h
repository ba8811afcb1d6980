// The chunks of a container that an edit must leave as they are, listed before it and after it.
#pragma once

#include "audiofile/ContainerProblem.h"
#include "audiofile/EditScope.h"

#include <cstdint>
#include <vector>

/// Of an open file, which is borrowed: bodies are read from it when two inventories are compared. A damaged last chunk
/// counts as long as it is, and unused room ("free") does not count.
class KT_EXPORT ChunkInventory {
public:
    /// How bodies are compared: byte by byte, with the file of the other inventory, or by digests of their first and
    /// last bytes, taken at once: of a file that is changed in place nothing else is left.
    enum class Bodies { whole, digests };

    /// Once only. Problems: status, empty, noContainer, chunks, reading.
    ContainerProblem Take(int descriptor, const EditScope& scope, Bodies bodies);

    /// With one that was taken of the same bodies. Problems: changed, tailChanged, cutShort, reading.
    ContainerProblem Compare(const ChunkInventory& after) const;

    /// Where the last whole chunk ends; what is behind it is no chunk. One of the edit's own that is not all there is
    /// not whole.
    std::int64_t End() const { return end_; }
    std::int64_t FileLength() const { return fileLength_; }

private:
    struct Entry {
        FourCC id = 0; // 0: the bytes behind the last chunk
        std::int64_t offset = 0;
        std::int64_t size = 0; // of the body, as far as it is there
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
