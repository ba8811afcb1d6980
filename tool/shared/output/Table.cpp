#include "tool/shared/output/Table.h"

#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Output.h"

#include <algorithm>
#include <limits>

namespace {

constexpr int kGap = 2;
constexpr int kReadable = 20; // width of a name before columns are dropped for it
constexpr int kLeast = 8;     // width if there is no column to drop
constexpr int kLeftOut = -1;

} // namespace

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

void Table::print(Output& output, bool color)
{
    if (rows_.empty())
        return;
    printTitles(output, color);
    for (const auto& row : rows_)
        printRow(output, row);
}

void Table::printTitles(Output& output, bool color)
{
    if (rows_.empty() && columns_.back().isCuttable)
        columns_.back().width = columnsOfOutput().value_or(0);
    fit();
    std::vector<std::string> titles;
    for (const Column& column : columns_)
        titles.push_back(column.title);
    printRow(output, titles, color);
}

void Table::printRow(Output& output, const std::vector<std::string>& row, bool bold) const
{
    std::string line, gap;
    for (std::size_t i = 0; i < columns_.size(); ++i) {
        if (widths_[i] == kLeftOut)
            continue;
        const bool isCut = isOnTerminal_ && columns_[i].isCuttable;
        const std::string cell = isCut ? shortened(row[i], widths_[i]) : row[i];
        const std::string padding(static_cast<std::size_t>(std::max(widths_[i] - displayWidth(cell), 0)), ' ');
        const bool isRight = columns_[i].align == Align::right;
        line += gap + (isRight ? padding + cell : cell);
        gap = (isRight ? "" : padding) + std::string(kGap, ' '); // no gap after the last column
    }
    line.erase(line.find_last_not_of(' ') + 1); // left by empty last cells
    output.print("{}{}{}\n", bold ? "\x1b[1m" : "", line, bold ? "\x1b[0m" : "");
}

void Table::fit()
{
    widths_.clear();
    for (const Column& column : columns_)
        widths_.push_back(column.width);
    const std::optional<int> limit = columnsOfOutput();
    isOnTerminal_ = limit.has_value();
    if (!limit)
        return;
    do
        narrow(kReadable, *limit);
    while (totalWidth() > *limit && dropColumn());
    narrow(kLeast, *limit);
}

int Table::totalWidth() const
{
    int total = -kGap;
    for (const int width : widths_)
        total += width == kLeftOut ? 0 : width + kGap;
    return total;
}

// Narrows the widest names first, and widens them again by the room of dropped columns.
void Table::narrow(int least, int limit)
{
    for (std::size_t i = 0; i < columns_.size(); ++i)
        if (widths_[i] != kLeftOut)
            widths_[i] = columns_[i].width;
    while (totalWidth() > limit) {
        int* widest = nullptr;
        for (std::size_t i = 0; i < columns_.size(); ++i)
            if (columns_[i].isCuttable && widths_[i] > std::max(least, displayWidth(columns_[i].title)) &&
                (widest == nullptr || widths_[i] > *widest))
                widest = &widths_[i];
        if (widest == nullptr)
            return;
        --*widest;
    }
}

bool Table::dropColumn()
{
    const auto rank = [this](std::size_t i) {
        const int given = widths_[i] == kLeftOut ? 0 : columns_[i].dropRank;
        const bool isEmpty =
            !rows_.empty() && std::ranges::all_of(rows_, [i](const auto& row) { return row[i].empty(); });
        return given > 0 && isEmpty ? std::numeric_limits<int>::max() : given;
    };
    std::size_t first = 0;
    for (std::size_t i = 1; i < columns_.size(); ++i)
        if (rank(i) > rank(first))
            first = i;
    const bool isFound = rank(first) > 0;
    if (isFound)
        widths_[first] = kLeftOut;
    return isFound;
}
