// ktfiles chunks add, and remove.
#include "audiofile/ContainerChanges.h"
#include "platform/OwnedDescriptor.h"
#include "tool/chunks/ChunksCommand.h"
#include "tool/chunks/SidecarChunks.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/edits/EditProblems.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"

#include <cerrno>
#include <fcntl.h>
#include <limits>
#include <unistd.h>

namespace {

struct EditArguments {
    std::string file;
    FourCC id = 0;
    std::string from;     // of "add"
    bool replace = false; // of "add"
    bool force = false;
    std::string sidecar; // the extension; empty: the container only
    EditOptions options;
};

Bytes readAll(const std::string& from)
{
    const bool standardInput = from.empty() || from == "-";
    if (from.empty() && isTerminal(STDIN_FILENO))
        throw UsageError("name the chunk's content with --from IN, or type it after --from -");
    const platform::OwnedDescriptor opened(standardInput ? -1 : ::open(from.c_str(), O_RDONLY | O_NOCTTY | O_CLOEXEC));
    const int descriptor = standardInput ? STDIN_FILENO : opened.get();
    const std::string name = standardInput ? "standard input" : from;
    if (!standardInput && !opened)
        throw Failure(name + ": " + SystemErrorText(errno));
    constexpr std::size_t kStep = 1 << 20;
    Bytes bytes;
    std::size_t length = 0;
    for (;;) {
        if (bytes.size() - length < kStep)
            bytes.resize(std::max(bytes.size() * 2, kStep));
        const ssize_t got = ::read(descriptor, bytes.data() + length, bytes.size() - length);
        if (got < 0 && errno != EINTR)
            throw Failure(name + (errno == EISDIR ? " is a folder" : ": " + SystemErrorText(errno)));
        if (got == 0)
            break;
        length += static_cast<std::size_t>(std::max<ssize_t>(got, 0));
        if (length > std::numeric_limits<std::uint32_t>::max())
            throw Failure(name + " is too large for a chunk");
    }
    bytes.resize(length);
    return bytes;
}

void refuseUnlessForced(const std::optional<std::string>& objection, bool force)
{
    if (objection && !force)
        throw Failure(*objection + "; --force does it all the same");
}

struct EditReport {
    const char* action;
    std::int64_t count; // chunks
    std::int64_t size;  // bytes of their bodies
    std::int64_t replaced = 0;
    std::string backup = {};
    std::string where = {}; // the file that was changed, if it is another
};

void print(const EditArguments& arguments, const OutputOptions& output, const EditReport& report)
{
    const bool adds = report.action == std::string_view("add");
    if (output.wantsJson()) {
        writeRecord(output, [&](JsonWriter& json) {
            json.beginObject();
            json.member("path", shownName(arguments.file));
            json.member("action", report.action);
            json.member("id", fourCCText(arguments.id));
            json.member("count", report.count);
            if (report.size >= 0)
                json.member("size", report.size);
            if (adds)
                json.member("replaced", report.replaced);
            json.member("dryRun", arguments.options.dryRun);
            json.knownMember("where", shownName(report.where)).knownMember("backup", shownName(report.backup));
            json.endObject();
        });
    } else if (!output.quiet) {
        const std::string what = report.count == 1 ? "chunk" : fmt::format("{} chunks", report.count);
        const char* const verb =
            arguments.options.dryRun ? (adds ? "would add" : "would remove") : (adds ? "added" : "removed");
        Output::standard().print("{}: {} {} \"{}\"{}{}{}{}\n", printable(arguments.file), verb, what,
                                 fourCCText(arguments.id),
                                 report.size < 0 ? "" : fmt::format(", {} bytes", report.size),
                                 report.where.empty() ? "" : ", in " + printable(report.where),
                                 report.replaced > 0 ? fmt::format(", in the place of {}", report.replaced) : "",
                                 report.backup.empty() ? "" : "; backup " + printable(report.backup));
    }
}

// Anything that --force overrules is reported first; so damaged a file cannot be compared afterwards.
EditScope scopeOf(const EditArguments& arguments, const std::optional<std::string>& objection)
{
    refuseUnlessForced(objection, arguments.force);
    return objection ? EditScope::wholeFile() : EditScope::chunk(arguments.id);
}

EditReport addToContainer(const EditArguments& arguments, const Bytes& body)
{
    SafeEdit edit(arguments.file, arguments.options);
    EditReport report{"add", 1, std::ssize(body)};
    std::optional<std::string> objection;
    {
        CAudioFileIO file;
        openContainer(file, edit.target(), 0);
        const ChunkSurvey found = surveyChunks(file, arguments.id);
        objection = objectionToAdding(file, found, arguments.id);
        report.replaced = arguments.replace ? found.count : 0;
    }
    const EditScope scope = scopeOf(arguments, objection);
    if (!arguments.options.dryRun)
        report.backup = edit.apply(scope, [&](const std::string& path) {
            requireNone(AddChunkTo(referenceTo(path), {arguments.id, body, arguments.replace, arguments.force}));
        });
    return report;
}

EditReport removeFromContainer(const EditArguments& arguments)
{
    SafeEdit edit(arguments.file, arguments.options);
    const ChunkSurvey found = surveyOf(edit.target(), arguments.id);
    if (found.count == 0)
        throw Failure("has no chunk \"" + fourCCText(arguments.id) + "\"");
    const EditScope scope = scopeOf(arguments, objectionToRemoving(found, arguments.id));
    EditReport report{"remove", found.count, found.total};
    if (!arguments.options.dryRun)
        report.backup = edit.apply(scope, [&](const std::string& path) {
            requireNone(RemoveChunksFrom(referenceTo(path), arguments.id, found.count));
        });
    return report;
}

void refuseBackup(const EditArguments& arguments)
{
    if (arguments.options.backup)
        throw Failure("keeps its chunks beside it and is not changed: there is nothing to back up");
}

// With a sidecar every older copy is removed.
EditReport addAnywhere(EditArguments arguments, const Bytes& body)
{
    Sidecars sidecars(arguments.file, arguments.sidecar, arguments.options);
    refuseUnlessForced(sidecars.objection(), arguments.force);
    if (keepsItsChunks(sidecars.file())) {
        arguments.replace = true;
        const EditReport report = addToContainer(arguments, body);
        sidecars.removeRaw();
        return report;
    }
    refuseBackup(arguments);
    EditReport report{"add", 1, std::ssize(body)};
    report.where = sidecars.add(arguments.id, body, arguments.force);
    return report;
}

EditReport removeEverywhere(const EditArguments& arguments)
{
    Sidecars sidecars(arguments.file, arguments.sidecar, arguments.options);
    refuseUnlessForced(sidecars.objection(), arguments.force);
    const bool inFile = keepsItsChunks(sidecars.file());
    if (!inFile)
        refuseBackup(arguments);
    const std::int64_t count = inFile ? surveyOf(sidecars.file(), arguments.id).count : 0;
    EditReport report{"remove", 0, -1};
    if (count > 0)
        report = removeFromContainer(arguments);
    report.size = -1;
    const SidecarRemoval beside = sidecars.remove(arguments.id);
    if (report.count + beside.count == 0)
        throw Failure("has no chunk \"" + fourCCText(arguments.id) + "\", and neither have its sidecars");
    if (report.count == 0)
        report.where = beside.where;
    report.count += beside.count;
    return report;
}

void addChunk(const EditArguments& arguments, const OutputOptions& output)
{
    requireRegularFile(arguments.file);
    if (arguments.id == 0)
        throw Failure("an id of four zero bytes cannot be told from no chunk");
    const Bytes body = readAll(arguments.from);
    print(arguments, output,
          arguments.sidecar.empty() ? addToContainer(arguments, body) : addAnywhere(arguments, body));
}

void removeChunks(const EditArguments& arguments, const OutputOptions& output)
{
    print(arguments, output, arguments.sidecar.empty() ? removeFromContainer(arguments) : removeEverywhere(arguments));
}

Verb& declareEdit(CommandLine& commandLine, Verb& chunks, const std::string& name, const std::string& description,
                  EditArguments& arguments, void (*edit)(const EditArguments&, const OutputOptions&))
{
    Verb& verb = commandLine.addVerb(
        name, description,
        [&commandLine, &arguments, edit] {
            arguments.options.quiet = commandLine.output().quiet;
            return reportingRecord(arguments.file, commandLine.output(),
                                   [&] { edit(arguments, commandLine.output()); });
        },
        &chunks);
    CommandLine::addFile(verb, arguments.file).required();
    CommandLine::addChunkId(verb, arguments.id).required();
    verb.addFlag("--force", arguments.force,
                 "Do it even where sound or other data would be lost, or a sidecar is a recording");
    addSidecarOption(verb, arguments.sidecar);
    CommandLine::addEditOptions(verb, arguments.options);
    return verb;
}

} // namespace

void declareChunkEdits(CommandLine& commandLine, Verb& chunks)
{
    static EditArguments toAdd, toRemove;
    Verb& add = declareEdit(commandLine, chunks, "add", "Put a chunk behind the last one", toAdd, addChunk);
    CommandLine::addPath(add, "--from", toAdd.from, "The file that holds its body; else standard input").label("IN");
    add.addFlag("--replace", toAdd.replace, "Remove the chunks that have the id already");
    declareEdit(commandLine, chunks, "remove", "Remove every chunk of an id", toRemove, removeChunks);
}
