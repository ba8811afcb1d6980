// ktfiles index merge: brings several indexes, or their records as JSON Lines, into one.
#include "tool/index/IndexObjects.h"
#include "tool/index/InputLines.h"
#include "tool/index/LibraryMerge.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/Library.h"
#include "tool/shared/library/LibraryRecordJson.h"
#include "tool/shared/library/SQLFailure.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr std::string_view kDatabaseBeginning("SQLite format 3\0", 16);

// 64 MiB of changed pages wait in the log: rows come quicker than from files, and each one changes pages all over the
// indexes, so that the usual 4 MiB would be committed to the disk with every transaction.
constexpr const char* kCheckpoints = "PRAGMA wal_autocheckpoint = 16384";

struct MergeArguments {
    std::vector<std::string> sources;
    std::string database;
};

/// What the words of a folder are: its path from the name of the outermost root on. Of a folder in no root, its name.
class FolderWords {
public:
    explicit FolderWords(Library& target)
    {
        for (SQLStatement roots(target.database(), "SELECT path FROM roots"); roots.step();)
            roots_.push_back(nameOfIndexed(roots.bytes(0)));
    }
    void add(const std::string& root)
    {
        roots_.push_back(root);
        folder_.clear();
    }
    const std::string& of(const std::string& folder)
    {
        if (folder == folder_) // mostly files of one folder come together
            return words_;
        std::size_t length = folder.size(); // of the root
        for (const std::string& root : roots_)
            if (folder.starts_with(root))
                length = std::min(length, root.size());
        const std::size_t above = length > 1 ? folder.rfind('/', length - 2) : 0; // behind which the name begins
        folder_ = folder;
        words_ = folder.substr(above + 1);
        return words_;
    }

private:
    std::vector<std::string> roots_;
    std::string folder_, words_; // the last that was asked for
};

class SourceMerge {
public:
    SourceMerge(Library& target, FilesProgress& progress) : target_(target), merge_(target), progress_(progress) {}

    /// Throws Failure; what came before stays.
    void add(const std::string& source, InputLines& lines, bool isDatabase)
    {
        progress_.begin(source);
        if (isDatabase)
            addDatabase(source);
        else
            addLines(lines);
        merge_.finish();
    }
    /// After a Failure of `add`.
    void abandon() { merge_.abandon(); }
    const MergeCounts& counts() const { return merge_.counts(); }

private:
    void addDatabase(const std::string& source)
    {
        Library library(source, SQLDatabase::Mode::read);
        // It may come from anywhere: no function is called that its tables name.
        library.database().run("PRAGMA trusted_schema = OFF; PRAGMA cell_size_check = ON; BEGIN");
        for (SQLStatement roots(library.database(), "SELECT path, completed FROM roots"); roots.step();) {
            LibraryRoot root{nameOfIndexed(roots.bytes(0)), {}};
            if (!roots.isNull(1))
                root.completed = roots.number(1);
            merge_.add(root);
        }
        for (SQLStatement mounted(library.database(), "SELECT path, words FROM folders WHERE mounted = 1");
             mounted.step();)
            merge_.addMounted(nameOfIndexed(mounted.bytes(0)), nameOfIndexed(mounted.bytes(1)));
        RecordReader reader(library);
        IndexedFiles files(library, IndexedFiles::Which::all);
        while (const auto file = files.next()) {
            addWith(shownName(file->place.path()), [&] { merge_.add(*file, [&] { return reader.record(*file); }); });
            progress_.advance(1);
        }
    }

    void addLines(InputLines& lines)
    {
        FolderWords words(target_);
        for (std::string_view line; lines.next(line);) {
            if (line.find_first_not_of(" \t\r") == line.npos)
                continue;
            addWith(fmt::format("line {}", lines.number()), [&] { addLine(line, words); });
            progress_.advance(1);
        }
    }

    void addLine(std::string_view text, FolderWords& words)
    {
        const LibraryLine line = libraryLineOf(text);
        if (const auto* const record = std::get_if<LibraryRecord>(&line)) {
            merge_.add(*record, words.of(record->place.folder));
        } else if (const auto* const root = std::get_if<LibraryRoot>(&line)) {
            merge_.add(*root);
            words.add(root->path);
        }
    }

    /// What was good before a bad record is kept, and the failure says where that is.
    template <class Work>
    void addWith(const std::string& where, Work work)
    {
        try {
            work();
        } catch (const SQLFailure&) {
            throw;
        } catch (const Failure& failure) {
            merge_.finish();
            throw Failure(fmt::format("{}: {}", where, failure.what()));
        }
    }

