// ktfiles info --check: what is off in files, a line or a record each.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

/// By `threads` threads, 0 for one per core. False when something is off, and when a file could not be looked at.
bool checkFiles(const FileArguments& files, unsigned threads, const OutputOptions& options);
