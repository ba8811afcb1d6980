#include "tool/shared/edits/EditGuards.h"

#include "audiofile/ContainerTail.h"
#include "media/containers/ChunkRole.h"
#include "tool/shared/input/ChunkBody.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>

namespace {

// Whether it makes up the sound, or the way to it. A container has one of each.
bool isStructural(FourCC container, FourCC id)
{
    using Kind = platform::ContainerKind;
    const Kind kind = container == kFORM   ? Kind::iff
                      : container == kCaff ? Kind::caf
                      : container == kCAT  ? Kind::rex2
                                           : Kind::riff;
    return platform::roleOfChunk(kind, id) == platform::ChunkRole::essential;
}

// What the library finds to be at fault, in words.
std::optional<std::string> textOf(const ContainerTail& tail)
{
    using Fault = ContainerTail::Fault;
    const bool isCAF = tail.extent.id == kCaff;
    switch (tail.fault) {
    case Fault::none:
        return std::nullopt;
    case Fault::noChunk:
        return isCAF ? "it holds no chunk that can be read"
                     : fmt::format("its container ends at byte {} and holds no chunk, but {} bytes are there (an "
                                   "unfinished recording?), and the new chunk would be written over some of them",
                                   tail.extent.end, tail.extent.fileLength);
    case Fault::cutShort:
        return fmt::format(
            "its last chunk, \"{}\", claims more bytes than the file has, and the new chunk would become "
            "part of it",
            fourCCText(tail.last.id));
    case Fault::noId:
        return fmt::format("what stands at byte {} is no chunk, and 8 bytes of it would be written over",
                           tail.last.offset);
    case Fault::stray:
        break;
    }
    return isCAF ? fmt::format("{} stray bytes follow its last chunk, and a chunk behind them would not be found",
                               tail.stray)
                 : fmt::format("its container ends at byte {}, but {} bytes follow its chunks (an unfinished "
                               "recording?), and the new chunk would be written over them or hide them",
                               tail.extent.end, tail.stray);
}

} // namespace

ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id)
{
    ChunkSurvey survey;
    const std::int32_t status = file.ForEachChunk(
        [&](const ChunkEntry& chunk) {
            survey.last = chunk;
            if (chunk.id != id)
                return true;
            ++survey.count;
            survey.total += std::max<std::int64_t>(chunk.size, 0);
            // An empty chunk of a CAF file is found only when there is no other.
            if (survey.extent.id != kCaff || !survey.found || survey.found->size == 0)
                survey.found = chunk;
            return true;
        },
        &survey.extent);
    if (status != kStatusOK)
        throw Failure("its chunks cannot be read");
    return survey;
}

std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id)
{
    if (survey.count > 0 && isStructural(survey.extent.id, id))
        return fmt::format("it has a chunk \"{}\", which describes or holds its sound, and has room for one only",
                           fourCCText(id));
    ContainerTail tail;
    if (ExamineContainerTail(file, tail) != kStatusOK)
        throw Failure("its chunks cannot be read");
    return textOf(tail);
}

std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id)
{
    if (survey.count > 0 && isStructural(survey.extent.id, id))
        return fmt::format("the chunk \"{}\" describes or holds its sound, which would be lost", fourCCText(id));
    return std::nullopt;
}
