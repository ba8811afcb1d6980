// Formats a file's metadata for each form of output.
#pragma once

#include "audiofile/fields/FileMetadata.h"
#include "tool/shared/output/CsvRecords.h"

/// Works on each file separately, so that the threads that read files also format them.
class MetaText {
public:
    /// With `several` files each line names its file.
    MetaText(const OutputOptions& options, bool several);

    /// The tree, the lines, the JSON object or the CSV rows; empty if nothing is written.
    std::string of(const std::string& path, const FileMetadata& metadata) const;

private:
    std::string tree(const std::string& path, const FileMetadata& metadata) const;
    std::string lines(const std::string& path, const FileMetadata& metadata) const;
    std::string json(const std::string& path, const FileMetadata& metadata) const;

    Form form_;
    bool keepsToOneLine_;
    bool color_;
    bool several_;
};

/// CSV columns in the order of the JSON keys.
CsvColumns metaColumns();
