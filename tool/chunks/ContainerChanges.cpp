#include "tool/chunks/ContainerChanges.h"

#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <cerrno>

namespace {

std::string addStatusText(std::int32_t status)
{
    switch (status) {
    case 0:
        return "the file is not chunk-based";
    case -2:
        return "its container header cannot be read";
    case -3:
        return "the new chunk's header cannot be written";
    case -4:
        return "the new chunk's body cannot be written";
    case -5:
        return "its container header cannot be written";
    case -6:
        return "is not open for writing";
    case -7:
        return "the chunk to replace cannot be removed";
    case -8:
        return "its chunks cannot be walked";
    case -9:
        return "the chunk is too large for the container";
    case kStatusEndOfFile:
        return "its container has a negative size";
    default:
        return StatusText(status);
    }
}

// The container's codes say which step failed; the system's last error often says why.
[[noreturn]] void failToAdd(std::int32_t status, int systemError)
{
    const bool writing = status <= -3 && status >= -5;
    throw Failure(addStatusText(status) + (writing && systemError != 0 ? ": " + systemErrorText(systemError) : ""));
}

// Puts right at the end of the container what can be; what cannot be, --force overrules.
void prepareToAppend(CAudioFileIO& file, bool isForced)
{
    const std::int32_t status = file.PrepareToAppend();
    if (status != kStatusParameterError || !isForced)
        requireOK(status);
}

} // namespace

ChunkSurvey surveyOf(const std::string& path, FourCC id)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    return surveyChunks(file, id);
}

void removeChunksFrom(const std::string& path, FourCC id, std::int64_t count)
{
    // The library removes one chunk at a time from a CAF file, and all at once from others.
    std::int64_t left = surveyOf(path, id).count;
    if (left != count)
        throw Failure("its chunks cannot be read");
    while (left > 0) {
        CAudioFileIO file;
        openContainer(file, path, kFileIOReadWrite);
        requireOK(file.RemoveChunk(id));
        requireOK(file.Close());
        const std::int64_t now = surveyOf(path, id).count;
        if (now >= left)
            throw Failure("the chunk \"" + fourCCText(id) + "\" cannot be removed: its body cannot be read");
        left = now;
    }
}

void addChunkTo(const std::string& path, const NewChunk& chunk)
{
    CAudioFileIO file;
    openContainer(file, path, kFileIOReadWrite);
    prepareToAppend(file, chunk.isForced);
    if (chunk.replaces) { // not left to AddChunk, which removes only the first of them from a CAF file
        requireOK(file.Close());
        removeChunksFrom(path, chunk.id, surveyOf(path, chunk.id).count);
        openContainer(file, path, kFileIOReadWrite);
        prepareToAppend(file, chunk.isForced);
    }
    const std::int64_t before = surveyChunks(file, chunk.id).count;
    const std::int64_t length = file.GetEOF();
    errno = 0;
    const std::int32_t status = file.AddChunk(chunk.id, chunk.body, false);
    if (status != 1)
        failToAdd(status, errno);
    requireOK(file.Close());
    const ChunkSurvey after = surveyOf(path, chunk.id);
    if (after.count != (chunk.replaces ? 1 : before + 1) || after.last->id != chunk.id ||
        after.last->size != std::ssize(chunk.body))
        throw Failure("the chunk is not found as it should be after the edit");
    if (after.last->offset < length && !chunk.isForced)
        throw Failure("the chunk was not put behind all that is there");
}
