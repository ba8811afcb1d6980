// One file of a scan: read and formatted by any thread, then written in order.
#pragma once

#include "tool/shared/input/FoundFile.h"
#include "tool/shared/output/CsvRecords.h"
#include "tool/shared/output/JsonRecords.h"
#include "tool/shared/output/Table.h"

#include <string>
#include <vector>

struct ScanRecord {
    enum Kind { none, loop, bad };
    Kind kind = none;
    std::string path;               // set for a bad file
    std::string text;               // record of a loop, lines of several loops, or the problem of a bad file
    std::vector<std::string> cells; // set for a loop in a table
    std::size_t loops = 0;
};

/// Reads one file. A loop is an AIFF or CAF file with loop tags, transients or another loop chunk, or one of these,
/// AIFC or WAVE that other programs' chunks call a loop (SamplerTags::describeLoop). A bad file cannot be read; among
/// files without known audio and dangling links, only those with an extension of loops (".wav", ".aif", ".aiff",
/// ".aifc", ".caf") count as bad. Throws nothing.
ScanRecord scanFile(const FoundFile& file, Form form);

/// Adds a record to write: a line is appended to the lines before it, so that threads need not pass each one on.
void addTo(std::vector<ScanRecord>& records, ScanRecord record, Form form);

/// Writes the records of loops, and in JSON and CSV those of bad files.
class ScanWriter {
public:
    ScanWriter(Form form, const OutputOptions& options);
    void add(const ScanRecord& record);
    void finish();

private:
    Form form_;
    bool color_;
    bool first_ = true;
    Table table_;
    Output& output_ = Output::standard();
    JsonRecords json_;
    CsvRecords csv_;
};
