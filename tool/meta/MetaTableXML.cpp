// Tables of metadata in the XML of `meta export --xml`.
#include "platform/XMLParser.h"
#include "tool/meta/MetaTable.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/ShownName.h"
#include "tool/shared/output/Terminal.h"

#include <fmt/format.h>

namespace {

class XMLTable : public platform::XMLHandler {
public:
    explicit XMLTable(std::string_view text) : stream_(bytesOf(text)), parser_(stream_, *this) {}

    MetaTable read()
    {
        platform::Error error;
        if (!parser_.parse(&error))
            throw Failure(
                fmt::format("line {}: is no well-formed XML: {}", parser_.position().line, error.description));
        return maker_.finish();
    }

    void startElement(std::string_view name, const platform::XMLAttributes& attributes) override
    {
        constexpr std::string_view names[] = {"metadata", "file", "field"};
        const std::size_t line = parser_.elementPosition().line;
        if (depth_ >= std::size(names) || name != names[depth_])
            throw Failure(
                fmt::format("line {}: <{}> stands where {} expected", line, printable(name),
                            depth_ < std::size(names) ? fmt::format("<{}> is", names[depth_]) : "no element is"));
        const auto of = attributes.find(depth_ == 1 ? "path" : "name");
        if (depth_ == 1) {
            row_ = {line, nameMeantBy(std::string(of.value_or(""))), {}};
            if (row_.path.empty())
                maker_.addProblem(line, "the name of the file, \"path\", is missing");
        } else if (depth_ == 2) {
            field_ = of.value_or("");
            text_.clear();
            line_ = line;
        }
        ++depth_;
    }

    void endElement(std::string_view) override
    {
        --depth_;
        if (depth_ == 1)
            maker_.add(std::move(row_));
        else if (depth_ == 2)
            addField();
    }

    void characters(std::string_view text) override
    {
        if (depth_ == 3)
            text_ += text;
        else if (text.find_first_not_of(" \t\r\n") != std::string_view::npos)
            throw Failure(fmt::format("line {}: a text stands between elements", parser_.position().line));
    }

private:
    void addField()
    {
        const std::string problem =
            MetaTableMaker::isPath(field_) ? "a field is called \"path\"" : MetaTableMaker::problemOf(field_);
        if (!problem.empty())
            return maker_.addProblem(line_, problem);
        const std::size_t column = maker_.column(field_);
        for (const MetaRow::Cell& cell : row_.cells)
            if (cell.column == column)
                maker_.addProblem(line_, fmt::format("{} stands twice in one file", printable(field_)));
        row_.cells.push_back({column, maker_.meant(line_, field_, text_)});
    }

    platform::BorrowedInputStream stream_;
    platform::XMLParser parser_;
    MetaTableMaker maker_;
    std::size_t depth_ = 0, line_ = 0;
    MetaRow row_;
    std::string field_, text_;
};

} // namespace

MetaTable metaTableFromXML(std::string_view text)
{
    return XMLTable(text).read();
}
