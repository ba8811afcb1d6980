// Exchanges an alternative's data with a backup's, and settles an exchange that was cut short.
#pragma once

#include "tool/project/ProjectArguments.h"
#include "tool/shared/output/Output.h"

/// These throw Failure.
void restoreBackup(const ProjectArguments& arguments, const OutputOptions& output);
void settleExchange(const ProjectArguments& arguments, const OutputOptions& output);
