// ktfiles meta import: sets the fields of many files from one table.
#include "tool/meta/MetaCommand.h"
#include "tool/meta/MetaEdits.h"
#include "tool/meta/MetaTable.h"
#include "tool/shared/access/FileAccess.h"
#include "tool/shared/arguments/CommandLine.h"
#include "tool/shared/edits/EndingSignals.h"
#include "tool/shared/metadata/MetaFile.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/FilesProgress.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"
#include "tool/shared/output/UnseenCharacters.h"

#include <algorithm>

namespace {

struct ImportArguments {
    std::string table;
    bool emptyRemoves = false, isLenient = false;
    EditOptions options;
};

/// A value that the file has already is no problem of the table.
bool stands(const MetaCell& cell, const std::string& path, const ImportArguments& arguments)
{
    try {
        const FileAccess access = accessForReading(path, arguments.options.waiting());
        return stands(cell, holdMetadata(path));
    } catch (const Failure&) {
        return false;
    }
}

void checkValues(MetaTable& table, const ImportArguments& arguments)
{
    for (const MetaRow& row : table.rows)
        for (const MetaRow::Cell& cell : row.cells) {
            const MetaColumn& column = table.columns[cell.column];
            const MetaCell value{column.field, cell.text};
            if (const std::string why = problemOf(value, arguments.isLenient);
                !why.empty() && !stands(value, row.path, arguments))
                table.problems.push_back(
                    {row.line,
                     fmt::format("{}{}", column.heading == column.field.text ? "" : column.heading + ": ", why)});
        }
    std::ranges::stable_sort(table.problems, {}, &TableProblem::line);
}

bool tellProblems(const MetaTable& table, const std::string& name, const OutputOptions& output)
{
    constexpr std::size_t most = 20; // for people
    JsonRecords json(output);
    for (std::size_t i = 0; i < table.problems.size(); ++i) {
        const auto& [line, text] = table.problems[i];
        const std::string told = fmt::format("line {}: {}", line, text);
        json.addFailure(name, told);
        if (i < most)
            reportFailure(name, told);
        else if (i == most)
            reportFailure(name,
                          fmt::format("and {} more like these; nothing is changed", table.problems.size() - most));
    }
    json.finish();
    return false;
}

bool importRows(const MetaTable& table, const ImportArguments& arguments, const OutputOptions& output)
{
    MetaEdits edits({"import", "set", "would set"}, arguments.options, output);
    {
        FilesProgress progress("importing", output.quiet);
        progress.setTotal(std::ssize(table.rows));
        for (const MetaRow& row : table.rows) {
            progress.begin(row.path);
            if (!arguments.options.dryRun)
                sayAtEndingSignals(fmt::format(
                    "ktfiles: {}: stopped at line {}: {} is as it was or done, those behind it are as they were\n",
                    printableOnError(arguments.table), row.line, printableOnError(shownName(row.path))));
            const std::vector<MetaCell> cells = table.cellsOf(row);
            edits.edit(
                row.path,
                [&](const std::string& target) {
                    return planMetadata(
                        target,
                        [&](const HeldMetadata& held) {
                            return std::vector<std::vector<MetaStep>>{
                                stepsTo(cells, held, arguments.emptyRemoves, arguments.isLenient)};
                        },
                        arguments.isLenient);
                },
                fmt::format("line {}: ", row.line));
            Output::standard().flush(); // finished work is reported, whatever follows
            progress.advance(1, FilesProgress::takeParts());
            if (Output::standard().failed())
                break;
        }
    }
    sayAtEndingSignals({});
    if (outputForm(output) == Form::table && table.rows.size() > 1)
        Output::standard().print("{} files: {} changed, {} unchanged, {} failed\n", table.rows.size(), edits.changed(),
                                 edits.unchanged(), edits.failed());
    return edits.finish();
}

bool runImport(const ImportArguments& arguments, const OutputOptions& output)
{
    MetaTable table;
    const std::string name = arguments.table == "-" ? "standard input" : arguments.table;
    if (!reportingRecord(name, output, [&] {
            table = readMetaTable(arguments.table);
            checkValues(table, arguments);
            if (table.rows.empty() && table.problems.empty())
                throw Failure("names no file");
        }))
        return false;
    return table.problems.empty() ? importRows(table, arguments, output) : tellProblems(table, name, output);
}

} // namespace

void declareMetaImport(CommandLine& commandLine, Verb& meta)
{
    static ImportArguments arguments;
    Verb& verb = commandLine.addVerb(
        "import", "Set the fields of many files as a table says, CSV or XML",
        [&commandLine] { return runImport(arguments, commandLine.output()); }, &meta);
    CommandLine::addFileOrInput(verb, arguments.table)
        .required()
        .describe("The table, as export writes it; \"-\" is standard input");
    verb.addFlag("--empty-removes", arguments.emptyRemoves, "Remove the fields whose cells are empty; else they stay");
    verb.addFlag("--lenient", arguments.isLenient,
                 "Take what the standards do not: texts that are not ASCII, unknown ids; no other dates");
    CommandLine::addEditOptions(verb, arguments.options);
}
