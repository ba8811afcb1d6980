#include "tool/info/InfoCheck.h"

#include "audiofile/AudioFileCheck.h"
#include "tool/info/AdmFindings.h"
#include "tool/info/FileDescription.h"
#include "tool/info/FindingWords.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Progress.h"

namespace {

/// One problem.
struct Problem {
    const char* name; // as in JSON
    std::string text, effect;
    FourCC chunk = 0; // 0 in files without chunks
    std::uint64_t offset = 0;
};

/// For compressed files only the length can be checked.
std::vector<Problem> problemsOfSound(const std::string& path, bool quiet)
{
    const AudioFileInfo info = describeFile(path, quiet);
    if (info.IsWhole())
        return {};
    const std::int64_t promised = promisedFrames(info);
    const std::string text = promised > 0 ? fmt::format("promises {} frames, {} are there", promised, info.frames)
                                          : fmt::format("lacks {} bytes of sound", info.missingDataSize);
    return {{"soundIsCut", text, "readers take what is there"}};
}

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

/// Throws Failure.
std::vector<Problem> problemsOf(const std::string& path, bool quiet)
{
    std::vector<platform::ContainerFinding> findings;
    std::vector<Problem> problems;
    {
        const FileAccess access = accessForReading(path, {.quiet = quiet});
        CAudioFileIO file;
        requireOK(file.OpenForChunks(referenceTo(path), 0));
        std::int32_t status = CheckAudioFile(file, findings);
        Progress progress("checking", file.Info().dataSize, quiet, path);
        if (status == kStatusOK)
            status = CheckStatedDigest(file, findings, [&] {
                progress.advance(1 << 20); // called before each MiB
                return true;
            });
        for (const platform::ContainerFinding& finding : findings) {
            const FindingWords words = wordsOf(finding);
            problems.push_back({words.name, words.text, words.effect, finding.chunk, finding.offset});
        }
        if (status == kStatusOK) {
            const AdmChunks chunks = file.HasChunks() ? wholeAdmChunks(file) : AdmChunks();
            if (chunks.document || chunks.tracks)
                for (const AdmFinding& finding : admFindings(path, chunks))
                    problems.push_back({finding.name, finding.text, finding.effect, finding.chunk,
                                        static_cast<std::uint64_t>(finding.offset)});
            return problems;
        }
        if (status != kStatusParameterError && status != kStatusEndOfFile)
            requireOK(status);
    }
    return problemsOfSound(path, quiet);
}

class CheckWriter : DataRecords {
public:
    explicit CheckWriter(const OutputOptions& options) : DataRecords(options, kColumns), form_(outputForm(options)) {}

    void add(const std::string& path, const std::vector<Problem>& problems)
    {
        isGood_ = isGood_ && problems.empty();
        if (form_ == Form::json)
            addRecord(path, problems);
        else if (form_ == Form::csv)
            addRows(path, problems);
        else if (form_ != Form::none)
            for (const Problem& problem : problems)
                addLine(fmt::format("{}: {}{}; {}", printable(path), placeText(problem), problem.text, problem.effect));
    }
    using DataRecords::addFailure;
    using DataRecords::finish;
    bool isGood() const { return isGood_; }

private:
    static std::string placeText(const Problem& problem)
    {
        if (problem.chunk == 0)
            return {};
        return fmt::format("{}: \"{}\" ", problem.offset, printable(fourCCText(problem.chunk)));
    }
    void addRecord(const std::string& path, const std::vector<Problem>& problems)
    {
        JsonWriter& json = jsonRecords().begin();
        json.beginObject().member("path", path);
        json.key("findings").beginArray();
        for (const Problem& problem : problems) {
            recordOf(problem, {}).write(json.beginObject());
            json.endObject();
        }
        json.endArray().endObject();
        jsonRecords().end();
    }
    /// One row per finding; a file without findings has a row with its path alone.
    void addRows(const std::string& path, const std::vector<Problem>& problems)
    {
        const Record file = Record().member("path", path);
        if (problems.empty())
            csvRecords().add(file);
        for (const Problem& problem : problems)
            csvRecords().add(recordOf(problem, file));
    }
    static Record recordOf(const Problem& problem, Record record)
    {
        record.member("kind", problem.name);
        if (problem.chunk != 0)
            record.member("id", fourCCText(problem.chunk)).member("offset", problem.offset);
        return record.member("text", problem.text).member("effect", problem.effect);
    }
    void addLine(const std::string& line)
    {
        const std::optional<int> columns = columnsOfOutput();
        output_.print("{}\n", columns ? wrapped(line, *columns, 0, 4) : line);
    }

    static constexpr const char* kColumns[] = {"path", "kind", "id", "offset", "text", "effect", "error"};

    Form form_;
    bool isGood_ = true;
    Output& output_ = Output::standard();
};

} // namespace

bool checkFiles(const FileArguments& files, unsigned threads, const OutputOptions& options)
{
    CheckWriter writer(options);
    const FileLoop loop{.threads = threads, .doing = "checking", .quiet = options.quiet};
    const bool wereRead = writeFileByFile(writer, files, loop,
                                          [&](const FoundFile& file) { return problemsOf(file.path, options.quiet); });
    return wereRead && writer.isGood();
}
