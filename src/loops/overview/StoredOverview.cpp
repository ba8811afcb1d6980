#include "loops/overview/StoredOverview.h"

#include "audiofile/CAudioFileIO.h"
#include "loops/overview/CAFOverview.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <utility>

namespace {

constexpr FourCC kOverview = fourCC("LGWV");
constexpr FourCC kOlderOverview = fourCC("ovwf");
constexpr FourCC kCAFOverview = fourCC("ovvw");

constexpr std::int32_t kFound = 1;
constexpr std::int32_t kNotFound = 0;
constexpr std::int32_t kOutOfMemory = -108;

constexpr std::int64_t kOlderPrefixSize = 20;

struct Body {
    std::int64_t offset = 0;
    std::int64_t size = 0;
};

/// 1 if found, 0 if not, or an error, which also stands for a body that the file does not hold whole.
std::int32_t findBody(CAudioFileIO& file, FourCC id, Body& body)
{
    ChunkEntry chunk;
    const std::int32_t result = file.LocateChunk(id, chunk);
    body = {chunk.body, chunk.size};
    if (result == kFound && (chunk.size < 0 || chunk.size > file.GetEOF() - body.offset))
        return kStatusEndOfFile;
    return result;
}

/// Converts the header's words from the container's byte order to the host's, or back.
void swapHeader(KTMem& block)
{
    OverviewHeader header;
    std::memcpy(&header, block.data(), sizeof header);
    header = {byteSwapped(header.frames), byteSwapped(header.reserved)};
    std::memcpy(block.data(), &header, sizeof header);
}

bool isHostOrder(const AudioFileInfo& info)
{
    return (info.fileType == kAIFF ? std::endian::big : std::endian::little) == std::endian::native;
}

bool isAccepted(const AudioFileInfo& info)
{
    return info.fileType == kAIFF || info.fileType == kWAVE || info.fileType == kCaff;
}

// ---- writing

bool isSilence(const KTMem& overview)
{
    const OverviewPoint* points = OverviewPointsOf(overview);
    return std::all_of(points, points + OverviewPoints(overview),
                       [](OverviewPoint point) { return point.minimum == 0 && point.maximum == 0; });
}

std::int32_t countCAFOverviews(CAudioFileIO& file, int& count)
{
    count = 0;
    return file.ForEachChunk([&](const ChunkEntry& chunk) {
        count += chunk.id == kCAFOverview && chunk.size > 0 ? 1 : 0;
        return true;
    });
}

/// Removes overviews until the last `kept` remain. Removing takes the first one, which is also the one that readers
/// find.
std::int32_t removeCAFOverviews(CAudioFileIO& file, int kept)
{
    for (int before = -1;;) {
        int count = 0;
        if (const std::int32_t status = countCAFOverviews(file, count); status != kStatusOK || count <= kept)
            return status;
        if (count == before) // the chunk cannot be removed
            return kStatusIOError;
        before = count;
        if (const std::int32_t status = file.RemoveChunk(kCAFOverview); status != kStatusOK)
            return status;
    }
}

/// Appends the chunk, and cuts a failed addition off again: its remains would stand in the way of the next one.
std::int32_t addCAFOverview(CAudioFileIO& file, const KTMem& chunk)
{
    const long long end = file.GetEOF();
    const std::int32_t added = file.AddChunk(kCAFOverview, BytesView(chunk.data(), chunk.size()), false);
    if (added == kFound)
        return kStatusOK;
    file.SetEOF(end);
    return added;
}

std::int32_t writeCAF(CAudioFileIO& file, const KTMem& overview, bool& stored)
{
    Body data;
    Packed<std::uint32_t> editCount;
    // Samples that are open-ended (size -1) are "not found", and samples that run past the end of the file are an
    // error: a chunk put behind either would become part of the sound.
    if (findBody(file, kData, data) != kFound || data.size < std::int64_t{sizeof editCount})
        return kStatusParameterError;
    if (const std::int32_t status = file.Read(&editCount, data.offset, sizeof editCount, nullptr); status != kStatusOK)
        return status;
    KTMem chunk;
    const bool isSilent = isSilence(overview);
    if (!isSilent && !makeCAFOverview(overview, editCount, chunk))
        return kOutOfMemory;
    if (isSilent)
        return removeCAFOverviews(file, 0);
    Body old;
    if (const std::int32_t found = findBody(file, kCAFOverview, old); found < 0)
        return found;
    if (const std::int32_t status = file.PrepareToAppend(); status != kStatusOK)
        return status;
    // The new overview is complete before the old one goes. Until then the old one stands first, where readers find it;
    // a process that dies in between leaves both, or part of a chunk at the end of the file.
    if (const std::int32_t status = addCAFOverview(file, chunk); status != kStatusOK)
        return status;
    const std::int32_t removed = removeCAFOverviews(file, 1);
    stored = removed == kStatusOK;
    return removed;
}

std::int32_t writeChunked(CAudioFileIO& file, KTMem& overview, bool& stored)
{
    if (const std::int32_t status = file.PrepareToAppend(); status != kStatusOK)
        return status;
    const bool swaps = !isHostOrder(file.Info());
    if (swaps)
        swapHeader(overview);
    const std::int32_t added = file.AddChunk(kOverview, BytesView(overview.data(), overview.size()), true);
    if (swaps)
        swapHeader(overview);
    stored = added == kFound;
    if (added == kNotFound) // the file is no chunked container after all
        return kStatusParameterError;
    return stored ? kStatusOK : added;
}

// ---- reading

/// A file of compressed samples may claim any number of frames; an overview many times larger than the file is not
/// allocated.
bool isPlausible(const CAudioFileIO& file, std::int64_t frames)
{
    constexpr std::int64_t always = 1 << 20;
    return frames > 0 && OverviewPointCount(frames) <= std::max<std::int64_t>(file.GetEOF(), always);
}

std::int32_t readPairs(CAudioFileIO& file, Body pairs, CAFOverviewFolder& folder)
{
    std::array<CAFOverviewPair, 2048> piece;
    std::int64_t left = pairs.size / std::int64_t{sizeof(CAFOverviewPair)};
    for (std::int64_t offset = pairs.offset; left > 0 && !folder.isDone();) {
        const auto count = std::min<std::int64_t>(left, piece.size());
        const auto size = static_cast<long>(count * std::int64_t{sizeof(CAFOverviewPair)});
        if (const std::int32_t status = file.Read(piece.data(), offset, size, nullptr); status != kStatusOK)
            return status;
        for (auto pair = piece.begin(); pair != piece.begin() + count && !folder.isDone(); ++pair)
            folder.add(*pair);
        left -= count;
        offset += size;
    }
    folder.finish();
    return kStatusOK;
}

std::int32_t readCAF(CAudioFileIO& file, std::int64_t frames, KTMem& block)
{
    Body body;
    const std::int32_t found = findBody(file, kCAFOverview, body);
    if (found != kFound)
        return found;
    CAFOverviewHeader header;
    if (body.size < std::int64_t{sizeof header} || !isPlausible(file, frames))
        return kStatusParameterError;
    if (const std::int32_t status = file.Read(&header, body.offset, sizeof header, nullptr); status != kStatusOK)
        return status;
    const auto framesPerPair =
        static_cast<std::int32_t>(inByteOrder(std::uint32_t{header.framesPerSample}, std::endian::big));
    if (framesPerPair < 1) // also excludes 2^31 and more
        return kStatusParameterError;
    if (!block.allocate(OverviewBlockSize(frames)))
        return kStatusOutOfMemory;
    SetOverviewFrames(block, frames);
    CAFOverviewFolder folder(block, frames, framesPerPair);
    const std::int64_t headerSize = sizeof header;
    const std::int32_t status = readPairs(file, {body.offset + headerSize, body.size - headerSize}, folder);
    return status == kStatusOK ? kFound : status;
}

std::int32_t readPlain(CAudioFileIO& file, std::int64_t frames, KTMem& block)
{
    Body body;
    const std::int32_t found = findBody(file, kOverview, body);
    if (found != kFound)
        return found;
    if (body.size != static_cast<std::int64_t>(OverviewBlockSize(frames)))
        return kStatusParameterError;
    if (!block.allocate(static_cast<std::size_t>(body.size)))
        return kStatusOutOfMemory;
    const std::int32_t status = file.Read(block.data(), body.offset, static_cast<long>(body.size), nullptr);
    if (status != kStatusOK)
        return status;
    if (!isHostOrder(file.Info()))
        swapHeader(block);
    return IsOverviewBlock(block) ? kFound : kStatusParameterError;
}

/// Reads the points of an older overview. Its prefix and header are not interpreted, since the file says how many
/// frames it has.
std::int32_t readOlder(CAudioFileIO& file, std::int64_t frames, KTMem& block)
{
    Body body;
    const std::int32_t found = findBody(file, kOlderOverview, body);
    if (found != kFound)
        return found;
    const std::size_t size = OverviewBlockSize(frames);
    if (frames < 1 || body.size != static_cast<std::int64_t>(size) + kOlderPrefixSize)
        return kStatusParameterError;
    if (!block.allocate(size))
        return kStatusOutOfMemory;
    const std::int64_t start = body.offset + kOlderPrefixSize + std::int64_t{kOverviewHeaderSize};
    OverviewPoint* points = OverviewPointsOf(block);
    const std::size_t count = OverviewPoints(block);
    const std::int32_t status = file.Read(points, start, static_cast<long>(count * sizeof(OverviewPoint)), nullptr);
    if (status != kStatusOK)
        return status;
    std::for_each(points, points + count, [](OverviewPoint& point) { std::swap(point.minimum, point.maximum); });
    SetOverviewFrames(block, frames);
    return kFound;
}

/// 1 if read, 0 if none is stored, or an error.
std::int32_t readOverview(CAudioFileIO& file, std::int64_t frames, KTMem& block)
{
    if (!isAccepted(file.Info()))
        return kStatusParameterError;
    if (file.Info().fileType == kCaff)
        return readCAF(file, frames, block);
    const std::int32_t result = readPlain(file, frames, block);
    if (result != kNotFound && result != kStatusParameterError)
        return result;
    // An overview that does not fit must not hide an older one that does.
    const std::int32_t older = readOlder(file, frames, block);
    return older == kNotFound ? result : older;
}

} // namespace

