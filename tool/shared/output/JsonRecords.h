// The JSON of a verb that tells of several files: an array, with a line for each.
#pragma once

#include "tool/shared/output/JsonWriter.h"

class JsonRecords {
public:
    enum class Shape { array, single };

    /// `single` is for verbs whose JSON of one file is that file's object, without an array around it.
    explicit JsonRecords(Shape shape = Shape::array) : shape_(shape) {}

    /// For the next record, of which it takes one value.
    JsonWriter& next();
    /// The next record is one of a file that failed.
    void addFailure(const std::string& path, const std::string& text);
    /// Behind the last; there may have been none.
    void finish();

private:
    void beginArray();

    Shape shape_;
    bool hasBegun_ = false;
    JsonWriter json_{Output::standard()};
};

/// What stands in the place of a file that failed.
void writeFailure(JsonWriter& json, const std::string& path, const std::string& text);
