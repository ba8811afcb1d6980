// One file of a scan: read by any thread and put into the form of the output, then written in order.
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
    std::string path;               // of a bad file
    std::string text;               // of a loop the record, of several their lines; of a bad file what is wrong
    std::vector<std::string> cells; // of a loop in a table
    std::size_t loops = 0;
};

/// Reads one file. A loop is an AIFF or CAF file that has loop tags, transients or another loop chunk, and one of
/// these, AIFC or WAVE that other programs' chunks call a loop (SamplerTags::describeLoop). Bad is what cannot be read,
/// but of the files that hold no known audio, and of links to nothing, only those that are called so (".wav", ".aif",
/// ".aiff", ".aifc", ".caf"). Throws nothing.
ScanRecord scanFile(const FoundFile& file, Form form);

/// Adds what is to be written: lines join those ahead of them, which spares the threads the handing over of each.
void addTo(std::vector<ScanRecord>& records, ScanRecord record, Form form);

/// Writes the records of the loops, and in JSON and CSV those of bad files.
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
