#include "tool/project/ProjectMedia.h"

#include "tool/project/ProjectPackage.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <algorithm>
#include <filesystem>

namespace {

bool isThere(const std::string& path)
{
    std::error_code error;
    return std::filesystem::exists(path, error);
}

void printRows(const std::vector<std::vector<std::string>>& rows, std::vector<Table::Column> columns,
               const OutputOptions& options)
{
    const Form form = outputForm(options);
    Output& output = Output::standard();
    Table table(std::move(columns));
    for (const auto& row : rows) {
        if (form == Form::table)
            table.add(row);
        else if (form == Form::lines)
            output.print("{}\t{}\t{}\n", row[0], row[1], row[2]);
    }
    if (form == Form::table)
        table.print(output, usesColor(options.color));
}

constexpr int kDirectoryCount = 20;

} // namespace

void printProjectMedia(const std::string& path, ProjectInformation& project, std::optional<long> alternative,
                       bool onlyMissing, const OutputOptions& options)
{
    if (alternative)
        alternativeOf(project, alternative); // throws if there is none
    std::vector<std::vector<std::string>> rows;
    JsonWriter media;
    media.beginArray();
    for (const ProjectMediaList& list : kProjectMediaLists) {
        const ProjectFileSet files = alternative ? project.filesUsedByVariantIndex(list.kind, *alternative)
                                                 : project.filesUsedByAnyVariant(list.kind);
        std::vector<std::string> sorted(files.begin(), files.end());
        std::sort(sorted.begin(), sorted.end());
        for (const std::string& file : sorted) {
            const bool exists = isThere(file);
            if (exists && onlyMissing)
                continue;
            if (options.wantsJson())
                media.beginObject().member("key", list.key).member("file", file).member("exists", exists).endObject();
            else
                rows.push_back({list.name, exists ? "" : "missing", printable(file)});
        }
    }
    if (options.wantsJson())
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", path).key("media").writeJson(media.endArray().text()).endObject();
        });
    printRows(rows, {{.title = "KIND", .dropRank = 1}, {.title = "STATE"}, {.title = "FILE", .isCuttable = true}},
              options);
}

void printProjectDirectories(const std::string& path, const CFileRef& base, std::optional<long> alternative,
                             bool create, const OutputOptions& options)
{
    const auto project = ProjectInformation::initWithProjectURL(base.URL());
    const long index = alternative.value_or(project ? std::max(project->lastActiveVariation(), 0L) : 0);
    std::vector<std::vector<std::string>> rows;
    JsonWriter directories;
    directories.beginArray();
    for (int value = 0; value < kDirectoryCount; ++value) {
        const auto ask = [&](bool creates) {
            return GetProjectDirectoryRefForBase(base, static_cast<TTypeDir_Prj>(value), creates,
                                                 kProjectTypeFromProject, index);
        };
        const CFileRef directory = ask(false);
        if (!directory.IsValid()) // this kind of project has none
            continue;
        if (create && !ask(true).IsValid())
            throw Failure("this folder cannot be created: " + std::string(directory));
        const bool exists = directory.IsFolder();
        if (options.wantsJson())
            directories.beginObject()
                .member("type", value)
                .member("directory", std::string(directory))
                .member("exists", exists)
                .endObject();
        else
            rows.push_back({std::to_string(value), exists ? "" : "missing", printable(std::string(directory))});
    }
    if (options.wantsJson())
        writeRecord(options, [&](JsonWriter& json) {
            json.beginObject().member("path", path);
            json.member("directoryType", static_cast<int>(GetProjectDirectoryType(base)));
            json.member("layout", static_cast<int>(GetProjectLayout(base)));
            json.key("directories").writeJson(directories.endArray().text()).endObject();
        });
    printRows(rows,
              {{.title = "TYPE", .align = Align::right}, {.title = "STATE"}, {.title = "FOLDER", .isCuttable = true}},
              options);
}
