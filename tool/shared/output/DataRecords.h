// The records of a verb, as JSON or as CSV.
#pragma once

#include "tool/shared/output/CsvRecords.h"
#include "tool/shared/output/JsonRecords.h"

/// Writes nothing unless either is asked for.
class DataRecords {
public:
    DataRecords(const OutputOptions& options, CsvColumns columns)
        : wantsJson_(options.wantsJson()),
          json_(options),
          csv_(options, columns)
    {
    }

    void add(const Record& record)
    {
        csv_.add(record);
        if (!wantsJson_)
            return;
        JsonWriter& json = json_.begin().beginObject();
        record.write(json);
        json.endObject();
        json_.end();
    }
    // For records that are more than members, or several rows:
    JsonRecords& jsonRecords() { return json_; }
    CsvRecords& csvRecords() { return csv_; }

    void addFailure(const std::string& path, const std::string& text)
    {
        csv_.addFailure(path, text);
        json_.addFailure(path, text);
    }
    /// Behind the last; there may have been none.
    void finish()
    {
        csv_.finish();
        json_.finish();
    }

private:
    bool wantsJson_;
    JsonRecords json_;
    CsvRecords csv_;
};
