#include "tool/shared/output/Table.h"

#include "tool/shared/output/Output.h"

#include <algorithm>

Table::Table(std::vector<Column> columns) : columns_(std::move(columns))
{
    for (Column& column : columns_)
        column.width = std::max(column.width, displayWidth(column.title));
}

void Table::add(std::vector<std::string> row)
{
    for (std::size_t i = 0; i < columns_.size(); ++i)
        columns_[i].width = std::max(columns_[i].width, displayWidth(row[i]));
    rows_.push_back(std::move(row));
}

void Table::print(Output& output, bool color) const
{
    if (rows_.empty())
        return;
    printTitles(output, color);
    for (const auto& row : rows_)
        printRow(output, row);
}

void Table::printTitles(Output& output, bool color) const
{
    std::vector<std::string> titles;
    for (const Column& column : columns_)
        titles.push_back(column.title);
    printRow(output, titles, color);
}

void Table::printRow(Output& output, const std::vector<std::string>& row, bool bold) const
{
    std::string line;
    for (std::size_t i = 0; i < columns_.size(); ++i) {
        const int missing = columns_[i].width - displayWidth(row[i]);
        const std::string padding(static_cast<std::size_t>(std::max(missing, 0)), ' ');
        const bool last = i + 1 == columns_.size();
        if (columns_[i].align == Align::right)
            line += padding + row[i];
        else
            line += last ? row[i] : row[i] + padding;
        if (!last)
            line += "  ";
    }
    output.print("{}{}{}\n", bold ? "\x1b[1m" : "", line, bold ? "\x1b[0m" : "");
}
