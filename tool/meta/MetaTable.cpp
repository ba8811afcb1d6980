#include "tool/meta/MetaTable.h"

#include "platform/OwnedDescriptor.h"
#include "platform/core/ASCIICase.h"
#include "tool/shared/arguments/UsageError.h"
#include "tool/shared/input/StandardInput.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <fcntl.h>
#include <set>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr std::size_t kMostOfTable = 512 << 20; // per table, which is held in memory

// bwfmetaedit's names for the fields of its core document, other than INFO ids.
constexpr std::pair<std::string_view, std::string_view> kCoreNames[] = {
    {"Description", "bext.description"},
    {"Originator", "bext.originator"},
    {"OriginatorReference", "bext.originatorReference"},
    {"OriginationDate", "bext.originationDate"},
    {"OriginationTime", "bext.originationTime"},
    {"TimeReference", "bext.timeReference"},
    {"TimeReference (translated)", "bext.timeReference"},
    {"BextVersion", "bext.version"},
    {"UMID", "bext.umid"},
    {"LoudnessValue", "bext.loudnessValue"},
    {"LoudnessRange", "bext.loudnessRange"},
    {"MaxTruePeakLevel", "bext.maxTruePeakLevel"},
    {"MaxMomentaryLoudness", "bext.maxMomentaryLoudness"},
    {"MaxShortTermLoudness", "bext.maxShortTermLoudness"},
    {"CodingHistory", "bext.codingHistory"}};
constexpr std::array<std::string_view, 17> kCoreIds{"IARL", "IART", "ICMS", "ICMT", "ICOP", "ICRD",
                                                    "IENG", "IGNR", "IKEY", "IMED", "INAM", "IPRD",
                                                    "ISBJ", "ISFT", "ISRC", "ISRF", "ITCH"};

std::string fieldOf(const std::string& heading)
{
    for (const auto& [core, field] : kCoreNames)
        if (equalIgnoringASCIICase(core, heading))
            return std::string(field);
    return std::ranges::find(kCoreIds, heading) != kCoreIds.end() ? "info." + heading : heading;
}

std::string contentOf(const std::string& file)
{
    const platform::OwnedDescriptor opened(::open(systemPath(file).c_str(), O_RDONLY | O_NOCTTY | O_CLOEXEC));
    if (!opened)
        throw Failure(SystemErrorText(errno));
    constexpr std::size_t step = 1 << 20;
    std::string text;
    for (std::size_t size = 0;;) {
        text.resize(size + step);
        const ssize_t got = ::read(opened.get(), text.data() + size, step);
        if (got < 0 && errno != EINTR)
            throw Failure(errno == EISDIR ? "is a folder, not a table" : SystemErrorText(errno));
        size += static_cast<std::size_t>(std::max<ssize_t>(got, 0));
        text.resize(size);
        if (got == 0)
            return text;
        if (size > kMostOfTable)
            throw Failure(fmt::format("is no table: it has more than {} MiB", kMostOfTable >> 20));
    }
}

/// Spreadsheets write other encodings unless told otherwise.
void requireUTF8(std::string_view text)
{
    std::size_t line = 1;
    while (!text.empty()) {
        const char first = text.front();
        line += first == '\n' ? 1U : 0U;
        if (first == '\0')
            throw Failure(fmt::format("line {}: holds NUL, and is no table", line));
        if (first > 0) {
            text.remove_prefix(1);
            continue;
        }
        const std::size_t before = text.size();
        constexpr char32_t replacement = 0xFFFD; // the text may contain it legitimately, in three bytes
        if (takeCharacter(text) == replacement && before - text.size() < 3)
            throw Failure(fmt::format("line {}: is not UTF-8; save the table as CSV in UTF-8", line));
    }
}

} // namespace

std::vector<MetaCell> MetaTable::cellsOf(const MetaRow& row) const
{
    std::vector<MetaCell> cells;
    for (const MetaRow::Cell& cell : row.cells)
        cells.push_back({columns[cell.column].field, cell.text});
    return cells;
}

MetaTable readMetaTable(const std::string& file)
{
    const std::string content = contentOf(file);
    std::string_view text = content;
    const bool isUTF16 = text.starts_with("\xFF\xFE") || text.starts_with("\xFE\xFF");
    for (const std::string_view mark : {"\xEF\xBB\xBF", "\xFF\xFE", "\xFE\xFF"})
        if (text.starts_with(mark))
            text.remove_prefix(mark.size());
    const std::size_t begin = text.find_first_not_of(std::string_view(" \t\r\n\0", 5));
    if (begin == std::string_view::npos)
        throw Failure("is empty");
    if (text[begin] == '<')
        return metaTableFromXML(content);
    if (isUTF16)
        throw Failure("is UTF-16; save the table as CSV in UTF-8");
    requireUTF8(content);
    return metaTableFromCSV(content);
}

bool MetaTableMaker::isPath(const std::string& heading)
{
    return equalIgnoringASCIICase(heading, "path") || equalIgnoringASCIICase(heading, "FileName");
}

std::string MetaTableMaker::problemOf(const std::string& heading)
{
    const std::string field = fieldOf(heading);
    if (isPath(heading))
        return {};
    const auto name = metaNameFromText(field);
    if (!isEditedField(field))
        return fmt::format("there is no field \"{}\" to set{}", printable(heading), whyNotEdited(field));
    if (name && std::ranges::any_of(name->parts, [](const MetaName::Part& part) { return part.isNew(); }))
        return fmt::format("\"{}\": items of a table are counted from 0", printable(heading));
    return {};
}

std::size_t MetaTableMaker::column(const std::string& heading)
{
    const std::string field = fieldOf(heading);
    const auto [found, isNew] = columns_.try_emplace(field, table_.columns.size());
    if (isNew)
        table_.columns.push_back({heading, *metaNameFromText(field)});
    return found->second;
}

std::string MetaTableMaker::meant(std::size_t line, const std::string& heading, std::string_view cell)
{
    try {
        return meantCell(cell);
    } catch (const UsageError& error) {
        addProblem(line, fmt::format("{}: {}", heading, error.what()));
        return {};
    }
}

MetaTable MetaTableMaker::finish()
{
    std::vector<MetaName> names;
    for (const MetaColumn& column : table_.columns)
        names.push_back(column.field);
    const std::vector<std::size_t> order = inOrder(names);
    std::vector<std::size_t> places(order.size());
    std::vector<MetaColumn> columns;
    for (std::size_t place = 0; place < order.size(); ++place) {
        places[order[place]] = place;
        columns.push_back(std::move(table_.columns[order[place]]));
    }
    table_.columns = std::move(columns);
    std::map<std::string, std::size_t, std::less<>> paths;
    std::map<std::pair<std::uint64_t, std::uint64_t>, std::size_t> files; // a file may be named in two ways
    for (MetaRow& row : table_.rows) {
        for (MetaRow::Cell& cell : row.cells)
            cell.column = places[cell.column];
        std::ranges::sort(row.cells, {}, &MetaRow::Cell::column);
        struct stat status = {};
        std::size_t first = paths.try_emplace(row.path, row.line).first->second;
        if (::stat(row.path.c_str(), &status) == 0)
            first = std::min(first, files.try_emplace({status.st_dev, status.st_ino}, row.line).first->second);
        if (first != row.line)
            addProblem(row.line, fmt::format("{} is in line {} already", row.path, first));
    }
    return std::move(table_);
}
