#include "tool/chunks/ChunksCommand.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/FileByFile.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/HeadingName.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <algorithm>
#include <array>
#include <optional>

namespace {

/// The kind of list that a chunk's body begins with, if it contains chunks; else 0. In Wave64, the name in its
/// identifier.
FourCC formOf(CAudioFileIO& file, const ContainerExtent& extent, const ChunkEntry& chunk)
{
    static constexpr std::array lists{fourCC("LIST"), fourCC("list"), fourCC("FORM"), fourCC("CAT ")};
    std::array<std::byte, sizeof(FourCC)> form{};
    const std::int64_t there = std::min(chunk.size, extent.fileLength - chunk.body);
    if (std::find(lists.begin(), lists.end(), chunk.id) == lists.end() || there < std::ssize(form))
        return 0;
    requireOK(file.Read(form.data(), chunk.body, std::ssize(form), nullptr));
    return loadBE<FourCC>(form.data());
}

// Writes the list of one file chunk by chunk, without holding it: files may have hundreds of thousands of chunks.
class ChunkListWriter {
public:
    /// With `several` files each line, or heading, names its file. A list that `follows` another is separated from it.
    ChunkListWriter(const OutputOptions& options, JsonRecords& json, std::string path, bool several, bool follows)
        : json_(json),
          form_(outputForm(options)),
          color_(usesColor(options.color)),
          several_(several),
          follows_(follows),
          path_(std::move(path))
    {
    }

    void begin(const ContainerExtent& extent)
    {
        extent_ = extent;
        if (form_ == Form::json) {
            JsonWriter& json = json_.begin();
            json.beginObject();
            json.member("path", path_).member("container", fourCCText(extent.id));
            json.member("containerEnd", extent.end).member("fileLength", extent.fileLength);
            json.key("chunks").beginArray();
            list_ = &json;
        } else if (form_ == Form::table) {
            const std::string rest = fmt::format("  {}, {} bytes", fourCCText(extent.id), extent.end);
            output_.print("{}{}{}\n", follows_ ? "\n" : "", headingName(path_, rest), rest);
            table_.emplace(std::vector<Table::Column>{{"ID", Align::left, kWidestId},
                                                      {"OFFSET", Align::right, numberWidth()},
                                                      {"SIZE", Align::right, numberWidth()}});
            table_->printTitles(output_, color_);
        }
    }

    /// `form` is 0 for a chunk without one.
    bool add(const ChunkEntry& chunk, FourCC form)
    {
        const std::string id = fourCCText(chunk.id), formText = form != 0 ? fourCCText(form) : "";
        const std::int64_t there = std::max<std::int64_t>(extent_.fileLength - chunk.body, 0);
        const bool isCut = chunk.size > there;
        if (form_ == Form::json) {
            JsonWriter& json = list_->newLine().beginObject().member("id", id).knownMember("form", formText);
            json.member("offset", chunk.offset).member("size", chunk.size);
            json.knownMember("presentBytes", isCut ? std::optional(there) : std::nullopt).endObject();
        } else if (form_ == Form::table) {
            const std::string name = form != 0 ? fmt::format("{} ({})", id, formText) : id;
            const std::string rest = isCut ? fmt::format(", {} of them in the file", there) : "";
            table_->printRow(output_, {name, std::to_string(chunk.offset),
                                       fmt::format("{:>{}}{}", chunk.size, numberWidth(), rest)});
        } else if (form_ == Form::lines) {
            output_.print("{}{}{}\t{}\t{}{}{}\n", several_ ? printable(path_) : "", several_ ? "\t" : "", id,
                          chunk.offset, chunk.size, form != 0 ? "\t" : "", formText);
        }
        return !output_.failed();
    }

    /// Ends a list that has begun; `error` is empty if all went well.
    void end(const std::string& error)
    {
        if (form_ == Form::json)
            endList(error);
        else if (form_ == Form::table && extent_.end < extent_.fileLength)
            output_.print("{} bytes follow the container\n", extent_.fileLength - extent_.end);
    }

private:
    static constexpr int kWidestId = 11; // "LIST (INFO)"

    int numberWidth() const { return std::max(static_cast<int>(fmt::formatted_size("{}", extent_.fileLength)), 6); }

    void endList(const std::string& error)
    {
        list_->endArrayOfLines();
        if (!error.empty())
            list_->member("error", error);
        list_->endObject();
        json_.end();
    }

    JsonRecords& json_;
    JsonWriter* list_ = nullptr; // in the file's object, once begun
    Form form_;
    bool color_;
    bool several_, follows_;
    std::string path_;
    ContainerExtent extent_;
    std::optional<Table> table_;
    Output& output_ = Output::standard();
};

// Once the list of a file has begun, a problem is not thrown but returned, and `writer` ends the list with it.
std::string listFile(const std::string& path, ChunkListWriter& writer, bool quiet)
{
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    CAudioFileIO file;
    openChunks(file, path);
    ContainerExtent extent;
    bool begun = false;
    const std::int32_t status = file.ForEachChunk(
        [&](const ChunkEntry& chunk) {
            if (!std::exchange(begun, true))
                writer.begin(extent);
            return writer.add(chunk, formOf(file, extent, chunk));
        },
        &extent);
    if (status != kStatusOK && !begun)
        failForSound(path, status);
    if (!begun)
        writer.begin(extent);
    std::string error = status != kStatusOK ? "a chunk header cannot be read" : "";
    writer.end(error);
    return error;
}

bool runList(const FileArguments& files, const OutputOptions& options)
{
    Output& output = Output::standard();
    const bool several = files.maybeSeveral();
    const bool table = outputForm(options) == Form::table;
    JsonRecords json(options);
    bool isFirst = true, isWhole = true;
    const bool good = forEachFile(
        files, {.quiet = options.quiet},
        [&](const FoundFile& file) -> FileRest {
            const bool follows = table && !isFirst;
            ChunkListWriter writer(options, json, shownName(file.path), several, follows);
            const std::string error = listFile(file.path, writer, options.quiet);
            isFirst = false;
            if (!error.empty()) {
                isWhole = false;
                output.flush();
                reportFailure(file.path, error);
            }
            return [] {};
        },
        [&](const std::string& path, const std::string& text) {
            if (options.wantsJson())
                json.addFailure(path, text);
        });
    if (options.wantsJson())
        json.finish();
    return good && isWhole;
}

void declareChunks(CommandLine& commandLine)
{
    static FileArguments files;
    Verb& verb = commandLine.addVerb("chunks", "List the chunks of audio files; get, add or remove one",
                                     [&commandLine] { return runList(files, commandLine.output()); });
    CommandLine::addFilesOrInput(verb, files);
    declareChunksGet(commandLine, verb);
    declareChunkEdits(commandLine, verb);
}

const VerbRegistration chunksRegistration{20, "chunks", declareChunks};

} // namespace
