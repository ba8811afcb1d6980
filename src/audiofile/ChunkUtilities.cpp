#include "audiofile/ChunkUtilities.h"

#include "audiofile/CAudioFileIO.h"
#include "files/CFileUtil.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>
#include <string_view>

namespace {

constexpr char kMetadataExtension[] = "ktmd";
constexpr std::int32_t kNoChunk = -1;
constexpr unsigned char kWriting = 0;
constexpr unsigned char kReading = 1;

/// The sidecar beside `file`; invalid if that would be `file` itself, which must not pass for its own sidecar.
CFileRef sidecarOf(const CFileRef& file, const char* extension)
{
    CFileRef sidecar = file;
    sidecar.ReplaceExtensionBy(extension);
    return sidecar == file ? CFileRef::None : sidecar;
}

/// Invalid without an extension, and if the name is that of the metadata sidecar, which holds all other chunks.
CFileRef rawSidecarOf(const CFileRef& file, const char* extension)
{
    if (extension == nullptr)
        return CFileRef::None;
    CFileRef sidecar = sidecarOf(file, extension);
    return sidecar == sidecarOf(file, kMetadataExtension) ? CFileRef::None : sidecar;
}

/// Whether the sidecar is what an interrupted creation leaves: the start of a container, shorter than its headers.
bool isUnfinished(const CFileRef& sidecar)
{
    CFileIO file;
    std::array<char, ContainerChkExtended::kHeadersSize> start{};
    long length = start.size();
    if (file.OpenRead(sidecar, 0) != kStatusOK || file.GetEOF() >= static_cast<long long>(start.size()))
        return false;
    const std::int32_t status = file.Read(start.data(), &length);
    constexpr std::string_view id = "FORM";
    const auto compared = std::min(static_cast<std::size_t>(length), id.size());
    return (status == kStatusOK || status == kStatusEndOfFile) &&
           std::string_view(start.data(), compared) == id.substr(0, compared);
}

bool isTaggedLoop(const AudioFileInfo& info)
{
    return info.loopCount >= 1 && info.loopValue > 0;
}

/// Kept: only "no container" counts as a failure.
std::int32_t statusOfAdding(std::int32_t added, std::int32_t otherwise)
{
    return added == 0 ? kStatusIOError : otherwise;
}

/// Kept: the status is that of creating the file alone.
std::int32_t writeRawSidecar(const CFileRef& sidecar, const char* data, long size)
{
    const std::int32_t created = CFileUtilCreate(sidecar, 0, 0, 0644);
    CFileIO out;
    if (created == kStatusOK && out.OpenReadWrite(sidecar, 0) == kStatusOK)
        out.Write(data, 0, size);
    return created;
}

std::int32_t openMetadataSidecar(CAudioFileIO& out, const CFileRef& sidecar)
{
    constexpr long cacheSize = 100; // KiB
    if (sidecar.IsFile() && !isUnfinished(sidecar))
        return out.Open(sidecar, kFileIOReadWrite);
    return out.CreateAndOpenCommon(sidecar, cacheSize, kAudioBusMono, 0, 16, 44100, kAIFF, true);
}

/// Reads the whole content; false if there is none.
bool readMetadataSidecar(const CFileRef& sidecar, CChunkData& chunk, ChunkTransform transform)
{
    CFileIO in;
    void* block = nullptr;
    long size = 0;
    if (in.OpenRead(sidecar, 0) != kStatusOK || in.Read(&block, &size) != kStatusOK || block == nullptr)
        return false;
    const std::unique_ptr<void, decltype(&std::free)> owner(block, &std::free);
    transform(block, size, kReading);
    chunk.data = std::make_unique<char[]>(static_cast<std::size_t>(size));
    std::copy_n(static_cast<const char*>(block), size, chunk.data.get());
    chunk.size = size;
    return true;
}

std::int32_t readFrom(CAudioFileIO& in, CChunkData& chunk, ChunkTransform transform)
{
    constexpr std::int32_t found = 1;
    if (in.FindChunk(chunk.id, chunk) != found)
        return kNoChunk;
    transform(chunk.data.get(), static_cast<long>(chunk.size), kReading);
    return kStatusOK;
}

} // namespace

