#include "tool/shared/description/FoundProblems.h"

#include "audiofile/AudioFileCheck.h"
#include "tool/shared/description/AdmFindings.h"
#include "tool/shared/description/FileDescription.h"
#include "tool/shared/description/FindingWords.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Progress.h"

#include <fmt/format.h>

namespace {

/// Chunks that are cut short are reported by their sizes.
AdmChunks wholeAdmChunks(CAudioFileIO& file)
{
    AdmChunks chunks;
    ContainerExtent extent;
    const auto visit = [&](const ChunkEntry& chunk) {
        const bool isWhole = chunk.size >= 0 && chunk.size <= extent.fileLength - chunk.body;
        if (isWhole && chunk.id == fourCC("axml"))
            chunks.document = chunk;
        else if (isWhole && chunk.id == fourCC("chna"))
            chunks.tracks = chunk;
        return true;
    };
    requireOK(file.ForEachChunk(visit, &extent));
    return chunks;
}

std::int32_t compareDigest(CAudioFileIO& file, const std::string& path, bool showsProgress,
                           std::vector<platform::ContainerFinding>& findings)
{
    Progress progress("checking", file.Info().dataSize, !showsProgress, path);
    return CheckStatedDigest(file, findings, [&] {
        progress.advance(1 << 20); // called before each MiB
        return true;
    });
}

} // namespace

std::optional<std::vector<FoundProblem>> problemsOfContainer(CAudioFileIO& file, const std::string& path,
                                                             const ProblemChecks& checks)
{
    std::vector<platform::ContainerFinding> findings;
    std::int32_t status = CheckAudioFile(file, findings);
    if (status == kStatusOK && checks.comparesDigests)
        status = compareDigest(file, path, checks.showsProgress, findings);
    if (status == kStatusParameterError || status == kStatusEndOfFile)
        return std::nullopt;
    requireOK(status);
    std::vector<FoundProblem> problems;
    for (const platform::ContainerFinding& finding : findings) {
        const FindingWords words = wordsOf(finding);
        problems.push_back({words.name, words.text, words.effect, finding.chunk, finding.offset});
    }
    const AdmChunks chunks = file.HasChunks() ? wholeAdmChunks(file) : AdmChunks();
    if (chunks.document || chunks.tracks)
        for (const AdmFinding& finding : admFindings(path, chunks))
            problems.push_back({finding.name, finding.text, finding.effect, finding.chunk,
                                static_cast<std::uint64_t>(finding.offset)});
    return problems;
}

std::vector<FoundProblem> problemsOfLength(const AudioFileInfo& info)
{
    if (info.IsWhole())
        return {};
    const std::int64_t promised = promisedFrames(info);
    const std::string text = promised > 0 ? fmt::format("promises {} frames, {} are there", promised, info.frames)
                                          : fmt::format("lacks {} bytes of sound", info.missingDataSize);
    return {{"soundIsCut", text, "readers take what is there"}};
}

std::vector<FoundProblem> problemsOf(const std::string& path, const ProblemChecks& checks)
{
    {
        CAudioFileIO file;
        requireOK(file.OpenForChunks(referenceTo(path), 0));
        if (auto problems = problemsOfContainer(file, path, checks))
            return std::move(*problems);
    }
    return problemsOfLength(describeSound(path));
}
