// Tables of metadata being written, a file after the other.
#pragma once

#include "tool/meta/MetaCells.h"
#include "tool/shared/edits/OutputFile.h"

#include <cstdio>

class MetaTableWriter {
public:
    virtual ~MetaTableWriter() = default;
    /// `path` is as output shows it.
    virtual void add(const std::string& path, const std::vector<MetaCell>& cells) = 0;
    virtual void finish() = 0;
    /// Files that failed are in no table.
    void addFailure(const std::string&, const std::string&) {}
};

/// A row for each file, a column for each field that any file has. The columns are known behind the last file: until
/// then rows lie in a temporary file, so that memory is for the names of columns only.
class MetaCSVWriter : public MetaTableWriter {
public:
    /// With `marked` a byte order mark comes first, by which some spreadsheets know UTF-8.
    MetaCSVWriter(Sink sink, bool marked);
    void add(const std::string& path, const std::vector<MetaCell>& cells) override;
    void finish() override;

private:
    void keep(std::string_view text);
    std::size_t keptNumber();
    std::string keptText();

    struct Closing {
        void operator()(std::FILE* file) const { std::fclose(file); }
    };
    Sink sink_;
    bool marked_;
    std::unique_ptr<std::FILE, Closing> rows_;
    std::size_t count_ = 0;
    std::vector<MetaName> names_; // of the columns, as they came
    std::map<std::string, std::size_t, std::less<>> columns_;
};

/// An element for each file, and in it one for each field, in the order of the file.
class MetaXMLWriter : public MetaTableWriter {
public:
    explicit MetaXMLWriter(Sink sink);
    void add(const std::string& path, const std::vector<MetaCell>& cells) override;
    void finish() override;

private:
    Sink sink_;
};
