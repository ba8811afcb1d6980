// Making a backup of an alternative's project data.
#pragma once

#include "project/ProjectInformation.h"

#include <string>

constexpr int kMostBackups = 100; // that two digits name

/// Copies the project data, with the metadata and the ARA data, to a new backup, which takes its name when it is whole.
/// Then the oldest go where there are more than `keep`; 0 keeps all. Returns its name, nothing for a dry run. Throws
/// Failure, also when the backup stands but old ones cannot be deleted.
std::string makeBackup(const ProjectInformation& project, long alternative, int keep, bool dryRun, bool quiet);
