#include "tool/shared/output/CsvRecords.h"

#include "platform/core/JsonWriter.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/ShownName.h"

#include <algorithm>
#include <unistd.h>
#include <utility>

namespace {

constexpr std::string_view kLineEnd = "\r\n";

std::string validText(std::string_view text)
{
    std::string valid;
    while (!text.empty()) {
        const std::string_view before = text;
        const bool isBad = takeCharacter(text) == U'\xFFFD';
        valid += isBad ? "\xEF\xBF\xBD" : before.substr(0, before.size() - text.size());
    }
    return valid;
}

std::string cellText(const platform::Value& value)
{
    if (const auto* text = value.get<std::string>())
        return validText(*text);
    if (const auto* list = value.get<platform::Array>()) {
        std::string joined;
        for (const platform::Value& each : *list)
            joined += (joined.empty() ? "" : ",") + cellText(each);
        return joined;
    }
    JsonWriter number;
    number.write(value);
    return std::string(number.text());
}

void appendCellShown(std::string& row, const std::string& cell)
{
    // A terminal must not take part of a name for a command.
    static const bool onTerminal = isTerminal(STDOUT_FILENO);
    appendCsvCell(row, onTerminal ? printable(cell) : cell);
}

} // namespace

void appendCsvCell(std::string& row, std::string_view text)
{
    if (text.find_first_of(",\"\r\n") == text.npos) {
        row += text;
        return;
    }
    row += '"';
    for (const char c : text)
        row.append(c == '"' ? 2 : 1, c);
    row += '"';
}

std::string csvRow(CsvColumns columns, const Record& record)
{
    std::string row;
    for (const char* const column : columns) {
        row += row.empty() && column == columns.front() ? "" : ",";
        if (const auto found = std::ranges::find(record.fields(), column, &Record::Field::name);
            found != record.fields().end())
            appendCellShown(row, cellText(found->value));
    }
    return row.append(kLineEnd);
}

std::string csvFailure(CsvColumns columns, const std::string& path, const std::string& text)
{
    return csvRow(columns, Record().member("path", shownName(path)).member("error", shownName(text)));
}

void CsvRecords::addRow(std::string_view row)
{
    if (!isWanted_)
        return;
    Output& output = Output::standard();
    if (!std::exchange(hasBegun_, true)) {
        for (const char* const column : columns_)
            output.print("{}{}", column == columns_.front() ? "" : ",", column);
        output.write(kLineEnd);
    }
    output.write(row);
}
