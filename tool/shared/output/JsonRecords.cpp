#include "tool/shared/output/JsonRecords.h"

#include "tool/shared/output/ShownName.h"

#include <utility>

JsonRecords::JsonRecords(const OutputOptions& options) : shape_(options.json)
{
    if (shape_ == JsonShape::lines)
        json_.keepToOneLine();
}

JsonWriter& JsonRecords::begin()
{
    if (shape_ == JsonShape::lines)
        return json_;
    beginArray();
    return json_.newLine();
}

void JsonRecords::end()
{
    if (shape_ != JsonShape::lines)
        return;
    json_.endLine();
    Output::standard().flush();
}

void JsonRecords::addFailure(const std::string& path, const std::string& text)
{
    if (shape_ == JsonShape::none)
        return;
    begin().beginObject().member("path", shownName(path)).member("error", shownName(text)).endObject();
    end();
}

void JsonRecords::finish()
{
    if (shape_ != JsonShape::array)
        return;
    beginArray();
    json_.endArrayOfLines().endLine();
}

void JsonRecords::beginArray()
{
    if (!std::exchange(hasBegun_, true))
        json_.beginArray();
}
