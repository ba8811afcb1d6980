#include "tool/meta/MetaTableWriter.h"

#include "tool/shared/output/CsvRecords.h"
#include "tool/shared/output/DisplayWidth.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>

namespace {

[[noreturn]] void failToKeep()
{
    throw Failure("the rows cannot be kept in a temporary file: " + SystemErrorText(errno));
}

enum class InXML { attribute, content };

std::string escapedXML(std::string_view text, InXML place)
{
    std::string escaped;
    for (const char c : text)
        if (c == '&')
            escaped += "&amp;";
        else if (c == '<')
            escaped += "&lt;";
        else if (c == '>')
            escaped += "&gt;";
        else if (c == '\r' || (place == InXML::attribute && (c == '"' || c == '\n' || c == '\t')))
            escaped += fmt::format("&#{};", static_cast<int>(c)); // parsers would change the character
        else
            escaped += c;
    return escaped;
}

/// File names may contain bytes that XML forbids: each becomes `\xNN`, and every backslash likewise.
std::string pathInXML(const std::string& path)
{
    std::string text;
    bool isPlain = true;
    for (std::string_view rest = path; !rest.empty();) {
        const std::string_view before = rest;
        const char32_t c = takeCharacter(rest);
        const bool isTaken = (c >= 0x20 || c == '\t' || c == '\n' || c == '\r') && c != 0xFFFE && c != 0xFFFF;
        isPlain = isPlain && isTaken;
        for (const char byte : before.substr(0, before.size() - rest.size()))
            text += isTaken && byte != '\\' ? std::string(1, byte)
                                            : fmt::format("\\x{:02X}", static_cast<unsigned char>(byte));
    }
    return escapedXML(isPlain ? path : text, InXML::attribute);
}

} // namespace

MetaCSVWriter::MetaCSVWriter(Sink sink, bool marked) : sink_(std::move(sink)), marked_(marked), rows_(std::tmpfile())
{
    if (!rows_)
        failToKeep();
}

void MetaCSVWriter::keep(std::string_view text)
{
    const std::size_t size = text.size();
    if (std::fwrite(&size, sizeof size, 1, rows_.get()) != 1 || std::fwrite(text.data(), 1, size, rows_.get()) != size)
        failToKeep();
}

std::size_t MetaCSVWriter::keptNumber()
{
    std::size_t number = 0;
    if (std::fread(&number, sizeof number, 1, rows_.get()) != 1)
        failToKeep();
    return number;
}

std::string MetaCSVWriter::keptText()
{
    std::string text(keptNumber(), '\0');
    if (std::fread(text.data(), 1, text.size(), rows_.get()) != text.size())
        failToKeep();
    return text;
}

void MetaCSVWriter::add(const std::string& path, const std::vector<MetaCell>& cells)
{
    keep(path);
    for (const MetaCell& cell : cells) {
        if (cell.text.empty())
            continue;
        const auto [column, isNew] = columns_.try_emplace(cell.name.text, names_.size());
        if (isNew)
            names_.push_back(cell.name);
        const std::size_t number = column->second + 1;
        if (std::fwrite(&number, sizeof number, 1, rows_.get()) != 1)
            failToKeep();
        keep(writtenCell(cell.text));
    }
    constexpr std::size_t end = 0;
    if (std::fwrite(&end, sizeof end, 1, rows_.get()) != 1)
        failToKeep();
    ++count_;
}

void MetaCSVWriter::finish()
{
    const std::vector<std::size_t> order = inOrder(names_);
    std::string row = marked_ ? "\xEF\xBB\xBFpath" : "path";
    for (const std::size_t column : order) {
        row += ',';
        appendCsvCell(row, writtenCell(names_[column].text));
    }
    sink_(row += "\r\n");
    if (std::fflush(rows_.get()) != 0 || std::fseek(rows_.get(), 0, SEEK_SET) != 0)
        failToKeep();
    std::vector<std::string> cells(names_.size());
    for (std::size_t i = 0; i < count_; ++i) {
        row.clear();
        appendCsvCell(row, keptText());
        for (std::string& cell : cells)
            cell.clear();
        while (const std::size_t number = keptNumber())
            cells[number - 1] = keptText();
        for (const std::size_t column : order) {
            row += ',';
            appendCsvCell(row, cells[column]);
        }
        sink_(row += "\r\n");
    }
}

MetaXMLWriter::MetaXMLWriter(Sink sink) : sink_(std::move(sink))
{
    sink_("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<metadata>\n");
}

void MetaXMLWriter::add(const std::string& path, const std::vector<MetaCell>& cells)
{
    std::string text = fmt::format("  <file path=\"{}\">\n", pathInXML(path));
    for (const MetaCell& cell : cells)
        text += fmt::format("    <field name=\"{}\">{}</field>\n",
                            escapedXML(writtenCell(cell.name.text), InXML::attribute),
                            escapedXML(writtenCell(cell.text), InXML::content));
    sink_(text += "  </file>\n");
}

void MetaXMLWriter::finish()
{
    sink_("</metadata>\n");
}
