#include "tool/info/InfoCheck.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/description/FoundProblems.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/DisplayWidth.h"

namespace {

class CheckWriter : DataRecords {
public:
    explicit CheckWriter(const OutputOptions& options) : DataRecords(options, kColumns), form_(outputForm(options)) {}

    void add(const std::string& path, const std::vector<FoundProblem>& problems)
    {
        isGood_ = isGood_ && problems.empty();
        if (form_ == Form::json)
            addRecord(path, problems);
        else if (form_ == Form::csv)
            addRows(path, problems);
        else if (form_ != Form::none)
            for (const FoundProblem& problem : problems)
                addLine(fmt::format("{}: {}{}; {}", printable(path), placeText(problem), problem.text, problem.effect));
    }
    using DataRecords::addFailure;
    using DataRecords::finish;
    bool isGood() const { return isGood_; }

private:
    static std::string placeText(const FoundProblem& problem)
    {
        if (problem.chunk == 0)
            return {};
        return fmt::format("{}: \"{}\" ", problem.offset, printable(fourCCText(problem.chunk)));
    }
    void addRecord(const std::string& path, const std::vector<FoundProblem>& problems)
    {
        JsonWriter& json = jsonRecords().begin();
        json.beginObject().member("path", path);
        json.key("findings").beginArray();
        for (const FoundProblem& problem : problems) {
            recordOf(problem, {}).write(json.beginObject());
            json.endObject();
        }
        json.endArray().endObject();
        jsonRecords().end();
    }
    /// One row per finding; a file without findings has a row with its path alone.
    void addRows(const std::string& path, const std::vector<FoundProblem>& problems)
    {
        const Record file = Record().member("path", path);
        if (problems.empty())
            csvRecords().add(file);
        for (const FoundProblem& problem : problems)
            csvRecords().add(recordOf(problem, file));
    }
    static Record recordOf(const FoundProblem& problem, Record record)
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
    const bool wereRead = writeFileByFile(writer, files, loop, [&](const FoundFile& file) {
        const FileAccess access = accessForReading(file.path, {.quiet = options.quiet});
        return problemsOf(file.path, {.comparesDigests = true, .showsProgress = !options.quiet});
    });
    return wereRead && writer.isGood();
}
