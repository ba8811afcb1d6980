// Loop tags of files as CSV rows.
#pragma once

#include "loops/tags/LoopTags.h"
#include "tool/shared/output/CsvRecords.h"

CsvColumns loopColumns();
/// Transients and markers as a number, chunks as ids, loops as "FIRST-LAST", sources as "NAME=CHUNK".
std::string loopRow(const std::string& path, const LoopTags& tags);
