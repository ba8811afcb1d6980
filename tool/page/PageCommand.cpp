// ktfiles page: writes a page on which a library is looked at and listened to.
#include "tool/page/PageDocument.h"
#include "tool/page/PagePreviews.h"
#include "tool/page/PageRow.h"
#include "tool/page/PageServer.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/indexing/FreshLibrary.h"
#include "tool/shared/library/IndexedName.h"
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
    std::string heading;
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    bool makesPreviews = false, embedsPreviews = false;
    bool serves = false;
    int port = 0; // any that is free
    bool updatesFirst = false;

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
    if (arguments.out.empty() && !arguments.serves)
        throw UsageError("-o OUT is missing: the page to write, \"-\" for standard output; or --serve");
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
    const std::string text = PageDocument{.title = arguments.heading, .folder = folder}.text(rows);
    if (arguments.isToOutput())
        Output::standard().write(text);
    else
        writeOutputFile(arguments.out, library.path(), arguments.existing, [&](const Sink& sink) { sink(text); });
    tell(arguments, rows, text.size(), options);
    return good;
}

std::vector<std::string> rootsOf(Library& library)
{
    std::vector<std::string> roots;
    for (SQLStatement rows(library.database(), "SELECT path FROM roots"); rows.step();)
        roots.push_back(nameOfIndexed(rows.bytes(0)));
    return roots;
}

// Says where the page is; false if nobody can hear it.
bool tellAddress(const std::string& address, std::size_t files, const OutputOptions& options)
{
    if (options.wantsJson())
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("address", address).member("files", files).endObject();
        });
    else
        Output::standard().print("{}\n", address);
    if (!Output::standard().flush())
        return false;
    if (!options.quiet && isTerminal(STDERR_FILENO))
        fmt::print(stderr, "Open it in a browser on this machine. Ctrl-C ends it.\n");
    return true;
}

bool servePage(const PageArguments& arguments, Library& library, const OutputOptions& options)
{
    const ServerModule* const server = serverModule();
    if (server == nullptr)
        throw Failure("pages cannot be served without ktfiles/libktfiles-server.so (install ktfiles-server)");
    std::vector<PageRow> rows = rowsFor(library, arguments.query);
    const std::size_t files = rows.size();
    std::string text = PageDocument{.title = arguments.heading, .folder = {}, .isServed = true}.text(rows);
    PageSite site(std::move(rows), std::move(text), rootsOf(library));
    const auto begin = [&](int port) {
        site.setPort(port);
        return tellAddress(fmt::format("http://127.0.0.1:{}{}", port, site.path()), files, options);
    };
    if (!server->serve(site, arguments.port, begin))
        throw Failure(fmt::format("port {} of this machine cannot be opened", arguments.port));
    return true;
}

bool runPage(PageArguments& arguments, const OutputOptions& options)
{
    checkArguments(arguments, options);
    settleWords(arguments.query);
    const std::string path = arguments.database.empty() ? defaultLibrary() : arguments.database;
    bool good = true;
    return reportingRecord(path, options,
                           [&] {
                               if (arguments.updatesFirst)
                                   bringUpToDate(path, arguments.query, options.quiet);
                               Library library(path, SQLDatabase::Mode::read);
                               good = arguments.serves ? servePage(arguments, library, options)
                                                       : writePage(arguments, library, options);
                           }) &&
           good;
}

void declarePage(CommandLine& commandLine)
{
    static PageArguments arguments;
    Verb& verb = commandLine.addVerb("page", "Write a page on which a library is looked at and listened to",
                                     [&commandLine] { return runPage(arguments, commandLine.output()); });
    addQueryOptions(verb, arguments.query);
    const Argument out =
        CommandLine::addPath(verb, "-o,--output", arguments.out, "The page to write, \"-\" for standard output")
            .label("OUT");
    verb.addText("--heading", arguments.heading, "What stands above it; else the name of the folder of all sounds")
        .label("TEXT");
    Argument previews =
        verb.addFlag("--previews", arguments.makesPreviews,
                     "Write previews, 10 seconds at most, beside it for what some browsers do not play");
    Argument embedded =
        verb.addFlag("--embed-previews", arguments.embedsPreviews, "Put previews into the page, 64 MB at most")
            .excludes(previews);
    verb.addFlag("--serve", arguments.serves, "Serve the page to browsers on this machine instead, with all sounds")
        .excludes(out)
        .excludes(previews)
        .excludes(embedded);
    verb.addNumber("--port", arguments.port, {0, 65535}, "The port for --serve; else, or with 0, any that is free");
    CommandLine::addForceOption(verb, arguments.existing);
    verb.addFlag("--fresh", arguments.updatesFirst, "Bring the index up to date first");
    CommandLine::addPath(verb, "--db", arguments.database, "The index; else that of the user").label("FILE");
}

const VerbRegistration pageRegistration{43, "page", declarePage};

} // namespace
