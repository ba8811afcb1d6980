#include "tool/shared/output/JsonRecords.h"

#include <utility>

JsonWriter& JsonRecords::next()
{
    if (shape_ == Shape::single)
        return json_;
    beginArray();
    return json_.newLine();
}

void JsonRecords::addFailure(const std::string& path, const std::string& text)
{
    writeFailure(next(), path, text);
}

void JsonRecords::finish()
{
    if (shape_ == Shape::array) {
        beginArray();
        json_.endArrayOfLines();
    }
    json_.endLine();
}

void JsonRecords::beginArray()
{
    if (!std::exchange(hasBegun_, true))
        json_.beginArray();
}

void writeFailure(JsonWriter& json, const std::string& path, const std::string& text)
{
    json.beginObject().member("path", path).member("error", text).endObject();
}
