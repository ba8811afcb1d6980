// ktfiles chunks get: writes the body of a chunk to standard output or a file.
#include "tool/chunks/ChunksCommand.h"
#include "tool/chunks/SidecarChunks.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/edits/OutputFile.h"
#include "tool/shared/input/ChunkBody.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Progress.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <algorithm>
#include <unistd.h>

namespace {

constexpr std::int64_t kPiece = 1 << 20;

struct GetArguments {
    std::string file;
    FourCC id = 0;
    std::string out;
    OutputFile::Existing existing = OutputFile::Existing::refuse;
    std::string sidecar; // the extension; empty: the container only
};

// Whether a body could confuse a terminal; text, as in "iXML" and "axml", may be shown there.
bool isBinary(std::string_view bytes)
{
    return isMisleading(bytes) || std::any_of(bytes.begin(), bytes.end(), [](char c) {
               const auto byte = static_cast<unsigned char>(c);
               return (byte < 0x20 && c != '\n' && c != '\r' && c != '\t') || byte == 0x7F;
           });
}

/// Passes a body to the sink, piece by piece.
using Source = std::function<void(const Sink&)>;

void copyBody(CAudioFileIO& file, std::int64_t offset, std::int64_t size, bool quiet, const Sink& sink)
{
    std::string buffer(static_cast<std::size_t>(std::min(size, kPiece)), '\0');
    Progress progress("reading", size, quiet);
    for (std::int64_t done = 0; done < size;) {
        const std::int64_t count = std::min(size - done, kPiece);
        requireOK(file.Read(buffer.data(), offset + done, static_cast<long>(count), nullptr));
        sink({buffer.data(), static_cast<std::size_t>(count)});
        done += count;
        progress.advance(count);
    }
}

void getToOutput(const Source& body, bool anyBytes)
{
    Output& output = Output::standard();
    const bool careful = !anyBytes && isTerminal(STDOUT_FILENO);
    body([&](std::string_view bytes) {
        if (careful && isBinary(bytes))
            throw Failure("the chunk is not text: name a file with -o OUT, or show it all the same with -o -");
        output.write(bytes);
        if (!output.flush())
            throw Failure("the chunk could not be written whole");
    });
}

void put(const Source& body, const GetArguments& arguments)
{
    if (arguments.out.empty() || arguments.out == "-")
        getToOutput(body, arguments.out == "-");
    else
        writeOutputFile(arguments.out, arguments.file, arguments.existing, body);
}

void getFromAnywhere(const GetArguments& arguments, const OutputOptions& options)
{
    const SidecarChunk chunk = readFromAnywhere(arguments.file, arguments.id, arguments.sidecar);
    put([&](const Sink& sink) { sink(textOf(chunk.body)); }, arguments);
    if (options.wantsJson())
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", shownName(arguments.file)).member("id", fourCCText(arguments.id));
            json.member("source", chunk.source).member("size", chunk.body.size()).endObject();
        });
}

void getChunk(const GetArguments& arguments, const OutputOptions& options)
{
    const FileAccess access = accessForReading(arguments.file, {.quiet = options.quiet});
    if (!arguments.sidecar.empty())
        return getFromAnywhere(arguments, options);
    CAudioFileIO file;
    openChunks(file, arguments.file);
    const ChunkBody chunk = requireChunk(file, arguments.id);
    put([&](const Sink& sink) { copyBody(file, chunk.offset, chunk.size, options.quiet, sink); }, arguments);
    if (options.wantsJson())
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", shownName(arguments.file)).member("id", fourCCText(arguments.id));
            json.member("offset", chunk.header).member("size", chunk.size).endObject();
        });
}

} // namespace

void declareChunksGet(CommandLine& commandLine, Verb& chunks)
{
    static GetArguments arguments;
    Verb& verb = commandLine.addVerb(
        "get", "Write a chunk's body to standard output or a file; of several chunks of the id, the last",
        [&commandLine] {
            if (commandLine.output().wantsJson() && (arguments.out.empty() || arguments.out == "-"))
                throw UsageError("--json needs -o OUT, since the chunk itself goes to standard output");
            if (!arguments.sidecar.empty())
                requireNoInput(arguments.file);
            return reportingRecord(arguments.file, commandLine.output(),
                                   [&] { getChunk(arguments, commandLine.output()); });
        },
        &chunks);
    CommandLine::addFileOrInput(verb, arguments.file).required();
    CommandLine::addChunkId(verb, arguments.id).required();
    CommandLine::addPath(verb, "-o,--output", arguments.out, "The file to write").label("OUT");
    CommandLine::addForceOption(verb, arguments.existing);
    addSidecarOption(verb, arguments.sidecar);
}
