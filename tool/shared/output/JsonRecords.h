// The JSON of a verb: one array with a record on each line, or with --jsonl a record on each line and nothing else.
#pragma once

#include "tool/shared/output/Failure.h"
#include "tool/shared/output/JsonWriter.h"

class JsonRecords {
public:
    explicit JsonRecords(const OutputOptions& options);

    /// For the next record, of which it takes one value.
    JsonWriter& begin();
    /// Behind each record. A line is written through at once, so that who reads it can go on.
    void end();
    // Nothing where no JSON is asked for:

    /// A record of a file that failed.
    void addFailure(const std::string& path, const std::string& text);
    /// Behind the last; there may have been none.
    void finish();

private:
    void beginArray();

    JsonShape shape_;
    bool hasBegun_ = false;
    JsonWriter json_{Output::standard()};
};

/// The record of a verb that works on one file: `write` gives the writer its one value.
template <class Write>
void writeRecord(const OutputOptions& options, Write write)
{
    JsonRecords records(options);
    write(records.begin());
    records.end();
    records.finish();
}

/// reportingFailures of a verb that works on one file: in JSON a Failure is the one record. What `work` prints comes
/// last in it.
template <class Work>
bool reportingRecord(const std::string& path, const OutputOptions& options, Work work)
{
    return reportingFailures(path, [&] {
        try {
            work();
        } catch (const Failure& failure) {
            if (JsonRecords records(options); options.wantsJson()) {
                records.addFailure(path, failure.what());
                records.finish();
            }
            throw;
        }
    });
}
