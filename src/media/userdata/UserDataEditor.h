// Crash-safe edits of a container's user data; docs/formats/user-data-edits.md describes them for each container.
#pragma once

#include "media/containers/ContainerLayout.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace platform {

/// Changes the chunks of one open file. Whichever system call is the last that happens, the file opens, its samples are
/// where they were, and each chunk is whole: the one before the edit or the one after it.
///
/// An edit prepares its bytes where no reader looks, inside a filler chunk or behind the end, and then shows them by
/// rewriting a single chunk header. Operations return 0 or a negative status code; whatever they return, `layout` has
/// been read again from the file.
class UserDataEditor {
public:
    /// Owns neither. The layout must be that of the file now.
    UserDataEditor(const FileBytes& file, ContainerLayout& layout) : file_(file), layout_(layout) {}

    /// Gives the chunk at a place of the layout's list another body.
    std::int32_t replace(std::size_t chunk, BytesView body);
    /// Adds a chunk after all others of its type.
    std::int32_t append(FourCC id, BytesView body);
    /// Removes the chunks at these places, which ascend; the last ones go first.
    std::int32_t remove(const std::vector<std::size_t>& chunks);

private:
    /// A chunk to be written: a new one, or one of the file that moves.
    struct Piece {
        FourCC id = 0;
        std::uint64_t size = 0;
        BytesView newBody;                            // of a new chunk
        std::optional<std::uint64_t> bodyInFile = {}; // where a moved chunk's body stands
    };
    using Content = std::vector<Piece>;
    struct Run { // neighbouring chunks: all filler, or the chunk asked for between filler
        std::size_t first = 0;
        std::size_t past = 0;
        std::uint64_t position = 0;
        std::uint64_t end = 0;
    };

    bool isFiller(std::size_t chunk) const;
    bool isMovable(std::size_t chunk) const;
    Run runAround(std::size_t chunk) const;
    Run run(std::size_t first, std::size_t past) const;
    Piece pieceOf(std::size_t chunk) const;
    bool canBeFiller(std::uint64_t position, std::uint64_t end, std::optional<FourCC> nextId = {}) const;
    std::uint64_t extentOf(const Content& content) const;
    std::optional<Content> everythingFrom(std::size_t chunk) const;

    // None if there is no room that way; then nothing was changed.
    std::optional<std::int32_t> placeInFrontOf(std::size_t hidden, const Content& content);
    std::optional<std::int32_t> placeBehind(std::size_t hidden, const Piece& piece);
    std::optional<std::int32_t> placeBetween(std::size_t first, std::size_t past, const Content& content);
    std::optional<std::int32_t> placeAtEnd(std::size_t hiddenFrom, const Content& content);
    std::optional<std::int32_t> placeAheadOf(std::size_t next, std::size_t first, const Content& content);
    std::optional<std::int32_t> fillFront(const Run& filler, std::uint64_t hiddenEnd, const Content& content);
    std::optional<std::int32_t> fillBehind(std::uint64_t hiddenFrom, const Run& filler, const Content& content);

    std::int32_t replaceByTwoSteps(std::size_t chunk, const Piece& piece);
    std::int32_t hideOld(const std::vector<std::size_t>& old, FourCC id);
    std::size_t nextOfType(std::size_t from, FourCC id) const;
    std::int32_t appendContent(const Content& content);
    std::int32_t hide(std::size_t chunk);
    std::int32_t hideAll(const std::vector<std::size_t>& chunks);
    std::int32_t hideRun(const Run& hidden);
    std::int32_t grow(std::uint64_t extent);
    std::int32_t mergeFiller(const Run& filler);
    std::int32_t writeHeader(std::uint64_t position, FourCC id, std::uint64_t size);
    std::int32_t finish(std::int32_t status);
    std::int32_t trimEnd();
    std::int32_t rescan();

    const FileBytes& file_;
    ContainerLayout& layout_;
};

} // namespace platform
