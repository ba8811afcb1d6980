// Writes tables of metadata file by file.
#pragma once

#include "tool/meta/MetaCells.h"
#include "tool/shared/edits/OutputFile.h"

#include <cstdio>

class MetaTableWriter {
public:
    virtual ~MetaTableWriter() = default;
    /// `path` is as in the output.
    virtual void add(const std::string& path, const std::vector<MetaCell>& cells) = 0;
    virtual void finish() = 0;
    /// Files that failed appear in no table.
    void addFailure(const std::string&, const std::string&) {}
};

/// A row per file and a column per field of any file. The columns are known only after the last file, so rows are kept
/// in a temporary file and only the names of columns in memory.
class MetaCSVWriter : public MetaTableWriter {
public:
    /// `marked` adds a byte order mark, by which some spreadsheets recognize UTF-8.
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
    std::vector<MetaName> names_; // of the columns, in order of appearance
    std::map<std::string, std::size_t, std::less<>> columns_;
};

/// An element per file, with an element per field in file order.
class MetaXMLWriter : public MetaTableWriter {
public:
    explicit MetaXMLWriter(Sink sink);
    void add(const std::string& path, const std::vector<MetaCell>& cells) override;
    void finish() override;

private:
    Sink sink_;
};
