#include "tool/shared/edits/EditProblems.h"

#include "audiofile/SoundProblem.h"
#include "platform/SystemCalls.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <filesystem>

namespace {

std::string sentenceOn(const FileProblem& problem)
{
    using Kind = FileProblem::Kind;
    const std::string why = systemErrorText(problem.systemError);
    switch (problem.kind) {
    case Kind::none:
        break;
    case Kind::system:
        return problem.systemError == ENXIO ? "not a regular file" : why;
    case Kind::folder:
        return "its folder: " + why;
    case Kind::creation:
        return "no file can be made in its folder: " + why;
    case Kind::noFreeName:
        return "no temporary file can be made in its folder";
    case Kind::givenAway:
        return "its temporary file was moved by another program; nothing was done";
    case Kind::shortened:
        return "became shorter while it was copied";
    case Kind::owner:
        return fmt::format("its owner cannot be kept: {}; --in-place edits the file itself", why);
    case Kind::attribute:
        return fmt::format("its extended attribute {} cannot be kept: {}; --in-place edits the file itself",
                           problem.name, why);
    case Kind::hardLinks:
        return fmt::format("has {} names (hard links), and the others would keep the old content; --in-place edits the "
                           "file itself",
                           problem.count);
    case Kind::sameAsBackup:
        return problem.name + " is the same file still, left so by an edit that was cut short, and would change with "
                              "it; an edit without --in-place keeps it as it is";
    case Kind::backups:
        return "has too many backups";
    case Kind::uncommittedBackup:
        return "its backup cannot be committed to storage: " + why;
    case Kind::changed:
        return "was changed by another program meanwhile; nothing was done";
    case Kind::refused:
        return StatusText(problem.status);
    case Kind::uncommitted:
        return "is edited, but a loss of power now may undo that: its folder cannot be committed to storage: " + why;
    }
    return "";
}

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

std::string shortText(FourCC id)
{
    std::string text = fourCCText(id);
    text.erase(text.find_last_not_of(' ') + 1);
    return text;
}

std::string sentenceOn(const ContainerProblem& problem)
{
    using Kind = ContainerProblem::Kind;
    switch (problem.kind) {
    case Kind::none:
        break;
    case Kind::status:
        return StatusText(problem.status);
    case Kind::empty:
        return "is empty";
    case Kind::noContainer:
        return "no container known here (RIFF, RF64, BW64, AIFF, AIFC, REX2, CAF)";
    case Kind::unknown:
        return "no audio that can be decoded";
    case Kind::headerCut:
        return "ends within its header";
    case Kind::noFormat:
        return fmt::format("says nowhere what its samples are (no {} chunk)", shortText(problem.id));
    case Kind::noSound:
        return problem.id == 0 ? "no sound" : fmt::format("no sound (no {} chunk)", shortText(problem.id));
    case Kind::noIndex:
        return fmt::format("says nowhere where its samples are (no {} box)", shortText(problem.id));
    case Kind::onlyRead:
        return "containers of its kind are only read (RIFX, Wave64)";
    case Kind::chunks:
        return "its chunks cannot be read";
    case Kind::reading:
        return "cannot be read to compare it: " + systemErrorText(problem.systemError);
    case Kind::adding: {
        // The container's codes say which step failed; the system's last error often says why.
        const bool isWriting = problem.status <= -3 && problem.status >= -5;
        return addStatusText(problem.status) +
               (isWriting && problem.systemError != 0 ? ": " + systemErrorText(problem.systemError) : "");
    }
    case Kind::notRemoved:
        return fmt::format("the chunk \"{}\" cannot be removed: its body cannot be read", fourCCText(problem.id));
    case Kind::notFound:
        return "the chunk is not found as it should be after the edit";
    case Kind::misplaced:
        return "the chunk was not put behind all that is there";
    case Kind::cutShort:
        return "its last chunk is not whole";
    case Kind::changed:
        return fmt::format("the chunk \"{}\" is not as it was", fourCCText(problem.id));
    case Kind::tailChanged:
        return "what stands behind its chunks is not as it was";
    }
    return "";
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
        throw OtherKind(sentenceOn(problem), OtherKind::Kind::unknown);
    if (problem)
        throw Failure(sentenceOn(problem));
}

ChunkSurvey surveyChunks(CAudioFileIO& file, FourCC id)
{
    ChunkSurvey survey;
    const ContainerProblem problem = SurveyChunks(file, id, survey);
    if (problem.kind == ContainerProblem::Kind::chunks)
        requireNone(SoundProblem(file)); // says best what is wrong with it
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
        throw Failure(systemErrorText(errno));
}

void synchronizeFolderOf(const std::string& path)
{
    const std::filesystem::path folder = std::filesystem::path(path).parent_path();
    if (platform::systemCalls().syncFolder(folder.empty() ? "." : folder.c_str()) != 0)
        throw Failure(systemErrorText(errno));
}
