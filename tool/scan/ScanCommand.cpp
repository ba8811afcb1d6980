// ktfiles scan: lists every loop below folders, one record each.
#include "tool/scan/ScanRecord.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FolderWalk.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/output/ProgressLine.h"
#include "tool/shared/threads/OrderedWork.h"

#include <algorithm>
#include <exception>
#include <unistd.h>

namespace {

// Files are passed in batches, which costs the threads less than one by one.
constexpr std::size_t kBatch = 64;
constexpr unsigned kBatchesPerThread = 8;

using Batch = std::vector<FoundFile>;
struct Records {
    std::vector<ScanRecord> records;
    std::int64_t files = 0;
};
using ScanWork = OrderedWork<Batch, Records>;

struct ScanArguments {
    FileArguments folders;
    unsigned threads = 0;
};

struct BadFile {
    std::string path;
    std::string problem;
};

// Walks until `give` returns false.
void walkBatches(const std::vector<std::string>& folders, const std::function<bool(Batch)>& give)
{
    Batch batch;
    FolderWalk walk(folders, [&](FoundFile file) {
        batch.push_back(std::move(file));
        return batch.size() < kBatch || give(std::exchange(batch, {}));
    });
    if (walk.run() && !batch.empty())
        give(std::move(batch));
}

// Counts the files ahead of the scan, at little cost, because it opens none.
void countInto(FilesProgress& progress, const std::vector<std::string>& folders, const std::stop_token& stop)
{
    std::int64_t files = 0;
    FolderWalk walk(folders, [&](const FoundFile&) {
        ++files;
        return !stop.stop_requested();
    });
    try {
        if (walk.run())
            progress.setTotal(files);
    } catch (const std::exception&) { // the work meets it too, and tells
    }
}

// Writes results in order, and keeps the bad files for a list at the end.
class ResultWriter {
public:
    ResultWriter(ScanWriter& writer, FilesProgress& progress) : writer_(writer), progress_(progress) {}

    /// False if no more results are wanted.
    bool add(Records scanned)
    {
        Output& output = Output::standard();
        const bool sharesTerminal = progress_.isActive() && isTerminal(STDOUT_FILENO);
        const std::int64_t loopsBefore = loops_;
        files_ += scanned.files;
        for (ScanRecord& record : scanned.records) {
            writer_.add(record);
            loops_ += static_cast<std::int64_t>(record.loops);
            if (record.kind == ScanRecord::bad)
                bad_.push_back({std::move(record.path), std::move(record.text)});
        }
        if (sharesTerminal && loops_ > loopsBefore)
            output.flush();
        if (output.failed())
            return false;
        progress_.advance(scanned.files);
        return true;
    }
    const std::vector<BadFile>& bad() const { return bad_; }
    /// "3 loops among 1024 files".
    std::string count() const
    {
        const auto counted = [](std::int64_t number, const char* what) {
            return fmt::format("{} {}{}", number == 0 ? "no" : std::to_string(number), what, number == 1 ? "" : "s");
        };
        return counted(loops_, "loop") + " among " + counted(files_, "file");
    }

private:
    ScanWriter& writer_;
    FilesProgress& progress_;
    std::int64_t files_ = 0;
    std::int64_t loops_ = 0;
    std::vector<BadFile> bad_;
};

// Does the work of the threads if none could be started.
void scanHere(const std::vector<std::string>& folders, const std::function<Records(const Batch&)>& scan,
              ResultWriter& results)
{
    walkBatches(folders, [&](const Batch& batch) { return results.add(scan(batch)); });
}

void scanByThreads(const std::vector<std::string>& folders, unsigned threads,
                   const std::function<Records(const Batch&)>& scan, ResultWriter& results)
{
    ScanWork work(threads, std::size_t{threads} * kBatchesPerThread, scan);
    const std::jthread walker = startedThread([&] {
        try {
            walkBatches(folders, [&](Batch batch) { return work.give(std::move(batch)); });
            work.close();
        } catch (...) {
            work.fail(std::current_exception());
        }
    });
    if (!walker.joinable()) // the walker and the taker of results must be different threads
        return scanHere(folders, scan, results);
    // Declared so as to run before the wait for the walker, even if memory is short.
    struct Stopping {
        ScanWork& stopped;
        ~Stopping() { stopped.stop(); }
    } const stopping{work};
    while (auto records = work.take())
        if (!results.add(std::move(*records)))
            break;
}

bool runScan(const ScanArguments& arguments, const OutputOptions& options)
{
    const Form form = outputForm(options);
    ScanWriter writer(form, options);
    std::vector<std::string> folders;
    const std::string list = arguments.folders.listName();
    try {
        folders = allNames(arguments.folders);
    } catch (const Failure& failure) {
        writer.add({ScanRecord::bad, list, failure.what(), {}});
        writer.finish();
        reportFailure(list, failure.what());
        return false;
    }
    FilesProgress progress("scanning", options.quiet);
    ResultWriter results(writer, progress);
    {
        std::jthread counter;
        if (progress.isActive())
            counter = startedThread([&](const std::stop_token& stop) { countInto(progress, folders, stop); });
        scanByThreads(
            folders, threadsFor(arguments.threads),
            [form, &progress](const Batch& batch) {
                progress.begin(batch.front().path);
                Records scanned{{}, std::ssize(batch)};
                for (const FoundFile& file : batch)
                    addTo(scanned.records, scanFile(file, form), form);
                return scanned;
            },
            results);
    }
    writer.finish();
    Output::standard().flush(); // before what follows on standard error
    for (const BadFile& file : results.bad())
        reportFailure(file.path, file.problem);
    // For people only: standard output carries the records, and scripts that keep both streams find only problems.
    const progressline::Cleared cleared;
    if (!options.quiet && isTerminal(STDERR_FILENO) && !Output::standard().failed())
        fmt::print(stderr, "{}\n", results.count());
    return results.bad().empty();
}

void declareScan(CommandLine& commandLine)
{
    static ScanArguments arguments;
    Verb& verb = commandLine.addVerb("scan", "List the loops below folders, with their tags",
                                     [&commandLine] { return runScan(arguments, commandLine.output()); });
    CommandLine::addFiles(verb, arguments.folders, "FOLDER").describe("The folders");
    commandLine.addCsv(verb);
    addThreads(verb, arguments.threads);
}

const VerbRegistration scanRegistration{40, "scan", declareScan};

} // namespace
