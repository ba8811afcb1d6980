#include "audiofile/ChunkSurvey.h"

#include "media/containers/ContainerTraits.h"

#include <algorithm>

namespace {

// Whether the chunk holds the sound or is needed to find it. A container has one of each such chunk.
bool isStructural(const ContainerExtent& extent, FourCC id)
{
    return platform::roleOfChunk(extent.kind, id) == platform::ChunkRole::essential;
}

} // namespace

ContainerProblem SurveyChunks(CAudioFileIO& file, FourCC id, ChunkSurvey& survey)
{
    survey = {};
    const auto visit = [&](const ChunkEntry& chunk) {
        survey.last = chunk;
        if (chunk.id != id)
            return true;
        ++survey.count;
        survey.total += std::max<std::int64_t>(chunk.size, 0);
        // In a CAF file an empty chunk is found only if there is no other.
        if (survey.extent.id != kCaff || !survey.found || survey.found->size == 0)
            survey.found = chunk;
        return true;
    };
    return ContainerProblem::ofStatus(file.ForEachChunk(visit, &survey.extent), ContainerProblem::Kind::chunks);
}

ContainerProblem ObjectToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id, ChunkObjection& objection)
{
    objection = {};
    if (survey.count > 0 && isStructural(survey.extent, id)) {
        objection.kind = ChunkObjection::Kind::oneOnly;
        return {};
    }
    const std::int32_t status = ExamineContainerTail(file, objection.tail);
    if (status == kStatusOK && objection.tail.fault != ContainerTail::Fault::none)
        objection.kind = ChunkObjection::Kind::tail;
    return ContainerProblem::ofStatus(status, ContainerProblem::Kind::chunks);
}

ChunkObjection ObjectionToRemoving(const ChunkSurvey& survey, FourCC id)
{
    const bool isLost = survey.count > 0 && isStructural(survey.extent, id);
    return {isLost ? ChunkObjection::Kind::soundLost : ChunkObjection::Kind::none, {}};
}
