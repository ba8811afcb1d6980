// Edits the metadata of several files one by one and reports each.
#pragma once

#include "tool/meta/MetaFileEdit.h"
#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/output/JsonRecords.h"

struct MetaEditWords {
    const char *action, *done, *dryRun; // "set", "set", "would set"
};

class MetaEdits {
public:
    /// Throws Failure; called with the file while nobody else changes it.
    using Plan = std::function<MetaPlan(const std::string& target)>;

    MetaEdits(const MetaEditWords& words, EditOptions options, const OutputOptions& output);

    /// Writes nothing if the plan changes nothing. Reports a Failure, preceded by `place`.
    void edit(const std::string& path, const Plan& plan, const std::string& place = {});
    /// Reports a file that is not processed.
    void fail(const std::string& path, const std::string& text);
    /// Call after the last file; false if one failed.
    bool finish();

    std::size_t changed() const { return changed_; }
    std::size_t unchanged() const { return unchanged_; }
    std::size_t failed() const { return failed_; }

private:
    void tell(const std::string& path, const MetaPlan& plan, const std::string& backup);

    MetaEditWords words_;
    EditOptions options_;
    OutputOptions output_;
    JsonRecords json_;
    std::size_t changed_ = 0, unchanged_ = 0, failed_ = 0;
};
