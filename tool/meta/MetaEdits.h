// Edits of the metadata of several files, one by one, each told when it is done.
#pragma once

#include "tool/meta/MetaFileEdit.h"
#include "tool/shared/edits/SafeEdit.h"
#include "tool/shared/output/JsonRecords.h"

struct MetaEditWords {
    const char *action, *done, *dryRun; // "set", "set", "would set"
};

class MetaEdits {
public:
    /// Throws Failure; is called with the file while nobody else changes it.
    using Plan = std::function<MetaPlan(const std::string& target)>;

    MetaEdits(const MetaEditWords& words, EditOptions options, const OutputOptions& output);

    /// Nothing is written where the plan changes nothing. A Failure is told, with `place` ahead of it.
    void edit(const std::string& path, const Plan& plan, const std::string& place = {});
    /// Of a file that is not come to.
    void fail(const std::string& path, const std::string& text);
    /// Behind the last; false when one failed.
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
