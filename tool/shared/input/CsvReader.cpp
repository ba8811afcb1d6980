#include "tool/shared/input/CsvReader.h"

#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>

CsvReader::CsvReader(std::string_view text, char separator) : text_(text), separator_(separator)
{
    constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
    if (text_.starts_with(byteOrderMark))
        text_.remove_prefix(byteOrderMark.size());
}

std::optional<CsvRow> CsvReader::next()
{
    while (takeLineEnd()) {
    }
    if (text_.empty())
        return std::nullopt;
    CsvRow row{line_, {}};
    for (;;) {
        row.cells.push_back(takeCell());
        if (text_.empty() || takeLineEnd())
            return row;
        text_.remove_prefix(1); // skips the separator
    }
}

std::string CsvReader::takeCell()
{
    if (text_.starts_with('"'))
        return takeQuoted();
    const std::array<char, 3> ends{separator_, '\r', '\n'};
    const std::size_t size = std::min(text_.find_first_of(std::string_view(ends.data(), ends.size())), text_.size());
    std::string cell(text_.substr(0, size));
    text_.remove_prefix(size);
    return cell;
}

std::string CsvReader::takeQuoted()
{
    const std::size_t begin = line_;
    std::string cell;
    text_.remove_prefix(1);
    for (;;) {
        const std::size_t mark = text_.find('"');
        if (mark == std::string_view::npos)
            throw Failure(fmt::format("line {}: a quotation mark is opened and not closed", begin));
        for (std::size_t i = 0; i < mark; ++i)
            line_ += text_[i] == '\n' || (text_[i] == '\r' && text_[i + 1] != '\n') ? 1U : 0U;
        cell += text_.substr(0, mark);
        text_.remove_prefix(mark + 1);
        if (!text_.starts_with('"'))
            break;
        cell += '"';
        text_.remove_prefix(1);
    }
    if (!text_.empty() && text_.front() != separator_ && text_.front() != '\r' && text_.front() != '\n')
        throw Failure(fmt::format("line {}: something follows a closing quotation mark", line_));
    return cell;
}

bool CsvReader::takeLineEnd()
{
    const std::size_t size = text_.starts_with("\r\n")                            ? 2U
                             : text_.starts_with('\r') || text_.starts_with('\n') ? 1U
                                                                                  : 0U;
    text_.remove_prefix(size);
    line_ += size != 0 ? 1U : 0U;
    return size != 0;
}
