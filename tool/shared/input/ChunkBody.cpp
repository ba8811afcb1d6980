#include "tool/shared/input/ChunkBody.h"

#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>

ChunkBody requireChunk(CAudioFileIO& file, FourCC id)
{
    const ChunkSurvey survey = surveyChunks(file, id);
    if (!survey.found)
        throw Failure("has no chunk \"" + fourCCText(id) + "\"");
    const std::int64_t offset = survey.found->body;
    const std::int64_t size = survey.found->size;
    const std::int64_t there = std::max<std::int64_t>(survey.extent.fileLength - offset, 0);
    if (size < 0 || size > there)
        throw Failure(fmt::format("its chunk \"{}\" claims {} bytes, but {} are there", fourCCText(id), size, there));
    return {survey.found->offset, offset, size};
}
