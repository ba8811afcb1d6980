#include "tool/info/InfoCheck.h"

#include "audiofile/AudioFileCheck.h"
#include "tool/info/FileDescription.h"
#include "tool/info/FindingWords.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/JsonRecords.h"

#include <optional>

namespace {

/// One thing that is off.
struct Problem {
    FindingWords words;
    std::optional<platform::ContainerFinding> place; // none of files without chunks
};

/// Of what is compressed throughout only the length can be told.
std::vector<Problem> problemsOfSound(const std::string& path, bool quiet)
{
    const AudioFileInfo info = describeFile(path, quiet);
    if (info.IsWhole())
        return {};
    const std::int64_t promised = promisedFrames(info);
    const std::string text = promised > 0 ? fmt::format("promises {} frames, {} are there", promised, info.frames)
                                          : fmt::format("lacks {} bytes of sound", info.missingDataSize);
    return {{{"soundIsCut", text, "readers take what is there"}, std::nullopt}};
}

/// Throws Failure.
std::vector<Problem> problemsOf(const std::string& path, bool quiet)
{
    std::vector<platform::ContainerFinding> findings;
    std::int32_t status = 0;
    {
        const FileAccess access = accessForReading(path, {.quiet = quiet});
        CFileIO file;
        requireOK(file.OpenRead(referenceTo(path), 0));
        status = CheckAudioFile(file, findings);
    }
    if (status == kStatusParameterError || status == kStatusEndOfFile)
        return problemsOfSound(path, quiet);
    requireOK(status);
    std::vector<Problem> problems;
    for (const platform::ContainerFinding& finding : findings)
        problems.push_back({wordsOf(finding), finding});
    return problems;
}

class CheckWriter {
public:
    explicit CheckWriter(const OutputOptions& options) : form_(outputForm(options)), json_(options) {}

    void add(const std::string& path, const std::vector<Problem>& problems)
    {
        isGood_ = isGood_ && problems.empty();
        if (form_ == Form::json)
            addRecord(path, problems);
        else if (form_ != Form::none)
            for (const Problem& problem : problems)
                output_.print("{}: {}{}; {}\n", printable(path), placeText(problem), problem.words.text,
                              problem.words.effect);
    }
    void addFailure(const std::string& path, const std::string& text) { json_.addFailure(path, text); }
    void finish() { json_.finish(); }
    bool isGood() const { return isGood_; }

private:
    static std::string placeText(const Problem& problem)
    {
        if (!problem.place)
            return {};
        return fmt::format("{}: \"{}\" ", problem.place->offset, printable(fourCCText(problem.place->chunk)));
    }
    void addRecord(const std::string& path, const std::vector<Problem>& problems)
    {
        JsonWriter& json = json_.begin();
        json.beginObject().member("path", path);
        json.key("findings").beginArray();
        for (const Problem& problem : problems) {
            json.beginObject().member("kind", problem.words.name);
            if (problem.place)
                json.member("id", fourCCText(problem.place->chunk)).member("offset", problem.place->offset);
            json.member("text", problem.words.text).member("effect", problem.words.effect).endObject();
        }
        json.endArray().endObject();
        json_.end();
    }

    Form form_;
    bool isGood_ = true;
    Output& output_ = Output::standard();
    JsonRecords json_;
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
