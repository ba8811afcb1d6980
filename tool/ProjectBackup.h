// Making a backup of an alternative's project data.
#pragma once

#include "project/ProjectInformation.h"

#include <string>

/// Copies the project data, with the metadata and the ARA data, to a new backup, which takes its name when it is whole;
/// the oldest go where there are more than `keep`. Returns its name, nothing for a dry run. Throws Failure.
std::string makeBackup(const ProjectInformation& project, long alternative, int keep, PurgeOldBackups purge,
                       bool dryRun, bool quiet);
