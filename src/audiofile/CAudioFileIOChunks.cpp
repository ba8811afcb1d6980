// CAudioFileIO: recognising the container, walking it, finding chunks in it.
#include "audiofile/CAudioFileIO.h"

#include "audiofile/ContainerWalk.h"

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

/// What the container walk and the CAF walk hand to ForEachChunk's visitor.
class ChunkVisitor {
public:
    explicit ChunkVisitor(const std::function<bool(const ChunkEntry&)>& visit) : visit_(visit) {}

    /// Zeros are what some writers leave behind the last chunk; a walk gets no further there.
    bool operator()(FourCC id, std::int64_t position, std::int64_t size) const
    {
        return visit_ && (id != 0 || size != 0) && visit_({id, position, size});
    }

private:
    const std::function<bool(const ChunkEntry&)>& visit_;
};

} // namespace

FourCC CAudioFileIO::IsChunkBased()
{
    std::array<std::byte, 16> start;
    return IsOpen() && Read(start.data(), 0, start.size(), nullptr) == kStatusOK ? ChunkedContainerKind(start) : 0;
}

bool CAudioFileIO::HasChunks()
{
    return IsOpen() && (mInfo.fileType == kCaff || BeginsAsCAF() || IsChunkBased() != 0);
}

bool CAudioFileIO::BeginsAsCAF()
{
    std::array<std::byte, 8> start; // id, version and flags
    return Read(start.data(), 0, start.size(), nullptr) == kStatusOK && loadBE<FourCC>(start.data()) == kCaff;
}

std::int32_t CAudioFileIO::ReadExtendedFileHeader(ContainerChkExtended& header)
{
    return ReadContainerHeader(*this, header);
}

long long CAudioFileIO::NextChunkHeader(long long position, ChkHeader* current, ChkHeader* next, int* error,
                                        const ContainerChkExtended& header)
{
    ChkHeader none;
    std::int32_t status = kStatusOK;
    const std::int64_t result = NextChunk(*this, header, position, current != nullptr ? *current : none,
                                          next != nullptr ? *next : none, status);
    if (error != nullptr)
        *error = status;
    return result;
}

/// Of a file that is open for reading the window stays for all that is asked of it, until the file is another; one that
/// is written to needs a new one each time, which the caller keeps.
FileWindow& CAudioFileIO::Window(std::optional<FileWindow>& own)
{
    if (!mWindow)
        return own.emplace(*this, GetEOF());
    FileStamp now;
    if (GetStamp(now) == kStatusOK && now != mWindowStamp) {
        mWindow = std::make_unique<FileWindow>(*this, now.length);
        mWindowStamp = now;
        SetCache(CacheBlock()); // what it holds is of the file as it was
    }
    return *mWindow;
}

std::int32_t CAudioFileIO::ForEachChunk(const std::function<bool(const ChunkEntry&)>& visit, ContainerExtent* extent)
{
    if (!IsOpen())
        return kNotOpen;
    std::optional<FileWindow> own;
    FileWindow& window = Window(own);
    const ChunkVisitor visitor(visit);
    if (IsOpenCAF()) {
        if (extent != nullptr)
            *extent = {kCaff, window.length(), window.length()};
        return WalkCAFChunks(window, [&](FourCC id, std::int64_t position, std::int64_t size) {
            const std::int64_t toTheEnd = window.length() - position - std::int64_t{sizeof(CAFChunkHeader)};
            return visitor(id, position, size == -1 && id == kData ? toTheEnd : size);
        });
    }
    if (ChunkedContainerKind(window) == 0)
        return kNoContainer;
    ContainerChkExtended header;
    if (ReadContainerHeader(window, header) != kStatusOK)
        return kHeaderUnreadable;
    const std::int64_t end = ContainerEnd(header, window.length());
    if (extent != nullptr)
        *extent = {header.id, end, window.length()};
    const std::int32_t status = WalkChunks(window, header, end, [&](const WalkedChunk& chunk) {
        return visitor(chunk.header.id, chunk.position, chunk.size);
    });
    return status == kWalkStuck ? std::int32_t{kStatusOK} : status;
}

/// The walk goes on behind a match, so that the last of several chunks is the one found; in CAF it is the first that is
/// not empty. Only the last of a walk can lack bytes: the others were passed.
std::int32_t CAudioFileIO::Locate(FourCC id, FoundChunk& found)
{
    if (!IsOpen())
        return kNotOpen;
    std::optional<FileWindow> own;
    FileWindow& window = Window(own);
    std::int32_t result = kNotFound;
    const auto keep = [&](std::int64_t position, std::size_t headerSize, std::int64_t size, std::int64_t next) {
        found = {position, position + static_cast<std::int64_t>(headerSize), size, next, window.length()};
        result = kFound;
    };
    if (IsOpenCAF()) {
        const std::int32_t status =
            WalkCAFChunks(window, [&](FourCC chunkId, std::int64_t position, std::int64_t size) {
                const bool matches = chunkId == id && size > 0;
                std::int64_t next = 0;
                if (matches) {
                    if (__builtin_add_overflow(position + std::int64_t{sizeof(CAFChunkHeader)}, size, &next))
                        next = INT64_MAX;
                    keep(position, sizeof(CAFChunkHeader), size, next);
                }
                return !matches;
            });
        return status == kStatusOK ? result : status;
    }
    if (ChunkedContainerKind(window) == 0)
        return kNoContainer;
    ContainerChkExtended header;
    if (ReadContainerHeader(window, header) != kStatusOK)
        return kHeaderUnreadable;
    const std::int64_t end = ContainerEnd(header, window.length());
    const std::int32_t status = WalkChunks(window, header, end, [&](const WalkedChunk& chunk) {
        if (chunk.header.id == id)
            keep(chunk.position, sizeof(ChkHeader), chunk.size, chunk.next);
        return true;
    });
    return status == kStatusOK || status == kWalkStuck ? result : status;
}

std::int32_t CAudioFileIO::Find(FourCC id, FoundChunk& found)
{
    const std::int32_t result = Locate(id, found);
    const bool isFailure = result != kFound && result != kNotOpen;
    return IsOpenCAF() && isFailure ? kNotFound : result;
}

std::int32_t CAudioFileIO::LocateChunk(FourCC id, ChunkEntry& chunk)
{
    FoundChunk found;
    const std::int32_t result = Locate(id, found);
    chunk = {result == kFound ? id : 0, found.position, found.size};
    return result;
}

std::int32_t CAudioFileIO::ReadBytes(void* to, const FoundChunk& found)
{
    constexpr std::int64_t small = 512; // likely in the window with its header
    if (mWindow && found.size <= small &&
        mWindow->read(to, found.body, static_cast<std::size_t>(found.size)) == kStatusOK)
        return kStatusOK;
    return Read(to, found.body, static_cast<long>(found.size), nullptr);
}

/// 0, -5, or kStatusOutOfMemory. An empty body is a null array. What is not in the file is not allocated either.
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
