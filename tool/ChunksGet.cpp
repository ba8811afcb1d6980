// ktfiles chunks get: the body of a chunk, to standard output or a file.
#include "ChunkBody.h"
#include "ChunksCommand.h"
#include "CommandLine.h"
#include "EditGuards.h"
#include "Failure.h"
#include "InputFile.h"
#include "Progress.h"
#include "TemporaryFile.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr std::int64_t kPiece = 1 << 20;

struct GetArguments {
    std::string file;
    FourCC id = 0;
    std::string out;
};

void writeWhole(int descriptor, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR)
            throw Failure("the output cannot be written: " + systemErrorText(errno));
        bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
    }
}

// A body that would do mischief on a terminal; text, as in "iXML" and "axml", is welcome there.
bool isBinary(std::string_view bytes)
{
    return std::any_of(bytes.begin(), bytes.end(), [](char c) {
        const auto byte = static_cast<unsigned char>(c);
        return (byte < 0x20 && c != '\n' && c != '\r' && c != '\t') || byte == 0x7F;
    });
}

using Sink = std::function<void(std::string_view)>;

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

void getToOutput(CAudioFileIO& file, std::int64_t offset, std::int64_t size, bool quiet, bool anyBytes)
{
    Output& output = Output::standard();
    const bool careful = !anyBytes && isTerminal(STDOUT_FILENO);
    copyBody(file, offset, size, quiet, [&](std::string_view bytes) {
        if (careful && isBinary(bytes))
            throw Failure("the chunk is not text: name a file with -o OUT, or show it all the same with -o -");
        output.write(bytes);
        if (!output.flush())
            throw Failure("the chunk could not be written whole");
    });
}

// A regular file takes its name when it is whole; a device or a FIFO is written as it is.
void getToFile(CAudioFileIO& file, std::int64_t offset, std::int64_t size, bool quiet, const GetArguments& arguments)
{
    struct stat source = {}, existing = {};
    const bool exists = ::stat(arguments.out.c_str(), &existing) == 0;
    if (exists && S_ISDIR(existing.st_mode))
        throw Failure(arguments.out + " is a folder");
    if (exists && ::stat(arguments.file.c_str(), &source) == 0 && source.st_dev == existing.st_dev &&
        source.st_ino == existing.st_ino)
        throw Failure("the chunk would be written over the file itself");
    if (exists && !S_ISREG(existing.st_mode)) {
        const Descriptor out(::open(arguments.out.c_str(), O_WRONLY | O_NOCTTY | O_CLOEXEC));
        copyBody(file, offset, size, quiet, [&](std::string_view bytes) { writeWhole(out.get(), bytes); });
        return;
    }
    const std::string target = exists ? std::filesystem::canonical(arguments.out).string() : arguments.out;
    if (exists && ::access(target.c_str(), W_OK) != 0)
        throw Failure(arguments.out + ": " + systemErrorText(errno));
    TemporaryFile out(target);
    copyBody(file, offset, size, quiet, [&](std::string_view bytes) { writeWhole(out.descriptor(), bytes); });
    const mode_t mask = ::umask(0);
    ::umask(mask);
    if (::fchmod(out.descriptor(), exists ? existing.st_mode & 0777 : 0666 & ~mask) != 0)
        throw Failure(systemErrorText(errno));
    out.replace(target);
}

void getChunk(const GetArguments& arguments, const OutputOptions& options)
{
    CAudioFileIO file;
    openContainer(file, arguments.file, 0);
    const ChunkSurvey survey = surveyChunks(file, arguments.id);
    const std::string id = fourCCText(arguments.id);
    if (!survey.found)
        throw Failure("has no chunk \"" + id + "\"");
    const std::int64_t offset = bodyOffset(*survey.found, survey.extent);
    const std::int64_t size = survey.found->size;
    const std::int64_t there = std::max<std::int64_t>(survey.extent.fileLength - offset, 0);
    if (size < 0 || size > there)
        throw Failure(fmt::format("its chunk \"{}\" claims {} bytes, but {} are there", id, size, there));
    if (arguments.out.empty() || arguments.out == "-")
        getToOutput(file, offset, size, options.quiet, arguments.out == "-");
    else
        getToFile(file, offset, size, options.quiet, arguments);
    if (options.json)
        Output::standard().print(
            "{}\n", jsonText({{"path", arguments.file}, {"id", id}, {"offset", survey.found->offset}, {"size", size}}));
}

} // namespace

void declareChunksGet(CommandLine& commandLine, CLI::App& chunks)
{
    static GetArguments arguments;
    CLI::App& verb = commandLine.addVerb(
        "get", "Write a chunk's body to standard output or a file; of several chunks of the id, the last",
        [&commandLine] {
            if (commandLine.output().json && (arguments.out.empty() || arguments.out == "-"))
                throw CLI::ValidationError("--json needs -o OUT, since the chunk itself goes to standard output");
            return reportingFailures(arguments.file, [&] { getChunk(arguments, commandLine.output()); });
        },
        &chunks);
    CommandLine::addFile(verb, arguments.file)->required();
    CommandLine::addChunkId(verb, arguments.id)->required();
    CommandLine::addPath(verb, "-o,--output", arguments.out, "The file to write")->option_text("OUT");
}
