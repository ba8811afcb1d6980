// ktfiles index export: all that an index knows, as JSON Lines.
#include "tool/index/IndexObjects.h"
#include "tool/index/IndexedFiles.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/library/IndexedName.h"
#include "tool/shared/library/Library.h"
#include "tool/shared/library/LibraryRecordJson.h"
#include "tool/shared/output/JsonRecords.h"

namespace {

void writeAll(Library& library, JsonRecords& records)
{
    library.database().run("BEGIN"); // one state of the index, whatever others write meanwhile
    SQLStatement roots(library.database(), "SELECT path, completed FROM roots ORDER BY path");
    while (roots.step()) {
        LibraryRoot root{nameOfIndexed(roots.bytes(0)), {}};
        if (!roots.isNull(1))
            root.completed = roots.number(1);
        writeLibraryRoot(records.begin(), root);
        records.end();
    }
    RecordReader reader(library);
    IndexedFiles files(library, IndexedFiles::Which::audio);
    while (const auto file = files.next()) {
        const LibraryRecord record = reader.record(*file); // whole, before any of it is written
        writeLibraryRecord(records.begin(), record);
        records.end();
        if (Output::standard().failed())
            return;
    }
}

bool runExport(const std::string& named, OutputOptions options)
{
    const std::string path = named.empty() ? defaultLibrary() : named;
    if (!options.wantsJson())
        options.json = JsonShape::lines;
    JsonRecords records(options);
    const bool isGood = reportingFailures(path, [&] {
        try {
            Library library(path, SQLDatabase::Mode::read);
            writeAll(library, records);
        } catch (const Failure& failure) {
            records.addFailure(path, failure.what());
            throw;
        }
    });
    records.finish();
    return isGood;
}

} // namespace

void declareIndexExport(CommandLine& commandLine, Verb& index)
{
    static std::string database;
    Verb& verb = commandLine.addVerb(
        "export", "Write all that an index knows as JSON Lines",
        [&commandLine] { return runExport(database, commandLine.output()); }, &index);
    verb.addText("--db", database, "The index, in place of your own").label("FILE");
}