std::int32_t WriteOverviewToAudioFile(const CFileRef& ref, KTMem* overview, long frames, bool* stored)
{
    bool ignored = false;
    bool& isStored = stored != nullptr ? *stored : ignored;
    isStored = false;
    if (overview == nullptr || !IsOverviewBlock(*overview))
        return kStatusParameterError;
    CAudioFileIO file;
    if (const std::int32_t status = file.Open(ref, kFileIOReadWrite); status != kStatusOK)
        return status;
    const AudioFileInfo& info = file.Info();
    const std::int64_t covered = frames > 0 ? frames : info.frames;
    std::int32_t status = kStatusParameterError;
    if (isAccepted(info) && overview->size() == OverviewBlockSize(covered))
        status = info.fileType == kCaff ? writeCAF(file, *overview, isStored) : writeChunked(file, *overview, isStored);
    const std::int32_t closed = file.Close();
    return status != kStatusOK ? status : closed;
}

std::unique_ptr<KTMem> ReadOverviewFromAudioFile(const CFileRef& ref, long frames, std::int32_t* status)
{
    CAudioFileIO file;
    auto block = std::make_unique<KTMem>();
    std::int32_t result = file.Open(ref, 0);
    if (result == kStatusOK)
        result = readOverview(file, frames > 0 ? frames : file.Info().frames, *block);
    if (status != nullptr)
        *status = result == kFound ? kStatusOK : result;
    return result == kFound ? std::move(block) : nullptr;
}

CFileRef GetMetadataFileRefForAudioFile(const CFileRef& ref)
{
    CFileRef metadata(ref);
    metadata.ReplaceExtensionBy("ktmd");
    return metadata;
}
