// ktfiles meta export: writes the fields of many files as one table.
#include "tool/meta/MetaCommand.h"
#include "tool/meta/MetaTableWriter.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/output/Failure.h"

#include <atomic>
#include <sys/stat.h>

namespace {

struct ExportArguments {
    FileArguments files;
    std::string only, out;
    bool csv = false, xml = false, isMarked = false;
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    unsigned threads = 0;
};

/// The table gets its name when it is complete.
class TableOutput {
public:
    explicit TableOutput(const ExportArguments& arguments)
    {
        const bool isFile = !arguments.out.empty() && arguments.out != "-";
        if (isFile) {
            file_ = std::make_unique<OutputFile>(arguments.out, "", arguments.existing);
            isThere_ = ::stat(arguments.out.c_str(), &replaced_) == 0;
        }
    }

    void write(std::string_view text)
    {
        if (!file_)
            return Output::standard().write(text);
        if ((kept_ += text).size() >= kPiece)
            flush();
    }
    /// No listed file may be replaced by the table.
    void requireOther(const std::string& path)
    {
        struct stat status = {};
        if (!isThere_ || ::stat(path.c_str(), &status) != 0 || status.st_dev != replaced_.st_dev ||
            status.st_ino != replaced_.st_ino)
            return;
        isRefused_ = true;
        throw Failure("the table would be written over the file itself");
    }
    void finish()
    {
        if (!file_ || isRefused_)
            return;
        flush();
        file_->finish();
    }

private:
    static constexpr std::size_t kPiece = 1 << 16;
    void flush()
    {
        file_->write(kept_);
        kept_.clear();
    }

    std::unique_ptr<OutputFile> file_;
    std::string kept_;
    struct stat replaced_ = {};
    bool isThere_ = false;
    std::atomic<bool> isRefused_ = false;
};

bool writeTable(const ExportArguments& arguments, const OutputOptions& options)
{
    const MetaGroups groups = arguments.only.empty() ? MetaGroups() : metaGroupsFromText(arguments.only);
    const bool isXML = arguments.xml || (!arguments.csv && arguments.out.ends_with(".xml"));
    TableOutput output(arguments);
    const Sink sink = [&](std::string_view text) { output.write(text); };
    std::unique_ptr<MetaTableWriter> writer;
    if (isXML)
        writer = std::make_unique<MetaXMLWriter>(sink);
    else
        writer = std::make_unique<MetaCSVWriter>(sink, arguments.isMarked);
    const FileLoop loop{.threads = arguments.threads, .doing = "exporting", .quiet = options.quiet};
    const bool good = writeFileByFile(*writer, arguments.files, loop, [&](const FoundFile& file) {
        const FileAccess access = accessForReading(file.path, {.quiet = options.quiet});
        const HeldMetadata held = holdEdited(file.path, groups);
        output.requireOther(file.path);
        return cellsOf(held, groups);
    });
    output.finish();
    return good;
}

bool runExport(const ExportArguments& arguments, const OutputOptions& options)
{
    if (options.wantsJson())
        throw UsageError("a table is CSV or XML; ktfiles meta prints JSON");
    if (arguments.xml && arguments.isMarked)
        throw UsageError("--bom is for CSV");
    bool good = false;
    return reportingFailures(arguments.out.empty() ? "standard output" : arguments.out,
                             [&] { good = writeTable(arguments, options); }) &&
           good;
}

} // namespace

void declareMetaExport(CommandLine& commandLine, Verb& meta)
{
    static ExportArguments arguments;
    Verb& verb = commandLine.addVerb(
        "export", "Write the fields that can be set to a table, a row for each file",
        [&commandLine] { return runExport(arguments, commandLine.output()); }, &meta);
    CommandLine::addFiles(verb, arguments.files);
    const Argument csv = verb.addFlag("--csv", arguments.csv, "Write comma-separated values; unless -o names .xml");
    verb.addFlag("--xml", arguments.xml, "Write XML").excludes(csv);
    verb.addFlag("--bom", arguments.isMarked, "Begin CSV with a mark by which spreadsheets know UTF-8");
    CommandLine::addPath(verb, "-o,--output", arguments.out, "The file to write; else standard output").label("OUT");
    CommandLine::addForceOption(verb, arguments.existing);
    verb.addText("--only", arguments.only, "Only these, behind commas: bext, ixml, info, cue, smpl, …").label("GROUPS");
    addThreads(verb, arguments.threads);
}
