// The loop tags of files as rows of CSV.
#pragma once

#include "tool/shared/looptags/LoopTags.h"
#include "tool/shared/output/CsvRecords.h"

CsvColumns loopColumns();
/// Of the transients their number, of the chunks their ids.
std::string loopRow(const std::string& path, const LoopTags& tags);
