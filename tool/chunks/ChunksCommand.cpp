#include "tool/chunks/ChunksCommand.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <optional>

namespace {

// Writes the list of one file chunk by chunk: files of hundreds of thousands of chunks are listed, not held.
class ChunkListWriter {
public:
    /// With `several` files each line, or heading, says which.
    ChunkListWriter(const OutputOptions& options, JsonRecords& json, std::string path, bool several)
        : json_(json),
          form_(outputForm(options)),
          color_(usesColor(options.color)),
          several_(several),
          path_(std::move(path))
    {
    }

    void begin(const ContainerExtent& extent)
    {
        extent_ = extent;
        begun_ = true;
        if (form_ == Form::json) {
            JsonWriter& json = json_.next();
            json.beginObject();
            json.member("path", path_).member("container", fourCCText(extent.id)).member("containerEnd", extent.end);
            json.key("chunks").beginArray();
            list_ = &json;
        } else if (form_ == Form::table) {
            output_.print("{}  {}, {} bytes\n", printable(path_), fourCCText(extent.id), extent.end);
            const int width = std::max(static_cast<int>(fmt::formatted_size("{}", extent.fileLength)), 6);
            table_.emplace(std::vector<Table::Column>{
                {"ID", Align::left, 4}, {"OFFSET", Align::right, width}, {"SIZE", Align::right, width}});
            table_->printTitles(output_, color_);
        }
    }

    bool add(const ChunkEntry& chunk)
    {
        const std::string id = fourCCText(chunk.id);
        if (form_ == Form::json)
            list_->newLine()
                .beginObject()
                .member("id", id)
                .member("offset", chunk.offset)
                .member("size", chunk.size)
                .endObject();
        else if (form_ == Form::table)
            table_->printRow(output_, {id, std::to_string(chunk.offset), std::to_string(chunk.size)});
        else if (form_ == Form::lines)
            output_.print("{}{}{}\t{}\t{}\n", several_ ? printable(path_) : "", several_ ? "\t" : "", id, chunk.offset,
                          chunk.size);
        return !output_.failed();
    }

    /// `error` is empty when all went well.
    void end(const std::string& error)
    {
        if (form_ == Form::json && !begun_)
            json_.addFailure(path_, error);
        else if (form_ == Form::json)
            endList(error);
        else if (form_ == Form::table && begun_ && extent_.end < extent_.fileLength)
            output_.print("{} bytes follow the container\n", extent_.fileLength - extent_.end);
    }

private:
    void endList(const std::string& error)
    {
        list_->endArrayOfLines();
        if (!error.empty())
            list_->member("error", error);
        list_->endObject();
    }

    JsonRecords& json_;
    JsonWriter* list_ = nullptr; // of the file's object, once that has begun
    Form form_;
    bool color_;
    bool several_;
    std::string path_;
    bool begun_ = false;
    ContainerExtent extent_;
    std::optional<Table> table_;
    Output& output_ = Output::standard();
};

void listFile(const std::string& path, ChunkListWriter& writer, bool quiet)
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
            return writer.add(chunk);
        },
        &extent);
    if (status != kStatusOK)
        throw Failure(begun ? "a chunk header cannot be read" : "its container header cannot be read");
    if (!begun)
        writer.begin(extent);
}

bool runList(const std::vector<std::string>& files, const OutputOptions& options)
{
    Output& output = Output::standard();
    const bool several = files.size() > 1;
    const bool table = outputForm(options) == Form::table;
    JsonRecords json(several ? JsonRecords::Shape::array : JsonRecords::Shape::single);
    bool good = true;
    for (const std::string& path : files) {
        const bool first = &path == &files.front();
        output.write(table && !first ? "\n" : "");
        ChunkListWriter writer(options, json, path, several);
        std::string error;
        if (!reportingFailures(path, [&] {
                try {
                    listFile(path, writer, options.quiet);
                } catch (const Failure& failure) {
                    error = failure.what();
                    throw;
                }
            }))
            good = false;
        writer.end(error);
        if (output.failed())
            break;
    }
    if (options.json)
        json.finish();
    return good;
}

void declareChunks(CommandLine& commandLine)
{
    static std::vector<std::string> files;
    Verb& verb =
        commandLine.addVerb("chunks", "List the chunks of audio files; get, add or remove one", [&commandLine] {
            if (files.empty())
                throw MissingArgument("FILE");
            return runList(files, commandLine.output());
        });
    CommandLine::addFiles(verb, files);
    declareChunksGet(commandLine, verb);
    declareChunkEdits(commandLine, verb);
}

const VerbRegistration registration{20, declareChunks};

} // namespace
