// ktfiles chunks add, and remove.
#include "ChunksCommand.h"
#include "CommandLine.h"
#include "EditGuards.h"
#include "Failure.h"
#include "InputFile.h"
#include "SidecarChunks.h"

#include <nlohmann/json.hpp>

#include <cerrno>
#include <fcntl.h>
#include <limits>
#include <sys/stat.h>
#include <unistd.h>

namespace {

struct EditArguments {
    std::string file;
    FourCC id = 0;
    std::string from;     // of "add"
    bool replace = false; // of "add"
    bool force = false;
    std::string sidecar; // the extension; empty: only the container itself
    EditOptions options;
};

std::string addStatusText(std::int32_t status)
{
    switch (status) {
    case 0:
        return "the file is not chunk-based";
    case -2:
        return "its container header cannot be read";
    case -3:
        return "the new chunk's header cannot be written";
    case -4:
        return "the new chunk's body cannot be written";
    case -5:
        return "its container header cannot be written";
    case -6:
        return "is not open for writing";
    case -7:
        return "the chunk to replace cannot be removed";
    case -8:
        return "its chunks cannot be walked";
    case -9:
        return "the chunk is too large for the container";
    case kStatusEndOfFile:
        return "its container has a negative size";
    default:
        return StatusText(status);
    }
}

// The container's codes say which step failed; the system's last error often says why.
[[noreturn]] void failToAdd(std::int32_t status, int systemError)
{
    const bool writing = status <= -3 && status >= -5;
    throw Failure(addStatusText(status) + (writing && systemError != 0 ? ": " + systemErrorText(systemError) : ""));
}

Bytes readAll(const std::string& from)
{
    const bool standardInput = from.empty() || from == "-";
    if (from.empty() && isTerminal(STDIN_FILENO))
        throw CLI::ValidationError("name the chunk's content with --from IN, or type it after --from -");
    const Descriptor opened(standardInput ? -1 : ::open(from.c_str(), O_RDONLY | O_NOCTTY | O_CLOEXEC));
    const int descriptor = standardInput ? STDIN_FILENO : opened.get();
    const std::string name = standardInput ? "standard input" : from;
    constexpr std::size_t kStep = 1 << 20;
    Bytes bytes;
    std::size_t length = 0;
    for (;;) {
        if (bytes.size() - length < kStep)
            bytes.resize(std::max(bytes.size() * 2, kStep));
        const ssize_t got = ::read(descriptor, bytes.data() + length, bytes.size() - length);
        if (got < 0 && errno != EINTR)
            throw Failure(name + ": " + systemErrorText(errno));
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

void refuseBackup(const EditArguments& arguments)
{
    if (arguments.options.backup)
        throw Failure("keeps its chunks beside it and is not changed: there is nothing to back up");
}

ChunkSurvey survey(const std::string& path, FourCC id)
{
    CAudioFileIO file;
    openContainer(file, path, 0);
    return surveyChunks(file, id);
}

void removeFrom(const std::string& path, FourCC id)
{
    // The library removes one chunk at a time from a CAF file, and all at once from others.
    for (std::int64_t left = survey(path, id).count; left > 0;) {
        CAudioFileIO file;
        openContainer(file, path, kFileIOReadWrite);
        requireOK(file.RemoveChunk(id));
        requireOK(file.Close());
        const std::int64_t now = survey(path, id).count;
        if (now >= left)
            throw Failure("the chunk \"" + fourCCText(id) + "\" cannot be removed: its body cannot be read");
        left = now;
    }
}

void addTo(const std::string& path, const EditArguments& arguments, const Bytes& body)
{
    if (arguments.replace) // not left to AddChunk, which removes only the first of them from a CAF file
        removeFrom(path, arguments.id);
    CAudioFileIO file;
    openContainer(file, path, kFileIOReadWrite);
    const std::int64_t before = surveyChunks(file, arguments.id).count;
    settleOpenEndedData(file);
    const std::int64_t length = file.GetEOF();
    errno = 0;
    const std::int32_t status = file.AddChunk(arguments.id, body, false);
    if (status != 1)
        failToAdd(status, errno);
    requireOK(file.Close());
    const ChunkSurvey after = survey(path, arguments.id);
    if (after.count != before + 1 || after.last->id != arguments.id ||
        after.last->size != static_cast<std::int64_t>(body.size()))
        throw Failure("the chunk is not found as it should be after the edit");
    if (after.last->offset < length && !arguments.force)
        throw Failure("the chunk was not put behind all that is there");
}

struct EditReport {
    const char* action;
    std::int64_t count; // chunks
    std::int64_t size;  // bytes of their bodies
    std::int64_t replaced = 0;
    std::string backup = {};
    std::string where = {}; // the file that was changed, if not the one that was named
};

void print(const EditArguments& arguments, const OutputOptions& output, const EditReport& report)
{
    const bool adds = report.action == std::string_view("add");
    if (output.json) {
        nlohmann::ordered_json json{{"path", arguments.file},
                                    {"action", report.action},
                                    {"id", fourCCText(arguments.id)},
                                    {"count", report.count},
                                    {"size", report.size}};
        if (adds)
            json["replaced"] = report.replaced;
        json["dryRun"] = arguments.options.dryRun;
        if (!report.where.empty())
            json["where"] = report.where;
        if (!report.backup.empty())
            json["backup"] = report.backup;
        Output::standard().print("{}\n", jsonText(json));
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

// With a sidecar every older copy goes, so that a container's own must be one that may.
void addAnywhereOrRefuse(const EditArguments& arguments, const OutputOptions& output, const Bytes& body)
{
    SafeEdit edit(arguments.file, arguments.options);
    const bool inFile = keepsItsChunks(edit.target());
    if (!inFile)
        refuseBackup(arguments);
    EditReport report{"add", 1, std::ssize(body)};
    if (inFile) {
        CAudioFileIO file;
        openContainer(file, edit.target(), 0);
        const ChunkSurvey found = surveyChunks(file, arguments.id);
        refuseUnlessForced(objectionToAdding(file, found, arguments.id, report.size), arguments.force);
        report.replaced = found.count;
    }
    SidecarEdit done = addAnywhere(edit, arguments.id, body, arguments.sidecar, arguments.options.dryRun);
    report.backup = done.backup;
    if (!inFile)
        report.where = done.where;
    print(arguments, output, report);
}

void removeEverywhereOrRefuse(const EditArguments& arguments, const OutputOptions& output)
{
    SafeEdit edit(arguments.file, arguments.options);
    if (keepsItsChunks(edit.target()))
        refuseUnlessForced(objectionToRemoving(survey(edit.target(), arguments.id), arguments.id), arguments.force);
    else
        refuseBackup(arguments);
    EditReport report{"remove", 0, -1};
    SidecarEdit done = removeEverywhere(edit, arguments.id, arguments.sidecar, arguments.options.dryRun, report.count);
    report.backup = done.backup;
    if (done.where != edit.target())
        report.where = done.where;
    print(arguments, output, report);
}

void addChunk(const EditArguments& arguments, const OutputOptions& output)
{
    requireRegularFile(arguments.file);
    if (arguments.id == 0)
        throw Failure("an id of four zero bytes cannot be told from no chunk");
    const Bytes body = readAll(arguments.from);
    if (!arguments.sidecar.empty())
        return addAnywhereOrRefuse(arguments, output, body);
    SafeEdit edit(arguments.file, arguments.options);
    EditReport report{"add", 1, static_cast<std::int64_t>(body.size())};
    {
        CAudioFileIO file;
        openContainer(file, edit.target(), 0);
        const ChunkSurvey found = surveyChunks(file, arguments.id);
        refuseUnlessForced(objectionToAdding(file, found, arguments.id, report.size), arguments.force);
        report.replaced = arguments.replace ? found.count : 0;
    }
    if (!arguments.options.dryRun)
        report.backup = edit.apply([&](const std::string& path) { addTo(path, arguments, body); });
    print(arguments, output, report);
}

void removeChunks(const EditArguments& arguments, const OutputOptions& output)
{
    if (!arguments.sidecar.empty())
        return removeEverywhereOrRefuse(arguments, output);
    SafeEdit edit(arguments.file, arguments.options);
    const ChunkSurvey found = survey(edit.target(), arguments.id);
    if (found.count == 0)
        throw Failure("has no chunk \"" + fourCCText(arguments.id) + "\"");
    refuseUnlessForced(objectionToRemoving(found, arguments.id), arguments.force);
    EditReport report{"remove", found.count, found.total};
    if (!arguments.options.dryRun)
        report.backup = edit.apply([&](const std::string& path) { removeFrom(path, arguments.id); });
    print(arguments, output, report);
}

CLI::App& declareEdit(CommandLine& commandLine, CLI::App& chunks, const std::string& name,
                      const std::string& description, EditArguments& arguments,
                      void (*edit)(const EditArguments&, const OutputOptions&))
{
    CLI::App& verb = commandLine.addVerb(
        name, description,
        [&commandLine, &arguments, edit] {
            arguments.options.quiet = commandLine.output().quiet;
            return reportingFailures(arguments.file, [&] { edit(arguments, commandLine.output()); });
        },
        &chunks);
    CommandLine::addFile(verb, arguments.file)->required();
    CommandLine::addChunkId(verb, arguments.id)->required();
    verb.add_flag("--force", arguments.force, "Do it even where sound or other data would be lost");
    addSidecarOption(verb, arguments.sidecar);
    CommandLine::addEditOptions(verb, arguments.options);
    return verb;
}

} // namespace

void declareChunkEdits(CommandLine& commandLine, CLI::App& chunks)
{
    static EditArguments toAdd, toRemove;
    CLI::App& add = declareEdit(commandLine, chunks, "add", "Put a chunk behind the last one", toAdd, addChunk);
    CommandLine::addPath(add, "--from", toAdd.from, "The file that holds its body; else standard input")
        ->option_text("IN");
    add.add_flag("--replace", toAdd.replace, "Remove the chunks that have the id already");
    declareEdit(commandLine, chunks, "remove", "Remove every chunk of an id", toRemove, removeChunks);
}
