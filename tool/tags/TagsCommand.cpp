#include "tool/tags/TagsCommand.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/looptags/LoopTagFiles.h"
#include "tool/shared/looptags/LoopTagWords.h"
#include "tool/shared/looptags/LoopTagsCsv.h"
#include "tool/shared/output/DataRecords.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/HeadingName.h"

namespace {

// Writes the tags of one file after another, each as soon as they are read.
class TagsWriter : DataRecords {
public:
    /// With `several` files each line names its file.
    TagsWriter(const OutputOptions& options, bool several)
        : DataRecords(options, loopColumns()),
          form_(outputForm(options)),
          color_(usesColor(options.color)),
          several_(several)
    {
    }

    void add(const std::string& path, const LoopTags& tags)
    {
        if (form_ == Form::json) {
            writeLoopTags(jsonRecords().begin(), path, tags);
            jsonRecords().end();
        } else if (form_ == Form::csv) {
            csvRecords().addRow(loopRow(path, tags));
        } else if (form_ == Form::table) {
            addTable(path, tags);
        } else if (form_ == Form::lines) {
            for (const TagLine& line : tagLines(tags))
                output_.print("{}{}{}\t{}\n", several_ ? printable(path) : "", several_ ? "\t" : "", line.name,
                              line.text);
        }
        first_ = false;
    }

    using DataRecords::addFailure;
    using DataRecords::finish;

private:
    void addTable(const std::string& path, const LoopTags& tags)
    {
        constexpr int kLabelWidth = 12, kIndent = kLabelWidth + 4;
        const std::string rest = fmt::format("  {}", loopContainerName(tags.fileType));
        output_.print("{}{}{}{}{}\n", first_ ? "" : "\n", color_ ? "\x1b[1m" : "", headingName(path, rest),
                      color_ ? "\x1b[0m" : "", rest);
        const auto lines = tagLines(tags);
        for (const TagLine& line : lines) {
            const bool isTempo = line.name == std::string_view("tempo");
            const std::string text = fmt::format("{}{}{}", line.brief, isTempo ? " BPM" : "",
                                                 line.source.empty() ? "" : fmt::format("  [{}]", line.source));
            output_.print("  {:<{}}  {}\n", line.label, kLabelWidth,
                          columns_ ? wrapped(text, *columns_, kIndent, kIndent) : text);
        }
        if (lines.empty())
            output_.print("  no loop tags\n");
    }

    Form form_;
    bool color_;
    bool several_;
    bool first_ = true;
    std::optional<int> columns_ = columnsOfOutput();
    Output& output_ = Output::standard();
};

bool runTags(const FileArguments& files, unsigned threads, const OutputOptions& options)
{
    TagsWriter writer(options, files.maybeSeveral());
    const FileLoop loop{.threads = threads, .quiet = options.quiet};
    return writeFileByFile(writer, files, loop, [&](const FoundFile& file) {
        const FileAccess access = accessForReading(file.path, {.quiet = options.quiet});
        return loopTagsOf(file.path);
    });
}

void declareTags(CommandLine& commandLine)
{
    static FileArguments files;
    static unsigned threads = 0;
    Verb& verb = commandLine.addVerb("tags", "Show the tags of loops, and where they stand; set, remove or copy some",
                                     [&commandLine] { return runTags(files, threads, commandLine.output()); });
    CommandLine::addFilesOrInput(verb, files);
    commandLine.addCsv(verb);
    addThreads(verb, threads);
    declareTagsSet(commandLine, verb);
    declareTagsRemove(commandLine, verb);
    declareTagsCopy(commandLine, verb);
}

const VerbRegistration tagsRegistration{30, "tags", declareTags};

} // namespace
