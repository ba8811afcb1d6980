// CAudioFileIO: recognising the container, walking it, finding chunks in it.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/FileWindow.h"
#include "media/containers/ChunkWalk.h"

#include <algorithm>
#include <array>
#include <new>

namespace {

constexpr std::int32_t kFound = 1;
constexpr std::int32_t kNotFound = 0;
constexpr std::int32_t kNotOpen = -1;
constexpr std::int32_t kNoContainer = -2;
constexpr std::int32_t kHeaderUnreadable = -3;
constexpr std::int32_t kBodyUnreadable = -5;

using platform::ChunkWalk;
using platform::ContainerKind;
using platform::WalkPolicy;

/// Begins the walk. 0, or -2 if the file is no container, or -3 if its header cannot be read.
std::int32_t begin(ChunkWalk& walk)
{
    if (walk.begin() == kStatusOK)
        return walk.container().traits->hasChunks ? std::int32_t{kStatusOK} : kNoContainer;
    return walk.container().traits == nullptr ? kNoContainer : kHeaderUnreadable;
}

} // namespace

FourCC CAudioFileIO::IsChunkBased()
{
    std::array<std::byte, 16> start;
    if (!IsOpen() || Read(start.data(), 0, start.size(), nullptr) != kStatusOK)
        return 0;
    const platform::ContainerTraits* traits = platform::recogniseContainer(start);
    return traits != nullptr && traits->isEditable && traits->kind != ContainerKind::caf ? traits->fileType : 0;
}

bool CAudioFileIO::HasChunks()
{
    std::array<std::byte, platform::kMostOfContainerStart> start;
    long there = 0;
    if (!IsOpen())
        return false;
    Read(start.data(), 0, start.size(), &there);
    const auto count = static_cast<std::size_t>(std::max(there, 0L));
    const platform::ContainerTraits* traits = platform::recogniseContainer(BytesView(start).first(count));
    return traits != nullptr && traits->hasChunks;
}

bool CAudioFileIO::TakesChunks()
{
    return IsOpen() && (IsOpenCAF() || IsChunkBased() != 0);
}

std::int32_t CAudioFileIO::ReadExtendedFileHeader(ContainerChkExtended& header)
{
    std::optional<FileWindow> own;
    return platform::readContainerHeader(Window(own), header) == kStatusOK ? std::int32_t{kStatusOK}
                                                                           : kHeaderUnreadable;
}

long long CAudioFileIO::NextChunkHeader(long long position, ChkHeader* current, ChkHeader* next, int* error,
                                        const ContainerChkExtended& header)
{
    ChkHeader none;
    std::int32_t status = kStatusOK;
    std::optional<FileWindow> own;
    const std::int64_t result = platform::nextChunkHeader(
        Window(own), header, position, current != nullptr ? *current : none, next != nullptr ? *next : none, status);
    if (error != nullptr)
        *error = status;
    return result;
}

/// A file that is open for reading keeps one window until the file changes. A file that is open for writing needs a new
/// window each time, which the caller holds in `own`.
FileWindow& CAudioFileIO::Window(std::optional<FileWindow>& own)
{
    if (!window_)
        return own.emplace(*this, GetEOF());
    FileStamp now;
    if (GetStamp(now) == kStatusOK && now != windowStamp_) {
        window_ = std::make_unique<FileWindow>(*this, now.length);
        windowStamp_ = now;
        SetCache(CacheBlock()); // the cached bytes are those of the former file
    }
    return *window_;
}

std::int32_t CAudioFileIO::ForEachChunk(const std::function<bool(const ChunkEntry&)>& visit, ContainerExtent* extent)
{
    if (!IsOpen())
        return kNotOpen;
    std::optional<FileWindow> own;
    FileWindow& window = Window(own);
    ChunkWalk walk(window, WalkPolicy::asStated);
    if (const std::int32_t status = begin(walk); status != kStatusOK)
        return status;
    const platform::ContainerTraits& traits = *walk.container().traits;
    if (extent != nullptr)
        *extent = {traits.isEditable ? walk.container().id : traits.fileType, walk.statedEnd(), window.fileLength(),
                   traits.kind};
    while (visit && walk.next()) {
        const platform::WalkedChunk& chunk = walk.chunk();
        const bool isOpen = traits.kind == ContainerKind::caf && chunk.size == -1 && chunk.id == traits.soundId;
        const auto body = static_cast<std::int64_t>(chunk.body);
        const std::int64_t size = isOpen ? window.fileLength() - body : chunk.size;
        // Some writers leave zeros after the last chunk; a walk does not get past them.
        const bool isNone = chunk.id == 0 && size == 0;
        if (isNone || !visit({chunk.id, static_cast<std::int64_t>(chunk.position), size, body}))
            return kStatusOK;
    }
    return walk.status();
}

