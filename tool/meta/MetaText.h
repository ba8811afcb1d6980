// What is written of a file's metadata, in each form of output.
#pragma once

#include "audiofile/fields/FileMetadata.h"
#include "tool/shared/output/CsvRecords.h"

/// Of each file on its own, so that those who read the files make the texts too.
class MetaText {
public:
    /// With `several` files each line says which.
    MetaText(const OutputOptions& options, bool several);

    /// The tree, the lines, the object of JSON or the rows of CSV; empty where nothing is to be written.
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

/// Of CSV, in the order of the keys of JSON.
CsvColumns metaColumns();
