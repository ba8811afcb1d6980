// Tables of metadata in CSV, as spreadsheets write it.
#include "tool/meta/MetaTable.h"
#include "tool/shared/input/CsvReader.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>

namespace {

constexpr std::string_view kTranslated = "TimeReference (translated)"; // a time, in addition to the frames

std::string withoutBlanks(const std::string& text)
{
    const std::size_t begin = text.find_first_not_of(' ');
    return begin == std::string::npos ? "" : text.substr(begin, text.find_last_not_of(' ') + 1 - begin);
}

/// The number of columns in the first line with that separator; 0 if none names files.
std::size_t columnsWith(std::string_view text, char separator)
{
    try {
        const auto row = CsvReader(text, separator).next();
        const auto isPath = [](const std::string& cell) { return MetaTableMaker::isPath(withoutBlanks(cell)); };
        return row && std::ranges::any_of(row->cells, isPath) ? row->cells.size() : 0;
    } catch (const Failure&) { // with another separator, quotation marks end elsewhere
        return 0;
    }
}

/// The separator that yields the most columns in the first line.
char separatorOf(std::string_view text)
{
    constexpr std::array separators{',', ';', '\t'};
    const char best = *std::ranges::max_element(separators, {}, [&](char each) { return columnsWith(text, each); });
    if (columnsWith(text, best) == 0)
        throw Failure(
            "line 1: no column is headed \"path\" or \"FileName\"; columns are parted by commas, semicolons or "
            "tabs");
    return best;
}

class CSVTable {
public:
    CSVTable(std::string_view text) : reader_(text, separatorOf(text)) {}

    MetaTable read()
    {
        takeHeadings();
        while (const auto row = reader_.next())
            takeRow(*row);
        return maker_.finish();
    }

private:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);

    void takeHeadings()
    {
        headings_ = *reader_.next();
        std::map<std::size_t, std::size_t> first; // first occurrence of each table column
        for (std::size_t i = 0; i < headings_.cells.size(); ++i) {
            std::string& heading = headings_.cells[i];
            heading = withoutBlanks(heading);
            columns_.push_back(kNone);
            if (heading.empty())
                continue;
            if (MetaTableMaker::isPath(heading)) {
                if (path_ != kNone)
                    maker_.addProblem(headings_.line, fmt::format("two columns name the files, \"{}\" and \"{}\"",
                                                                  headings_.cells[path_], heading));
                path_ = i;
            } else if (const std::string problem = MetaTableMaker::problemOf(heading); !problem.empty()) {
                maker_.addProblem(headings_.line, problem);
            } else {
                columns_[i] = maker_.column(heading);
                if (const auto [found, isNew] = first.try_emplace(columns_[i], i);
                    !isNew && !areTimes(found->second, i))
                    maker_.addProblem(headings_.line,
                                      fmt::format("the columns \"{}\" and \"{}\" are of one field",
                                                  printable(headings_.cells[found->second]), printable(heading)));
            }
        }
    }

    bool areTimes(std::size_t a, std::size_t b) const
    {
        return (headings_.cells[a] == kTranslated) != (headings_.cells[b] == kTranslated);
    }

    void takeRow(const CsvRow& from)
    {
        if (std::ranges::all_of(from.cells, &std::string::empty))
            return;
        if (from.cells.size() != headings_.cells.size())
            return maker_.addProblem(from.line, fmt::format("there are {} cells, and {} headings", from.cells.size(),
                                                            headings_.cells.size()));
        MetaRow row{from.line, nameMeantBy(from.cells[path_]), {}};
        if (row.path.empty())
            maker_.addProblem(from.line, "the name of the file is missing");
        for (std::size_t i = 0; i < from.cells.size(); ++i)
            if (columns_[i] != kNone)
                addCell(row, {columns_[i], maker_.meant(from.line, headings_.cells[i], from.cells[i])},
                        headings_.cells[i] == kTranslated);
            else if (i != path_ && headings_.cells[i].empty() && !from.cells[i].empty())
                maker_.addProblem(from.line, fmt::format("cell {} has no heading", i + 1));
        maker_.add(std::move(row));
    }

    /// If a field has both, frames take precedence over the time.
    static void addCell(MetaRow& row, MetaRow::Cell cell, bool isTranslated)
    {
        const auto other = std::ranges::find(row.cells, cell.column, &MetaRow::Cell::column);
        if (other == row.cells.end())
            row.cells.push_back(std::move(cell));
        else if (isTranslated ? other->text.empty() : !cell.text.empty())
            other->text = std::move(cell.text);
    }

    CsvReader reader_;
    MetaTableMaker maker_;
    CsvRow headings_;
    std::vector<std::size_t> columns_; // table columns by those of the file
    std::size_t path_ = kNone;
};

} // namespace

MetaTable metaTableFromCSV(std::string_view text)
{
    return CSVTable(text).read();
}
