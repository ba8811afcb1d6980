// ktfiles scan: every loop below folders, one record each.
#include "CommandLine.h"
#include "Failure.h"
#include "FolderWalk.h"
#include "LoopTags.h"
#include "OrderedWork.h"
#include "ScanProgress.h"
#include "ScanRecord.h"

#include <algorithm>
#include <unistd.h>

namespace {

// Files travel in batches, which cost the threads less than one by one.
constexpr std::size_t kBatch = 64;
constexpr unsigned kBatchesPerThread = 8;
constexpr unsigned kMostThreads = 256;

using Batch = std::vector<ScanItem>;
using Records = std::vector<ScanRecord>;
using ScanWork = OrderedWork<Batch, Records>;

struct ScanArguments {
    std::vector<std::string> folders;
    bool csv = false;
    unsigned threads = 0;
};

struct BadFile {
    std::string path;
    std::string problem;
};

void walkInto(ScanWork& work, const std::vector<std::string>& folders)
{
    Batch batch;
    FolderWalk walk(folders, [&](const std::string& path, const std::string& problem) {
        batch.push_back({path, problem});
        return batch.size() < kBatch || work.give(std::exchange(batch, {}));
    });
    if (walk.run() && !batch.empty())
        work.give(std::move(batch));
    work.close();
}

// Counts ahead of the scan, which costs it little: no file is opened.
void countInto(ScanProgress& progress, const std::vector<std::string>& folders, const std::stop_token& stop)
{
    std::int64_t files = 0;
    FolderWalk walk(folders, [&](const std::string&, const std::string&) {
        ++files;
        return !stop.stop_requested();
    });
    if (walk.run())
        progress.setTotal(files);
}

unsigned threadsFor(const ScanArguments& arguments)
{
    const unsigned threads = arguments.threads != 0 ? arguments.threads : std::thread::hardware_concurrency();
    return std::clamp(threads, 1U, kMostThreads);
}

// Takes the results in order; the bad files are returned, to be listed at the end.
std::vector<BadFile> writeRecords(ScanWork& work, ScanWriter& writer, ScanProgress& progress)
{
    Output& output = Output::standard();
    const bool sharesTerminal = progress.isActive() && isTerminal(STDOUT_FILENO);
    std::vector<BadFile> bad;
    while (auto records = work.take()) {
        const bool prints = std::any_of(records->begin(), records->end(),
                                        [](const ScanRecord& record) { return record.kind == ScanRecord::loop; });
        if (sharesTerminal && prints)
            progress.hide();
        for (ScanRecord& record : *records)
            if (record.kind == ScanRecord::loop)
                writer.add(record);
            else if (record.kind == ScanRecord::bad)
                bad.push_back({std::move(record.path), std::move(record.text)});
        if (sharesTerminal && prints)
            output.flush();
        if (output.failed())
            break;
        progress.advance(std::ssize(*records));
    }
    work.stop();
    return bad;
}

bool runScan(const ScanArguments& arguments, const OutputOptions& options)
{
    if (arguments.csv && options.json)
        throw CLI::ValidationError("--csv and --json exclude each other");
    const ScanForm form = arguments.csv ? ScanForm::csv : scanForm(outputForm(options));
    ScanWriter writer(form, usesColor(options.color));
    std::vector<BadFile> bad;
    {
        const unsigned threads = threadsFor(arguments);
        ScanProgress progress(options.quiet);
        ScanWork work(threads, std::size_t{threads} * kBatchesPerThread, [form](const Batch& batch) {
            Records records;
            for (const ScanItem& item : batch)
                records.push_back(scanFile(item, form));
            return records;
        });
        std::jthread counter;
        if (progress.isActive())
            counter = std::jthread([&](const std::stop_token& stop) { countInto(progress, arguments.folders, stop); });
        const std::jthread walker([&] { walkInto(work, arguments.folders); });
        bad = writeRecords(work, writer, progress);
    }
    writer.finish();
    Output::standard().flush(); // ahead of what follows on standard error
    for (const BadFile& file : bad)
        reportFailure(file.path, file.problem);
    return bad.empty();
}

void declareScan(CommandLine& commandLine)
{
    static ScanArguments arguments;
    CLI::App& verb = commandLine.addVerb("scan", "List the loops below folders, with their tags",
                                         [&commandLine] { return runScan(arguments, commandLine.output()); });
    CommandLine::addFiles(verb, arguments.folders, "FOLDER")->required()->description("The folders");
    verb.add_flag("--csv", arguments.csv, "Print comma-separated values (RFC 4180), with a header");
    verb.add_option("-j,--threads", arguments.threads, "How many files are read at once; else one per core")
        ->option_text("N")
        ->check(CLI::Range(1U, kMostThreads).description(""));
}

const VerbRegistration registration{40, declareScan};

} // namespace
