// The one walk through the chunks of a container, by whatever it is read. Whoever lists, finds, adds, removes or
// describes goes this way, so that damaged files are read one way; where two callers must differ, that is a policy
// here.
#pragma once

#include "media/containers/ContainerHeaders.h"
#include "media/containers/ContainerTraits.h"
#include "media/containers/HeaderWindow.h"

#include <cstdint>

namespace platform {

/// How far a walk goes, and what it makes of sizes that cannot be.
enum class WalkPolicy : std::uint8_t {
    /// To the samples and on, as who plays a file wants it. A container size that was never filled in means the end of
    /// the file, and format and samples are looked for beyond what it says, as there are readers that never look at it.
    /// Sizes are unsigned; samples of an unfinished recording go on to the end of the file (isUnfinished). Zeros are no
    /// chunk.
    toTheSound,
    /// By the sizes as they stand, as the edits of the container class want it: new chunks go where the container says
    /// that it ends. Kept: a size of 0 ends it at its first chunk, sizes of FORM are signed and negative ones end the
    /// walk, bytes behind the last chunk that are too few for another belong to it, and zeros are a chunk, behind which
    /// only CAF goes on.
    asStated
};

/// A container as its first bytes show it.
struct Container {
    const ContainerTraits* traits = nullptr;
    FourCC id = 0;       // the first four bytes
    FourCC formType = 0; // of RIFF, RIFX, FORM and "CAT "
    /// Of RIFF, FORM and "CAT ", in host order.
    ContainerChkExtended header{};
};

/// A chunk as the walk meets it.
struct WalkedChunk {
    FourCC id = 0;
    std::uint32_t field = 0;    // the size as it stands in an 8-byte header
    std::uint64_t position = 0; // of the header
    std::uint64_t body = 0;
    /// Of the body, in force: of the header, or of the "ds64". It may go beyond the end of the file; to the sound it is
    /// INT64_MAX for samples that go on to the end of the file, as stated it may be negative.
    std::int64_t size = 0;

    bool hasItsBytes(std::uint64_t fileLength) const
    {
        return size >= 0 && body <= fileLength && static_cast<std::uint64_t>(size) <= fileLength - body;
    }
};

/// Does not own the window. Costs a call for each part of the file that the window does not hold, and no memory.
class ChunkWalk {
public:
    ChunkWalk(HeaderWindow& window, WalkPolicy policy) : window_(window), policy_(policy) {}

    /// Reads the start. 0; kStatusParameterError for a file that is none of the containers; kStatusEndOfFile for one
    /// that ends in its header; the status of a read that failed.
    std::int32_t begin();
    /// Begins without reading, as stated, in WAVE whose header stands in memory and may no longer stand in the file.
    void beginAs(const ContainerChkExtended& header);
    const Container& container() const { return container_; }
    /// Where the chunks end by what the container states, at most the length of the file. Negative where a signed size
    /// is.
    std::int64_t statedEnd() const { return statedEnd_; }

    /// Goes to the next chunk; false when there is none, and when a header, by which it is found, cannot be read:
    /// then nobody knows either where the one ahead ends, which is not shown.
    bool next();
    const WalkedChunk& chunk() const { return chunk_; }
    /// Of the read that ended the walk; else kStatusOK.
    std::int32_t status() const { return status_; }

    // As stated.

    /// Of what follows the chunk; the length of the file when nothing does, and behind a size that cannot be.
    std::int64_t following() const { return following_; }

    // To the sound.

    /// Behind the last chunk, where one more would stand.
    std::uint64_t end() const { return end_; }
    /// The walk met bytes that are no chunk, or samples that hide what follows them: nothing may be put behind the last
    /// one.
    bool isBroken() const { return isBroken_; }
    /// The first chunk of samples was among those that were met.
    bool metSound() const { return metSound_; }
    /// Of the last chunk: odd, and its writer left the pad byte out.
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
    ChkHeader ahead_;                // as stated: that of `following_`, in host order
    std::int64_t containerSize_ = 0; // from offset 8 on; to the sound 0 where that is open
    std::int64_t statedEnd_ = 0;
    std::int64_t following_ = 0;
    std::uint64_t limit_ = 0; // to the sound: that of the container
    std::uint64_t end_ = 0;
};

/// The header of a RIFF or FORM container, in host order; the record is cleared first. 0, kStatusEndOfFile, or the
/// status of the read that failed.
std::int32_t readContainerHeader(HeaderWindow& window, ContainerChkExtended& header);

/// One step as stated, through a RIFF or FORM container: the offset of the chunk after `current`, whose header stands
/// at `position`; `next` receives its header in host order. Position 0 asks for the first chunk. A chunk that runs past
/// the end of the file, a negative size and a failed read give the file's length; the walk is over when the result does
/// not exceed `position`, or reaches the container's end. `error` is the status of reading the header:
/// kStatusParameterError when `current` is all zero. `next` is zero when it could not be read.
std::int64_t nextChunkHeader(HeaderWindow& window, const ContainerChkExtended& header, std::int64_t position,
                             const ChkHeader& current, ChkHeader& next, std::int32_t& error);

} // namespace platform
