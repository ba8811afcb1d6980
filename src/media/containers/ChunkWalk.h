// The only walk through the chunks of a container. Whoever lists, finds, adds, removes or describes chunks uses it, so
// that all read damaged files alike; where two callers must differ, the difference is a policy here.
#pragma once

#include "media/containers/ContainerHeaders.h"
#include "media/containers/ContainerTraits.h"
#include "media/containers/HeaderWindow.h"

#include <cstdint>

namespace platform {

/// How far a walk goes, and how it treats impossible sizes.
enum class WalkPolicy : std::uint8_t {
    /// For playing: walks to the samples and on. A container size that was never filled in means the end of the file,
    /// and format and samples are searched for beyond the stated end, since some readers never look at it. Sizes are
    /// unsigned; samples of an unfinished recording extend to the end of the file (isUnfinished). Zeros are no chunk.
    toTheSound,
    /// For edits of the container class: takes the sizes as they stand, because new chunks go where the container says
    /// that it ends. Kept: a size of 0 ends the container at its first chunk; sizes in FORM are signed, and a negative
    /// one ends the walk; bytes after the last chunk that are too few for another belong to it; zeros are a chunk,
    /// after which only CAF continues.
    asStated
};

/// A container as its first bytes describe it.
struct Container {
    const ContainerTraits* traits = nullptr;
    FourCC id = 0;       // the first four bytes
    FourCC formType = 0; // of RIFF, RIFX, FORM and "CAT "
    /// For RIFF, FORM and "CAT ", in host order.
    ContainerChkExtended header{};
};

/// A chunk as the walk meets it.
struct WalkedChunk {
    FourCC id = 0;
    std::uint32_t field = 0;    // as it stands in an 8-byte header
    std::uint64_t position = 0; // of the header
    std::uint64_t body = 0;
    /// Effective size of the body, from the header or the "ds64". It may extend beyond the end of the file. Walking to
    /// the sound, it is INT64_MAX for samples that extend to the end of the file; walking as stated, it may be
    /// negative.
    std::int64_t size = 0;

    bool hasItsBytes(std::uint64_t fileLength) const
    {
        return size >= 0 && body <= fileLength && static_cast<std::uint64_t>(size) <= fileLength - body;
    }
};

/// Does not own the window. Costs one call for each part of the file that the window does not hold, and no memory.
class ChunkWalk {
public:
    ChunkWalk(HeaderWindow& window, WalkPolicy policy) : window_(window), policy_(policy) {}

    /// Reads the start. kStatusParameterError if the file is no known container; kStatusEndOfFile if it ends inside its
    /// header; the status of a failed read; else 0.
    std::int32_t begin();
    /// Begins as stated, without reading, in WAVE whose header is in memory and may no longer be in the file.
    void beginAs(const ContainerChkExtended& header);
    const Container& container() const { return container_; }
    /// Where the chunks end according to the container, at most the length of the file. Negative if a signed size is.
    std::int64_t statedEnd() const { return statedEnd_; }

    /// Moves to the next chunk. False if there is none, and if a header cannot be read. The chunk before that header is
    /// not shown either, because its end depends on it.
    bool next();
    const WalkedChunk& chunk() const { return chunk_; }
    /// Status of the read that ended the walk; else kStatusOK.
    std::int32_t status() const { return status_; }

    // For walks as stated.

    /// Position of what follows the chunk; the length of the file if nothing does, and after an impossible size.
    std::int64_t following() const { return following_; }

    // For walks to the sound.

    /// Where one more chunk would go, after the last.
    std::uint64_t end() const { return end_; }
    /// The walk met bytes that are no chunk, or samples that hide what follows them, so nothing may be appended.
    bool isBroken() const { return isBroken_; }
    /// The walk has met the first chunk of samples.
    bool metSound() const { return metSound_; }
    /// The last chunk has an odd size and no pad byte.
    bool padIsMissing() const { return padIsMissing_; }

private:
    bool isChunked() const { return container_.traits->chunkHeaderSize == sizeof(ChkHeader); }
    std::int32_t beginChunked();
    void setStatedEnd();
    const std::byte* readHeader(std::uint64_t position);
    std::int64_t statedSize(const std::byte* header);
    std::uint64_t padded(std::uint64_t end);
    bool nextBySteps();
    bool nextAsStated();
    void pass();
    bool nextToTheSound();
    bool nextOfAU();
    bool endAsBroken();
    std::int64_t sizeOfSound(std::int64_t stated);

    HeaderWindow& window_;
    WalkPolicy policy_;
    bool hasBegun_ = false;
    bool isBroken_ = false;
    bool metFormat_ = false;
    bool metSound_ = false;
    bool padIsMissing_ = false;
    std::int32_t status_ = 0;
    Container container_;
    WalkedChunk chunk_;
    ChkHeader ahead_;                // as stated: the header at `following_`, in host order
    std::int64_t containerSize_ = 0; // from offset 8 on; to the sound 0 if it is open
    std::int64_t statedEnd_ = 0;
    std::int64_t following_ = 0;
    std::uint64_t limit_ = 0; // to the sound: end of the container
    std::uint64_t end_ = 0;
};

/// Reads the header of a RIFF or FORM container in host order, after clearing the record. 0, kStatusEndOfFile, or the
/// status of a failed read.
std::int32_t readContainerHeader(HeaderWindow& window, ContainerChkExtended& header);

/// One step, as stated, through a RIFF or FORM container: returns the offset of the chunk after `current`, whose header
/// is at `position`, and puts its header into `next` in host order (zero if it could not be read). Position 0 asks for
/// the first chunk. Returns the file's length for a chunk that runs past the end of the file, for a negative size and
/// for a failed read; the walk is over once the result does not exceed `position` or reaches the container's end.
/// `error` is the status of reading the header: kStatusParameterError if `current` is all zero.
std::int64_t nextChunkHeader(HeaderWindow& window, const ContainerChkExtended& header, std::int64_t position,
                             const ChkHeader& current, ChkHeader& next, std::int32_t& error);

} // namespace platform
