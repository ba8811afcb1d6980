#include "tool/meta/MetaCommand.h"

#include "audiofile/fields/FileMetadata.h"
#include "tool/meta/MetaText.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/arguments/ThreadsOption.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/metadata/MetaFile.h"
#include "tool/shared/output/DataRecords.h"

#include <algorithm>
#include <utility>

namespace {

struct MetaOptions {
    MetaGroups only;
    unsigned threads = 0;
};

constexpr std::size_t kIdLength = 4;

// Writes the metadata of one file after another.
class MetaWriter : DataRecords {
public:
    explicit MetaWriter(const OutputOptions& options) : DataRecords(options, metaColumns()), form_(outputForm(options))
    {
    }

    void add(const std::string&, const std::string& text)
    {
        if (form_ == Form::csv) {
            csvRecords().addRow(text);
        } else if (form_ == Form::json) {
            jsonRecords().begin().writeJson(text);
            jsonRecords().end();
        } else {
            if (form_ == Form::table && !std::exchange(isFirst_, false))
                output_.write("\n");
            output_.write(text);
        }
    }

    using DataRecords::addFailure;
    using DataRecords::finish;

private:
    Form form_;
    bool isFirst_ = true;
    Output& output_ = Output::standard();
};

std::string lowered(std::string text)
{
    for (char& c : text)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return text;
}

} // namespace

MetaGroups metaGroupsFromText(const std::string& text)
{
    const std::vector<std::string> known = MetadataGroupNames();
    MetaGroups groups;
    for (std::size_t begin = 0; begin <= text.size();) {
        const std::size_t end = std::min(text.find(',', begin), text.size());
        const std::string group = lowered(text.substr(begin, end - begin));
        if (group.empty() || (group.size() > kIdLength && std::ranges::find(known, group) == known.end()))
            throw UsageError("\"" + printable(group) +
                             "\" names no fields: bext, ixml, info, cue, id3v2 … or a chunk's id");
        groups.push_back(group);
        begin = end + 1;
    }
    return groups;
}

namespace {

bool runMeta(const FileArguments& files, const MetaOptions& wanted, const OutputOptions& options)
{
    MetaWriter writer(options);
    const MetaText text(options, files.maybeSeveral());
    const FileLoop loop{.threads = wanted.threads, .quiet = options.quiet};
    return writeFileByFile(writer, files, loop, [&](const FoundFile& file) {
        const FileAccess access = accessForReading(file.path, {.quiet = options.quiet});
        return text.of(shownName(file.path), readMetadata(file.path, wanted.only));
    });
}

void declareMeta(CommandLine& commandLine)
{
    static FileArguments files;
    static MetaOptions wanted;
    static std::string only;
    Verb& verb = commandLine.addVerb("meta", "Show what files say about themselves, by field; set or remove fields",
                                     [&commandLine] {
                                         if (!only.empty())
                                             wanted.only = metaGroupsFromText(only);
                                         return runMeta(files, wanted, commandLine.output());
                                     });
    CommandLine::addFilesOrInput(verb, files);
    addThreads(verb, wanted.threads);
    commandLine.addCsv(verb);
    verb.addText("--only", only, "Only these, behind commas: bext, ixml, info, cue, smpl, … or ids of chunks")
        .label("GROUPS");
    declareMetaEdits(commandLine, verb);
    declareMetaCopy(commandLine, verb);
    declareMetaExport(commandLine, verb);
    declareMetaImport(commandLine, verb);
}

const VerbRegistration metaRegistration{35, "meta", declareMeta};

} // namespace