/// The walk continues after a match, so the last of several chunks is found; in CAF the first that is not empty. Only
/// the last chunk of a walk can lack bytes, because a walk does not pass one that does.
std::int32_t CAudioFileIO::Locate(FourCC id, FoundChunk& found)
{
    if (!IsOpen())
        return kNotOpen;
    std::optional<FileWindow> own;
    FileWindow& window = Window(own);
    ChunkWalk walk(window, WalkPolicy::asStated);
    if (const std::int32_t status = begin(walk); status != kStatusOK)
        return status;
    const bool isCAF = walk.container().traits->kind == ContainerKind::caf;
    const bool isEditable = found.isEditable = walk.container().traits->isEditable;
    std::int32_t result = kNotFound;
    while (walk.next()) {
        const platform::WalkedChunk& chunk = walk.chunk();
        if (chunk.id != id || (isCAF && chunk.size <= 0))
            continue;
        found = {static_cast<std::int64_t>(chunk.position),
                 static_cast<std::int64_t>(chunk.body),
                 chunk.size,
                 walk.following(),
                 window.fileLength(),
                 isEditable};
        result = kFound;
        if (isCAF)
            break;
    }
    return walk.status() == kStatusOK ? result : walk.status();
}

std::int32_t CAudioFileIO::Find(FourCC id, FoundChunk& found)
{
    std::int32_t result = Locate(id, found);
    if (result >= kNotFound && !found.isEditable)
        result = kNoContainer;
    const bool isFailure = result != kFound && result != kNotOpen;
    return IsOpenCAF() && isFailure ? kNotFound : result;
}

std::int32_t CAudioFileIO::LocateChunk(FourCC id, ChunkEntry& chunk)
{
    FoundChunk found;
    const std::int32_t result = Locate(id, found);
    chunk = {result == kFound ? id : 0, found.position, found.size, found.body};
    return result;
}

std::int32_t CAudioFileIO::ReadBytes(void* to, const FoundChunk& found)
{
    constexpr std::int64_t small = 512; // the window probably holds such a body with its header
    if (window_ && found.size <= small &&
        window_->read(to, static_cast<std::uint64_t>(found.body), static_cast<std::size_t>(found.size)) == kStatusOK)
        return kStatusOK;
    return Read(to, found.body, static_cast<long>(found.size), nullptr);
}

/// 0, -5, or kStatusOutOfMemory. An empty body is a null array. Memory is allocated only for bytes that the file holds.
std::int32_t CAudioFileIO::ReadBody(const FoundChunk& found, std::unique_ptr<char[]>& data)
{
    if (!found.HasItsBytes())
        return kBodyUnreadable;
    if (found.size == 0)
        return kStatusOK;
    std::unique_ptr<char[]> body(new (std::nothrow) char[static_cast<std::size_t>(found.size)]);
    if (!body)
        return kStatusOutOfMemory;
    if (ReadBytes(body.get(), found) != kStatusOK)
        return kBodyUnreadable;
    data = std::move(body);
    return kStatusOK;
}

std::int32_t CAudioFileIO::FindChunk(unsigned int id, char** data, long* size, long long* position, long long* next)
{
    if (data != nullptr)
        *data = nullptr;
    if (size != nullptr)
        *size = 0;
    if (size == nullptr || position == nullptr || next == nullptr)
        return kStatusParameterError;
    FoundChunk found;
    const std::int32_t result = Find(id, found);
    if (result != kFound)
        return result;
    std::unique_ptr<char[]> body;
    if (const std::int32_t status = data != nullptr ? ReadBody(found, body) : kStatusOK; status != kStatusOK)
        return status;
    if (data != nullptr)
        *data = body.release();
    *size = static_cast<long>(found.size);
    *position = found.position;
    *next = found.next;
    return kFound;
}

std::int32_t CAudioFileIO::FindChunk(unsigned int id, CChunkData& chunk)
{
    chunk.data.reset();
    chunk.size = chunk.position = chunk.next = 0;
    FoundChunk found;
    const std::int32_t result = Find(id, found);
    if (result != kFound)
        return result;
    if (const std::int32_t status = ReadBody(found, chunk.data); status != kStatusOK)
        return status;
    chunk.size = found.size;
    chunk.id = id;
    chunk.position = found.position;
    chunk.next = found.next;
    return kFound;
}

std::optional<Bytes> CAudioFileIO::FindChunk(unsigned int id)
{
    FoundChunk found;
    if (Find(id, found) != kFound || !found.HasItsBytes())
        return std::nullopt;
    Bytes body(static_cast<std::size_t>(found.size));
    if (ReadBytes(body.data(), found) != kStatusOK)
        return std::nullopt;
    return body;
}
