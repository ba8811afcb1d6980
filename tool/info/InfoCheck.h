// ktfiles info --check: lists what is wrong in files, a line or a record each.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

/// Uses `threads` threads, 0 for one per core. False if something is wrong, and if a file could not be read.
bool checkFiles(const FileArguments& files, unsigned threads, const OutputOptions& options);
