// A verb's records, as JSON or as CSV.
#pragma once

#include "tool/shared/output/CsvRecords.h"
#include "tool/shared/output/JsonRecords.h"

/// Writes nothing unless one of them was requested.
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
    // For records with more than members, or with several rows.
    JsonRecords& jsonRecords() { return json_; }
    CsvRecords& csvRecords() { return csv_; }

    void addFailure(const std::string& path, const std::string& text)
    {
        csv_.addFailure(path, text);
        json_.addFailure(path, text);
    }
    /// Call after the last record, even if there was none.
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
