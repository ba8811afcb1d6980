// The loop tags of files as rows of CSV.
#pragma once

#include "loops/tags/LoopTags.h"
#include "tool/shared/output/CsvRecords.h"

CsvColumns loopColumns();
/// Of transients and markers their number, of chunks their ids, of loops "FIRST-LAST", of sources "NAME=CHUNK".
std::string loopRow(const std::string& path, const LoopTags& tags);
