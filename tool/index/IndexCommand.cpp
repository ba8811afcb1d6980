// ktfiles index: makes the index of a library, and brings it up to date.
#include "tool/index/EndOfWork.h"
#include "tool/index/IndexObjects.h"
#include "tool/index/IndexRecords.h"
#include "tool/index/IndexWatch.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/indexing/LibraryUpdate.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ProgressLine.h"
#include "tool/shared/output/ShownName.h"

#include <charconv>
#include <optional>
#include <unistd.h>

namespace {

struct IndexArguments {
    FileArguments folders;
    std::string database;
    bool hashes = false;
    bool omitsOverviews = false;
    bool prunes = false;
    bool writesRecords = false;
    bool watches = false;
    unsigned threads = 0;
    LibraryShard shard;
};

std::optional<LibraryShard> shardFromText(const std::string& text)
{
    LibraryShard shard;
    const char* const end = text.data() + text.size();
    const auto number = std::from_chars(text.data(), end, shard.number);
    if (number.ec != std::errc() || number.ptr == end || *number.ptr != '/')
        return std::nullopt;
    const auto count = std::from_chars(number.ptr + 1, end, shard.count);
    const bool isWhole = count.ec == std::errc() && count.ptr == end;
    return isWhole && shard.number >= 1 && shard.number <= shard.count ? std::optional(shard) : std::nullopt;
}

std::string shardProblem(const std::string& text)
{
    return shardFromText(text) ? "" : "\"" + printable(text) + "\" is no part such as 1/4";
}

// "1,234,567".
std::string grouped(std::int64_t number)
{
    std::string text = std::to_string(number);
    for (std::size_t at = text.size(); at > 3; at -= 3)
        text.insert(at - 3, ",");
    return text;
}

std::string summary(const LibraryChanges& changes)
{
    std::string text =
        fmt::format("{} added, {} changed, {} moved, {} removed, {} unchanged", grouped(changes.added),
                    grouped(changes.changed), grouped(changes.moved), grouped(changes.removed), grouped(changes.same));
    if (changes.unreadable > 0)
        text += fmt::format(", {} unreadable", grouped(changes.unreadable));
    if (changes.loops > 0)
        text += fmt::format("; {} of those read {}", grouped(changes.loops),
                            changes.loops == 1 ? "is a loop" : "are loops");
    return text;
}

// Tells what an update changed: a record, and for people a line.
class ChangesWriter {
public:
    ChangesWriter(const std::string& database, const OutputOptions& options)
        : database_(shownName(database)),
          options_(options),
          records_(options)
    {
    }

    void add(const LibraryChanges& changes)
    {
        if (options_.wantsJson())
            addRecord(changes);
        if (options_.quiet || !isTerminal(STDERR_FILENO))
            return;
        const progressline::Cleared cleared;
        fmt::print(stderr, "{}; {}\n", summary(changes), printable(database_));
    }
    void finish() { records_.finish(); }

private:
    void addRecord(const LibraryChanges& changes)
    {
        JsonWriter& json = records_.begin().beginObject().member("database", database_).key("counts").beginObject();
        json.member("added", changes.added).member("changed", changes.changed).member("moved", changes.moved);
        json.member("removed", changes.removed).member("unchanged", changes.same);
        json.member("passedOver", changes.passedOver).member("unreadable", changes.unreadable);
        json.member("loops", changes.loops).member("problems", changes.problems).endObject().endObject();
        records_.end();
    }

    std::string database_;
    const OutputOptions& options_;
    JsonRecords records_;
};

LibraryUpdate updateFor(const IndexArguments& arguments)
{
    LibraryUpdate update;
    if (!arguments.folders.names.empty() || !arguments.folders.list.empty())
        update.folders = allNames(arguments.folders);
    update.reading = {.overview = !arguments.omitsOverviews, .hash = arguments.hashes};
    update.threads = arguments.threads;
    update.shard = arguments.shard;
    update.prunes = arguments.prunes;
    update.isEnded = EndOfWork::isAsked;
    update.tell = [](const std::string& path, const std::string& problem) { reportFailure(path, problem); };
    return update;
}

// Whether no problem was met.
bool updateIndex(Library& library, LibraryUpdate update, const OutputOptions& options, ChangesWriter& writer)
{
    LibraryChanges changes;
    {
        FilesProgress progress("indexing", options.quiet);
        update.progress = &progress;
        changes = updateLibrary(library, update);
    }
    writer.add(changes);
    return changes.problems == 0;
}

bool runRecords(const IndexArguments& arguments, LibraryUpdate update, const OutputOptions& options)
{
    if (update.folders.empty())
        throw MissingArgument(arguments.folders.label);
    if (!arguments.database.empty() || arguments.prunes || arguments.watches)
        throw UsageError("--records needs no index: --db, --prune and --watch are for one");
    const EndOfWork ending;
    const bool isGood = writeIndexRecords(std::move(update), options);
    EndOfWork::endIfAsked();
    return isGood;
}

bool runIndex(const IndexArguments& arguments, const OutputOptions& options)
{
    LibraryUpdate update;
    if (!reportingFailures(arguments.folders.listName(), [&] { update = updateFor(arguments); }))
        return false;
    if (arguments.writesRecords)
        return runRecords(arguments, std::move(update), options);
    const std::string path = arguments.database.empty() ? defaultLibrary() : arguments.database;
    if (update.folders.empty() && ::access(path.c_str(), F_OK) != 0)
        throw MissingArgument(arguments.folders.label);
    if (arguments.watches && arguments.shard.count > 1)
        throw UsageError("--watch follows all files: it goes without --shard");
    const EndOfWork ending;
    ChangesWriter writer(path, options);
    bool isGood = false;
    const bool isWritten = reportingFailures(path, [&] {
        Library library(path, SQLDatabase::Mode::create);
        isGood = arguments.watches ? watchIndex(library, std::move(update),
                                                [&](const LibraryChanges& changes) { writer.add(changes); })
                                   : updateIndex(library, std::move(update), options, writer);
    });
    writer.finish();
    EndOfWork::endIfAsked();
    return isWritten && isGood;
}

void declareIndex(CommandLine& commandLine)
{
    static IndexArguments arguments;
    Verb& verb = commandLine.addVerb("index", "Keep an index of the audio files below folders, for find and page",
                                     [&commandLine] { return runIndex(arguments, commandLine.output()); });
    CommandLine::addFiles(verb, arguments.folders, "FOLDER")
        .describe("The folders, and single files; with none, those that were indexed before");
    CommandLine::addPath(verb, "--db", arguments.database, "The index, in place of the user's own").label("FILE");
    verb.addFlag("--hash", arguments.hashes, "Hash the sound too, which finds duplicates");
    verb.addFlag("--no-overview", arguments.omitsOverviews, "Keep no waveforms, for which all samples are read");
    verb.addFlag("--prune", arguments.prunes, "Forget what lies in folders that are not there, or are empty");
    verb.addFlag("--watch", arguments.watches, "Go on, and follow what changes in the folders");
    const auto takeShard = [](const std::string& text) {
        arguments.shard = shardFromText(text).value_or(LibraryShard());
    };
    verb.addText("--shard", takeShard, "Of N parts of the files, only the one with number I", shardProblem)
        .label("I/N");
    verb.addFlag("--records", arguments.writesRecords,
                 "Write what would be in an index as JSON Lines, for others to merge");
    addThreads(verb, arguments.threads);
    declareIndexMerge(commandLine, verb);
    declareIndexExport(commandLine, verb);
}

const VerbRegistration indexRegistration{45, "index", declareIndex};

} // namespace