    Library& target_;
    LibraryMerge merge_;
    FilesProgress& progress_;
};

MergeCounts operator-(const MergeCounts& now, const MergeCounts& before)
{
    return {now.added - before.added, now.changed - before.changed, now.same - before.same,
            now.passedOver - before.passedOver};
}

class MergeReport {
public:
    explicit MergeReport(const OutputOptions& options) : options_(options), json_(options) {}

    void add(const std::string& source, const MergeCounts& counts)
    {
        if (options_.wantsJson()) {
            JsonWriter& json =
                json_.begin().beginObject().member("path", shownName(source)).key("counts").beginObject();
            json.member("added", counts.added).member("changed", counts.changed).member("unchanged", counts.same);
            json.member("passedOver", counts.passedOver).endObject().endObject();
            json_.end();
        } else if (!options_.quiet) {
            Output::standard().print("merged {}: {} added, {} changed, {} unchanged\n", printable(shownName(source)),
                                     counts.added, counts.changed, counts.same);
        }
    }
    void addFailure(const std::string& source, const std::string& text)
    {
        json_.addFailure(source, text);
        Output::standard().flush();
        reportFailure(source, text);
    }
    void finish() { json_.finish(); }

private:
    OutputOptions options_;
    JsonRecords json_;
};

// Whether it is the index itself, or a file beside it that SQLite made. Another descriptor of such a file must not be
// closed: with it go the locks of this process.
bool isPartOf(const std::string& index, const std::string& source)
{
    struct stat status = {}, part = {};
    if ((source == kStandardInput ? ::fstat(STDIN_FILENO, &status) : ::stat(source.c_str(), &status)) != 0)
        return false;
    return std::ranges::any_of(std::array{"", "-wal", "-shm"}, [&](const char* ending) {
        return ::stat((index + ending).c_str(), &part) == 0 && part.st_dev == status.st_dev &&
               part.st_ino == status.st_ino;
    });
}

class MergeRun {
public:
    MergeRun(const MergeArguments& arguments, const OutputOptions& options)
        : arguments_(arguments),
          path_(arguments.database.empty() ? defaultLibrary() : arguments.database),
          progress_("merging", options.quiet),
          report_(options)
    {
    }

    /// False for a source that failed. An index that cannot be written ends it all.
    bool run()
    {
        try {
            for (const std::string& source : arguments_.sources)
                open(source);
        } catch (const Failure& failure) {
            fail(path_, failure.what());
        }
        report_.finish();
        return isGood_;
    }

private:
    /// The index is made for the first source that can be read, and not for none.
    void open(const std::string& source)
    {
        if (isPartOf(path_, source))
            return fail(source, "is the index that the others go into");
        std::optional<InputLines> lines;
        bool isDatabase = false;
        try {
            lines.emplace(source);
            isDatabase = lines->beginsWith(kDatabaseBeginning) && source != kStandardInput;
        } catch (const Failure& failure) {
            return fail(source, failure.what());
        }
        if (!merge_) {
            target_.emplace(path_, SQLDatabase::Mode::create);
            target_->database().run(kCheckpoints);
            merge_.emplace(*target_, progress_);
        }
        add(source, *lines, isDatabase);
    }

    void add(const std::string& source, InputLines& lines, bool isDatabase)
    {
        const MergeCounts before = merge_->counts();
        try {
            merge_->add(source, lines, isDatabase);
            report_.add(source, merge_->counts() - before);
        } catch (const Failure& failure) {
            merge_->abandon();
            fail(source, failure.what());
        }
    }

    void fail(const std::string& name, const std::string& problem)
    {
        report_.addFailure(name, problem);
        isGood_ = false;
    }

    const MergeArguments& arguments_;
    std::string path_;
    FilesProgress progress_;
    MergeReport report_;
    bool isGood_ = true;
    std::optional<Library> target_;
    std::optional<SourceMerge> merge_;
};

} // namespace

void declareIndexMerge(CommandLine& commandLine, Verb& index)
{
    static MergeArguments arguments;
    Verb& verb = commandLine.addVerb(
        "merge", "Bring indexes, or their records as JSON Lines, into one",
        [&commandLine] { return MergeRun(arguments, commandLine.output()).run(); }, &index);
    verb.addTexts("SOURCE", arguments.sources, "Indexes, and files of JSON Lines; \"-\" is standard input").required();
    verb.addText("--db", arguments.database, "The index that they go into, in place of your own").label("FILE");
}
