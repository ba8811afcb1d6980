// ktfiles info --check: what is off in files, a line or a record each.
#pragma once

#include "tool/shared/input/FileArguments.h"
#include "tool/shared/output/Output.h"

/// False when something is off, and when a file could not be looked at.
bool checkFiles(const FileArguments& files, const OutputOptions& options);
