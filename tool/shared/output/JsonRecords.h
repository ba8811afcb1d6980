// A verb's JSON: one array with a record per line, or with --jsonl only the lines.
#pragma once

#include "platform/core/JsonWriter.h"
#include "tool/shared/output/Failure.h"
#include "tool/shared/output/Output.h"

class JsonRecords {
public:
    explicit JsonRecords(const OutputOptions& options);

    /// Begins a record, which must be a single value.
    JsonWriter& begin();
    /// Call after each record. Lines are flushed, so that a reader can continue.
    void end();
    // Do nothing if no JSON was requested.

    /// Adds the record of a file that failed.
    void addFailure(const std::string& path, const std::string& text);
    /// Call after the last record, even if there was none.
    void finish();

private:
    void beginArray();

    JsonShape shape_;
    bool hasBegun_ = false;
    JsonWriter json_{Output::standard()};
};

/// The record of a verb that processes one file: `write` writes its single value.
template <class Write>
void writeRecord(const OutputOptions& options, Write write)
{
    JsonRecords records(options);
    write(records.begin());
    records.end();
    records.finish();
}

/// reportingFailures for a verb that processes one file: in JSON a Failure is the only record. `work` must not print
/// before it can no longer fail.
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