std::int32_t CFileUtilAddData(const CFileRef& file, const CChunkData& chunk, const char* extension, long flags,
                              ChunkTransform transform)
{
    if (!file.IsFile())
        return kStatusFileNotFound;
    if (chunk.size < 0 || (chunk.data == nullptr && chunk.size > 0))
        return kStatusParameterError;
    const CFileRef rawSidecar = rawSidecarOf(file, extension);
    const bool hadRawSidecar = rawSidecar.IsFile();
    CFileUtilRemoveData(file, chunk, extension);
    CAudioFileIO target(file, kFileIOReadWrite);
    if ((flags & kChunkDataUnlessLoop) != 0 && isTaggedLoop(target.Info()))
        return kStatusOK;

    const long size = static_cast<long>(chunk.bytes().size());
    const auto copy = std::make_unique<char[]>(static_cast<std::size_t>(size));
    std::copy_n(chunk.data.get(), size, copy.get());
    transform(copy.get(), size, kWriting);
    if (target.IsOpen() && target.InfoStatus() == kStatusIOError) // nobody can tell what it is
        return kStatusIOError;
    if (target.TakesChunks()) {
        target.PrepareToAppend(); // Kept: if that refuses, AddChunk does what it can
        return statusOfAdding(target.AddChunk(chunk.id, copy.get(), size, true), kStatusOK);
    }
    target.Close();

    const std::int32_t raw = hadRawSidecar ? writeRawSidecar(rawSidecar, copy.get(), size) : kStatusOK;
    CAudioFileIO metadata;
    const std::int32_t opened = openMetadataSidecar(metadata, sidecarOf(file, kMetadataExtension));
    if (opened != kStatusOK)
        return opened;
    // AddChunk removes first, so it would fail in a way that is not reported.
    if (!metadata.TakesChunks())
        return kStatusIOError;
    return statusOfAdding(metadata.AddChunk(chunk.id, copy.get(), size, true), raw);
}

std::int32_t CFileUtilReadData(const CFileRef& file, CChunkData& chunk, const char* extension, ChunkTransform transform)
{
    if (!file.IsFile())
        return kStatusFileNotFound;
    CAudioFileIO itself(file, 0);
    chunk.data.reset();
    chunk.size = chunk.position = chunk.next = 0;

    if (const CFileRef metadata = sidecarOf(file, kMetadataExtension); metadata.IsFile()) {
        if (CFileUtilFileSize(metadata) == 0)
            CFileUtilDelete(metadata);
        else if (readMetadataSidecar(metadata, chunk, transform))
            return kStatusOK;
    }
    if (const CFileRef sidecar = rawSidecarOf(file, extension); sidecar.IsFile()) {
        CAudioFileIO in(sidecar, 0);
        if (readFrom(in, chunk, transform) == kStatusOK)
            return kStatusOK;
    }
    return itself.TakesChunks() ? readFrom(itself, chunk, transform) : kNoChunk;
}

std::int32_t CFileUtilRemoveData(const CFileRef& file, const CChunkData& chunk, const char* extension)
{
    const CFileRef sidecar = rawSidecarOf(file, extension);
    std::int32_t status = sidecar.IsFile() ? CFileUtilDelete(sidecar) : kStatusOK;
    CAudioFileIO first(file, kFileIOReadWrite);
    if (first.IsOpen())
        first.RemoveChunk(chunk.id);
    // Kept: a second pass, which finds another chunk in a CAF file and none in other files.
    CAudioFileIO second(file, kFileIOReadWrite);
    if (second.TakesChunks())
        status = second.RemoveChunk(chunk.id);
    return status;
}
