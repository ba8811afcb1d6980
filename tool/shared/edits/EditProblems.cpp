#include "tool/shared/edits/EditProblems.h"

#include "audiofile/SoundProblem.h"
#include "platform/SystemCalls.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <filesystem>

namespace {

// With what the command can do about it.
std::string sentenceOn(const FileProblem& problem)
{
    using Kind = FileProblem::Kind;
    switch (problem.kind) {
    case Kind::owner:
    case Kind::attribute:
    case Kind::hardLinks:
        return problem.Description() + "; --in-place edits the file itself";
    case Kind::sameAsBackup:
        return problem.Description() + "; an edit without --in-place keeps it as it is";
    default:
        return problem.Description();
    }
}

std::string sentenceOn(const ContainerTail& tail)
{
    using Fault = ContainerTail::Fault;
    const bool isCAF = tail.extent.id == kCaff;
    switch (tail.fault) {
    case Fault::none:
        return "";
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

std::optional<std::string> sentenceOn(const ChunkObjection& objection, FourCC id)
{
    using Kind = ChunkObjection::Kind;
    switch (objection.kind) {
    case Kind::none:
        break;
    case Kind::oneOnly:
        return fmt::format("it has a chunk \"{}\", which describes or holds its sound, and has room for one only",
                           fourCCText(id));
    case Kind::soundLost:
        return fmt::format("the chunk \"{}\" describes or holds its sound, which would be lost", fourCCText(id));
    case Kind::tail:
        return sentenceOn(objection.tail);
    }
    return std::nullopt;
}

} // namespace

void requireNone(const FileProblem& problem)
{
    if (problem)
        throw Failure(sentenceOn(problem));
}

void requireNone(const ContainerProblem& problem)
{
    using Kind = ContainerProblem::Kind;
    if (problem.kind == Kind::empty || problem.kind == Kind::unknown)
        throw OtherKind(problem.Description(), OtherKind::Kind::unknown);
    if (problem)
        throw Failure(problem.Description());
}

ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id)
{
    ChunkSurvey survey;
    const ContainerProblem problem = SurveyChunks(file, id, survey);
    if (problem.kind == ContainerProblem::Kind::chunks)
        requireNone(SoundProblem(file)); // knows best what is wrong with it
    requireNone(problem);
    return survey;
}

ChunkSurvey surveyOf(const std::string& path, FourCC id)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    return surveyChunks(file, id);
}

std::optional<std::string> objectionToAdding(CAudioFileIO& file, const ChunkSurvey& survey, FourCC id)
{
    ChunkObjection objection;
    requireNone(ObjectToAdding(file, survey, id, objection));
    return sentenceOn(objection, id);
}

std::optional<std::string> objectionToRemoving(const ChunkSurvey& survey, FourCC id)
{
    return sentenceOn(ObjectionToRemoving(survey, id), id);
}

void synchronize(int descriptor)
{
    if (platform::systemCalls().fsync(descriptor) != 0)
        throw Failure(SystemErrorText(errno));
}

void synchronizeFolderOf(const std::string& path)
{
    const std::filesystem::path folder = std::filesystem::path(path).parent_path();
    if (platform::systemCalls().syncFolder(folder.empty() ? "." : folder.c_str()) != 0)
        throw Failure(SystemErrorText(errno));
}
