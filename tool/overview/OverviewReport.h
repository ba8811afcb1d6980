// Prints the result of `ktfiles overview` for each file: a sparkline, a line for scripts, JSON, or what was drawn and
// stored.
#pragma once

#include "tool/overview/FileOverview.h"
#include "tool/overview/OverviewStore.h"
#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/JsonRecords.h"

#include <optional>
#include <string>
#include <vector>

/// What was done with a file's overview other than showing it.
struct OverviewDeeds {
    std::string png, svg, data; // files written; empty or "-": not reported
    std::string sheet;          // reported when it is written
    int width = 0, height = 0;
    std::optional<StoreResult> store;
    bool dryRun = false;

    bool any() const { return !png.empty() || !svg.empty() || !data.empty() || !sheet.empty() || store; }
};

class OverviewReport {
public:
    /// The files to come determine the width of the names.
    OverviewReport(const OutputOptions& options, const FileArguments& files);

    /// The overview must have points unless there are deeds to report and no JSON to write.
    void add(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds);
    void addSheet(const std::string& out, std::size_t files, int width, int height);
    void addFailure(const std::string& path, const std::string& text);
    void finish();

private:
    void addSparkline(const std::string& path, const Waveform& waveform);
    void addDeeds(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds);
    void addJson(const std::string& path, const FileOverview& overview, const OverviewDeeds& deeds);

    Form form_;
    bool color_;
    int nameWidth_ = 0;
    int columns_;
    Output& output_ = Output::standard();
    JsonRecords json_;
};
