#include "audiofile/ContainerChanges.h"

#include "audiofile/SoundProblem.h"

#include <cerrno>

using Kind = ContainerProblem::Kind;

namespace {

ContainerProblem survey(const CFileRef& container, FourCC id, ChunkSurvey& found)
{
    CAudioFileIO file;
    if (ContainerProblem problem = OpenContainer(file, container, 0))
        return problem;
    return SurveyChunks(file, id, found);
}

// Repairs the container's end where that is possible; force overrules what cannot be repaired.
ContainerProblem openToAppend(CAudioFileIO& file, const CFileRef& container, bool isForced)
{
    if (ContainerProblem problem = OpenContainer(file, container, kFileIOReadWrite))
        return problem;
    const std::int32_t status = file.PrepareToAppend();
    return ContainerProblem::ofStatus(status == kStatusParameterError && isForced ? kStatusOK : status);
}

} // namespace

ContainerProblem OpenContainer(CAudioFileIO& file, const CFileRef& ref, unsigned int mode)
{
    if (const std::int32_t status = file.OpenForChunks(ref, mode); status != kStatusOK)
        return ContainerProblem::ofStatus(status);
    if (file.GetEOF() == 0)
        return {Kind::empty};
    if (!file.TakesChunks() && file.InfoStatus() == kStatusEndOfFile)
        return SoundProblem(file);
    if (!file.TakesChunks())
        return {file.HasChunks() ? Kind::onlyRead : Kind::noContainer};
    return {};
}

ContainerProblem RemoveChunksFrom(const CFileRef& container, FourCC id, std::int64_t count)
{
    ChunkSurvey left;
    if (ContainerProblem problem = survey(container, id, left))
        return problem;
    if (left.count != count)
        return {Kind::chunks};
    while (count > 0) {
        CAudioFileIO file;
        if (ContainerProblem problem = OpenContainer(file, container, kFileIOReadWrite))
            return problem;
        if (ContainerProblem problem = ContainerProblem::ofStatus(file.RemoveAllChunks(id)))
            return problem;
        if (ContainerProblem problem = ContainerProblem::ofStatus(file.Close()))
            return problem;
        if (ContainerProblem problem = survey(container, id, left))
            return problem;
        if (left.count >= count)
            return {.kind = Kind::notRemoved, .id = id};
        count = left.count;
    }
    return {};
}

ContainerProblem AddChunkTo(const CFileRef& container, const NewChunk& chunk)
{
    CAudioFileIO file;
    ChunkSurvey before, after;
    if (ContainerProblem problem = openToAppend(file, container, chunk.isForced))
        return problem;
    // Done here because AddChunk removes only the first of several from a CAF file.
    if (chunk.replaces) {
        if (ContainerProblem problem = ContainerProblem::ofStatus(file.Close()))
            return problem;
        if (ContainerProblem problem = survey(container, chunk.id, before))
            return problem;
        if (ContainerProblem problem = RemoveChunksFrom(container, chunk.id, before.count))
            return problem;
        if (ContainerProblem problem = openToAppend(file, container, chunk.isForced))
            return problem;
    }
    if (ContainerProblem problem = SurveyChunks(file, chunk.id, before))
        return problem;
    const std::int64_t length = file.GetEOF();
    errno = 0;
    if (const std::int32_t status = file.AddChunk(chunk.id, chunk.body, false); status != 1)
        return {Kind::adding, status, errno};
    if (ContainerProblem problem = ContainerProblem::ofStatus(file.Close()))
        return problem;
    if (ContainerProblem problem = survey(container, chunk.id, after))
        return problem;
    if (after.count != (chunk.replaces ? 1 : before.count + 1) || after.last->id != chunk.id ||
        after.last->size != std::ssize(chunk.body))
        return {Kind::notFound};
    if (after.last->offset < length && !chunk.isForced)
        return {Kind::misplaced};
    return {};
}

ContainerProblem SettleContainerEnd(const CFileRef& container)
{
    CAudioFileIO file;
    if (ContainerProblem problem = openToAppend(file, container, false))
        return problem;
    return ContainerProblem::ofStatus(file.Close());
}
