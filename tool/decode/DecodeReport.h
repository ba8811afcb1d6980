// Prints what `ktfiles decode` has written, file by file.
#pragma once

#include "tool/decode/DecodeFile.h"
#include "tool/shared/output/JsonRecords.h"

#include <string>

/// A writer for writeFileByFile.
class DecodeReport {
public:
    DecodeReport(Form form, const OutputOptions& options) : form_(form), quiet_(options.quiet), json_(options) {}

    void add(const std::string& path, const DecodeResult& result);
    void addFailure(const std::string& path, const std::string& text);
    void finish();

private:
    Form form_;
    bool quiet_;
    Output& output_ = Output::standard();
    JsonRecords json_;
};
