#include "SidecarChunks.h"

#include "CommandLine.h"
#include "EditGuards.h"
#include "Failure.h"
#include "InputFile.h"
#include "audiofile/ChunkUtilities.h"
#include "files/CFileUtil.h"

#include <algorithm>

namespace {

constexpr char kMetadataExtension[] = "ktmd";

void asItIs(void*, long, unsigned char)
{
}

CChunkData chunkOf(FourCC id, const Bytes& body = {})
{
    CChunkData chunk;
    chunk.id = id;
    chunk.size = std::ssize(body);
    chunk.data = std::make_unique<char[]>(body.size());
    std::copy_n(reinterpret_cast<const char*>(body.data()), body.size(), chunk.data.get());
    return chunk;
}

/// Empty when the file itself has that name.
CFileRef beside(const std::string& path, const std::string& extension)
{
    const CFileRef file = referenceTo(path);
    CFileRef sidecar = file;
    sidecar.ReplaceExtensionBy(extension);
    return sidecar == file ? CFileRef::None : sidecar;
}

/// The chunk of the id in a container in memory; null when the bytes are none, and an empty one when it is not there.
std::optional<Bytes> chunkIn(BytesView content, FourCC id, bool& isContainer)
{
    CAudioFileIO file;
    const auto block = std::make_shared<KTMem>(content.size());
    std::copy(content.begin(), content.end(), block->data());
    requireOK(file.SetCache(block));
    requireOK(file.Open(CFileRef(), kFileIOMemory));
    isContainer = file.Info().fileType == kCaff || file.IsChunkBased() != 0;
    return isContainer ? file.FindChunk(id) : std::nullopt;
}

std::int64_t countIn(const CFileRef& container, FourCC id)
{
    CAudioFileIO file;
    std::int64_t count = 0;
    if (container.IsFile() && file.Open(container, 0) == kStatusOK)
        file.ForEachChunk([&](const ChunkEntry& chunk) { return count += chunk.id == id, true; });
    return count;
}

void removeFromContainer(const CFileRef& container, FourCC id)
{
    for (std::int64_t left = countIn(container, id), before = left + 1; left > 0 && left < before;) {
        CAudioFileIO file;
        requireOK(file.Open(container, kFileIOReadWrite));
        file.RemoveChunk(id);
        requireOK(file.Close());
        before = std::exchange(left, countIn(container, id));
    }
    if (countIn(container, id) > 0)
        throw Failure("the chunk \"" + fourCCText(id) + "\" cannot be removed from " + std::string(container));
}

} // namespace

void addSidecarOption(CLI::App& verb, std::string& extension)
{
    verb.add_option("--sidecar", extension, "Any kind of file: chunks of what is no container lie beside it")
        ->option_text("EXT")
        ->check(CLI::Validator(
            [](std::string& text) {
                return text.empty() || text.find('/') != text.npos ? "\"" + text + "\" is no extension" : std::string();
            },
            ""));
}

bool keepsItsChunks(const std::string& path)
{
    CAudioFileIO file;
    requireOK(file.Open(referenceTo(path), 0));
    return file.Info().fileType == kCaff || file.IsChunkBased() != 0;
}

SidecarChunk readFromAnywhere(const std::string& path, FourCC id, const std::string& extension)
{
    const std::string missing = "has no chunk \"" + fourCCText(id) + "\", and neither have its sidecars";
    CChunkData chunk = chunkOf(id);
    const CFileRef metadata = beside(path, kMetadataExtension);
    const bool isFromMetadata = metadata.IsFile() && CFileUtilFileSize(metadata) > 0;
    const std::int32_t status = CFileUtilReadData(referenceTo(path), chunk, extension.c_str(), asItIs);
    if (status == -1)
        throw Failure(missing);
    requireOK(status);
    const BytesView body = chunk.bytes();
    if (chunk.position > 0 || !isFromMetadata) {
        const CFileRef raw = beside(path, extension);
        return {Bytes(body.begin(), body.end()), countIn(raw, id) > 0 ? std::string(raw) : path};
    }
    bool isContainer = false;
    std::optional<Bytes> inside = chunkIn(body, id, isContainer);
    if (isContainer && !inside)
        throw Failure(missing);
    return {inside ? std::move(*inside) : Bytes(body.begin(), body.end()), std::string(metadata)};
}

SidecarEdit addAnywhere(SafeEdit& edit, FourCC id, const Bytes& body, const std::string& extension, bool dryRun)
{
    const CChunkData chunk = chunkOf(id, body);
    const CFileRef raw = beside(edit.target(), extension);
    const CFileRef metadata = beside(edit.target(), kMetadataExtension);
    const auto add = [&](const std::string& path, const CFileRef& container) {
        requireOK(CFileUtilAddData(referenceTo(path), chunk, extension.c_str(), 0, asItIs));
        CAudioFileIO file;
        const std::optional<Bytes> found = file.Open(container, 0) == kStatusOK ? file.FindChunk(id) : std::nullopt;
        if (!found || *found != body) // what the library does not tell
            throw Failure("the chunk could not be added");
    };
    if (!keepsItsChunks(edit.target())) {
        if (!dryRun)
            add(edit.target(), metadata);
        return {std::string(metadata), ""};
    }
    SidecarEdit done{edit.target(), ""};
    if (!dryRun) {
        done.backup = edit.apply([&](const std::string& path) { add(path, referenceTo(path)); });
        if (raw.IsFile()) // an older copy; the edit was of the file under another name
            requireOK(CFileUtilDelete(raw));
    }
    return done;
}

SidecarEdit removeEverywhere(SafeEdit& edit, FourCC id, const std::string& extension, bool dryRun, std::int64_t& count)
{
    const CFileRef raw = beside(edit.target(), extension);
    const CFileRef metadata = beside(edit.target(), kMetadataExtension);
    const std::int64_t inFile = countIn(referenceTo(edit.target()), id);
    const std::int64_t inMetadata = countIn(metadata, id);
    count = inFile + inMetadata + (raw.IsFile() ? 1 : 0);
    if (count == 0)
        throw Failure("has no chunk \"" + fourCCText(id) + "\", and neither have its sidecars");
    SidecarEdit done{inFile > 0 ? edit.target() : raw.IsFile() ? std::string(raw) : std::string(metadata), ""};
    if (dryRun)
        return done;
    if (inFile > 0)
        done.backup = edit.apply([&](const std::string& path) {
            requireOK(CFileUtilRemoveData(referenceTo(path), chunkOf(id), extension.c_str()));
            removeFromContainer(referenceTo(path), id); // further ones of a CAF file
        });
    if (raw.IsFile())
        requireOK(CFileUtilDelete(raw));
    removeFromContainer(metadata, id);
    return done;
}
