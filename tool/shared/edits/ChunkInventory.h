// The chunks of a container that an edit must leave as they are, listed before it and after it.
#pragma once

#include "tool/shared/edits/EditScope.h"

#include <cstdint>
#include <string>
#include <vector>

/// Of an open file, which is borrowed: bodies are read from it when two inventories are compared. A damaged last chunk
/// counts as long as it is, and unused room ("free") does not count.
class ChunkInventory {
public:
    /// How bodies are compared: byte by byte, with the file of the other inventory, or by digests of their first and
    /// last bytes, taken at once: of a file that is changed in place nothing else is left.
    enum class Bodies { whole, digests };

    /// Throws Failure when the container cannot be walked or read.
    ChunkInventory(int descriptor, const EditScope& scope, Bodies bodies);

    /// Throws Failure, with the chunk that is not as it was, or that cannot be read.
    void requireSameIn(const ChunkInventory& after) const;

    /// Where the last whole chunk ends; what is behind it is no chunk. One of the edit's own that is not all there is
    /// not whole.
    std::int64_t end() const { return end_; }
    std::int64_t fileLength() const { return fileLength_; }

private:
    struct Entry {
        FourCC id = 0; // 0: the bytes behind the last chunk
        std::int64_t offset = 0;
        std::int64_t size = 0; // of the body, as far as it is there
        std::uint32_t digest = 0;
    };

    void walk(const EditScope& scope);
    bool isInScope(const EditScope& scope, FourCC id, std::int64_t body, std::int64_t size) const;
    std::uint32_t digestOf(const Entry& entry) const;
    static std::string nameOf(const Entry& entry);

    int descriptor_;
    Bodies bodies_;
    std::vector<Entry> entries_;
    std::int64_t end_ = 0;
    std::int64_t fileLength_ = 0;
    bool isUnfinished_ = false; // the last chunk is the edit's own, and not all there
};
