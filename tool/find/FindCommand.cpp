// ktfiles find: lists the files of an index that are as is asked.
#include "tool/find/FindReport.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/indexing/FreshLibrary.h"
#include "tool/shared/library/LibraryQueryOptions.h"
#include "tool/shared/output/ProgressLine.h"

#include <unistd.h>

namespace {

constexpr std::int64_t kRowsOfTable = 100; // as many as people look through

struct FindArguments {
    LibraryQuery query;
    std::string database;
    bool endsWithNul = false;
    bool isFresh = false;
};

void tellOnTerminal(const std::string& text)
{
    Output::standard().flush();
    const progressline::Cleared cleared;
    if (isTerminal(STDERR_FILENO) && !Output::standard().failed())
        fmt::print(stderr, "{}\n", text);
}

/// Returns whether a file was found.
bool findFiles(const FindArguments& arguments, const std::string& path, const OutputOptions& options,
               FindReport& report)
{
    LibraryQuery query = arguments.query;
    if (report.form() == Form::none)
        query.limit = 1;
    else if (report.form() == Form::table && !query.limit)
        query.limit = kRowsOfTable;
    if (arguments.isFresh)
        bringUpToDate(path, query, options.quiet);
    Library library(path, SQLDatabase::Mode::read);
    LibrarySearch search(library, query, report.parts());
    std::int64_t found = 0;
    LibraryRecord record;
    for (; !Output::standard().failed() && search.next(record); ++found)
        if (report.form() != Form::none)
            report.add(record);
    report.finish();
    if (found == 0 && report.form() != Form::none)
        tellOnTerminal("nothing is found");
    else if (search.hasMore() && report.form() == Form::table)
        tellOnTerminal(fmt::format("there are more than these {}; --limit N shows as many", found));
    return found > 0;
}

bool runFind(FindArguments& arguments, const OutputOptions& options)
{
    if (arguments.endsWithNul && (options.wantsJson() || options.csv))
        throw UsageError("-0 ends paths, and there are none alone in JSON and CSV");
    settleWords(arguments.query);
    const std::string path = arguments.database.empty() ? defaultLibrary() : arguments.database;
    bool isFound = false;
    FindReport report(options, arguments.query, arguments.endsWithNul ? PathEnd::nul : PathEnd::line);
    const bool isGood = reportingFailures(path, [&] {
        try {
            isFound = findFiles(arguments, path, options, report);
        } catch (const Failure& failure) { // of what was found before, all stays
            report.fail(path, failure.what());
            throw;
        }
    });
    return isGood && isFound;
}

void declareFind(CommandLine& commandLine)
{
    static FindArguments arguments;
    Verb& verb = commandLine.addVerb("find", "List the files of an index that are as is asked",
                                     [&commandLine] { return runFind(arguments, commandLine.output()); });
    addQueryOptions(verb, arguments.query);
    CommandLine::addPath(verb, "--db", arguments.database, "Ask the index in that file, not that of the user")
        .label("FILE");
    verb.addFlag("--fresh", arguments.isFresh, "Bring the index up to date first, with FOLDER or all that is in it");
    verb.addFlag("-0,--null", arguments.endsWithNul, "Print paths alone, each with a NUL byte behind it, for xargs -0");
    commandLine.addCsv(verb);
}

const VerbRegistration findRegistration{42, "find", declareFind};

} // namespace
