// ktfiles page: writes a page on which a library is looked at and listened to.
#include "tool/page/PageDocument.h"
#include "tool/page/PagePreviews.h"
#include "tool/page/PageRow.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/library/LibraryQueryOptions.h"
#include "tool/shared/library/LibrarySearch.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <filesystem>
#include <unistd.h>

namespace {

struct PageArguments {
    LibraryQuery query;
    std::string database;
    std::string out;
    std::string title;
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    bool makesPreviews = false, embedsPreviews = false;

    bool isToOutput() const { return out == "-"; }
};

std::vector<PageRow> rowsFor(Library& library, const LibraryQuery& query)
{
    std::vector<PageRow> rows;
    LibrarySearch search(library, query, {.overview = true, .problems = true});
    for (LibraryRecord record; search.next(record);) {
        if (rows.size() == kMostPageRows)
            throw Failure(fmt::format("more than {} sounds are found, and a page holds that many at most: name a "
                                      "folder, ask for less, or --limit {}",
                                      kMostPageRows, kMostPageRows));
        rows.push_back(pageRow(record));
    }
    return rows;
}

// Where links begin.
std::string folderOf(const std::string& out)
{
    const std::filesystem::path above = out == "-" ? std::filesystem::path() : std::filesystem::path(out).parent_path();
    std::error_code error;
    const std::filesystem::path folder = std::filesystem::canonical(above.empty() ? "." : above, error);
    if (error)
        throw Failure("the folder " + above.string() + ": " + SystemErrorText(error.value()));
    return folder == "/" ? "/" : folder.string() + "/";
}

PagePreviews previewsFor(const PageArguments& arguments, bool quiet)
{
    using Where = PagePreviews::Where;
    return {.where = arguments.embedsPreviews  ? Where::embedded
                     : arguments.makesPreviews ? Where::beside
                                               : Where::none,
            .page = arguments.out,
            .quiet = quiet};
}

void tell(const PageArguments& arguments, const std::vector<PageRow>& rows, std::size_t bytes,
          const OutputOptions& options)
{
    const auto gone = std::ranges::count_if(rows, &PageRow::isGone);
    const auto previews = std::ranges::count_if(rows, [](const PageRow& row) { return row.previewSeconds > 0; });
    if (options.wantsJson()) {
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject();
            json.member("output", shownName(arguments.out)).member("files", rows.size());
            json.member("gone", gone).member("previews", previews).member("size", bytes).endObject();
        });
        return;
    }
    if (options.quiet || arguments.isToOutput())
        return;
    std::string more;
    if (gone > 0)
        more += fmt::format(", {} of which {} gone", gone, gone == 1 ? "is" : "are");
    if (previews > 0)
        more += fmt::format(", {} preview{}", previews, previews == 1 ? "" : "s");
    Output::standard().print("{}: {} sound{}{}, {:.1f} MB\n", printable(shownName(arguments.out)), rows.size(),
                             rows.size() == 1 ? "" : "s", more, static_cast<double>(bytes) / 1e6);
}

void checkArguments(const PageArguments& arguments, const OutputOptions& options)
{
    if (arguments.out.empty())
        throw UsageError("-o OUT is missing: the page to write, \"-\" for standard output");
    if (arguments.isToOutput() && options.wantsJson())
        throw UsageError("JSON and the page cannot both go to standard output");
    if (arguments.isToOutput() && arguments.makesPreviews)
        throw UsageError("previews lie beside a page that has a name: --embed-previews puts them into it");
}

bool writePage(const PageArguments& arguments, Library& library, const OutputOptions& options)
{
    if (!arguments.isToOutput())
        requireFreeName(arguments.out, arguments.existing);
    const std::string folder = folderOf(arguments.out);
    std::vector<PageRow> rows = rowsFor(library, arguments.query);
    const bool good = previewsFor(arguments, options.quiet).make(rows);
    const std::string text = PageDocument{.title = arguments.title, .folder = folder}.text(rows);
    if (arguments.isToOutput())
        Output::standard().write(text);
    else
        writeOutputFile(arguments.out, library.path(), arguments.existing, [&](const Sink& sink) { sink(text); });
    tell(arguments, rows, text.size(), options);
    return good;
}

bool runPage(PageArguments& arguments, const OutputOptions& options)
{
    checkArguments(arguments, options);
    settleWords(arguments.query);
    const std::string path = arguments.database.empty() ? defaultLibrary() : arguments.database;
    bool good = true;
    return reportingRecord(path, options,
                           [&] {
                               Library library(path, SQLDatabase::Mode::read);
                               good = writePage(arguments, library, options);
                           }) &&
           good;
}

void declarePage(CommandLine& commandLine)
{
    static PageArguments arguments;
    Verb& verb = commandLine.addVerb("page", "Write a page on which a library is looked at and listened to",
                                     [&commandLine] { return runPage(arguments, commandLine.output()); });
    addQueryOptions(verb, arguments.query);
    CommandLine::addPath(verb, "-o,--output", arguments.out, "The page to write, \"-\" for standard output")
        .label("OUT");
    verb.addText("--heading", arguments.title, "Its heading; else the name of the folder with all sounds")
        .label("TEXT");
    const Argument previews =
        verb.addFlag("--previews", arguments.makesPreviews,
                     "Write previews, 10 seconds at most, beside it for what some browsers do not play");
    verb.addFlag("--embed-previews", arguments.embedsPreviews, "Put previews into the page, 64 MB at most")
        .excludes(previews);
    CommandLine::addForceOption(verb, arguments.existing);
    CommandLine::addPath(verb, "--db", arguments.database, "The index; else that of the user").label("FILE");
}

const VerbRegistration pageRegistration{43, "page", declarePage};

} // namespace
