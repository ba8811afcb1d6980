// Makes a backup of an alternative's project data.
#pragma once

#include "project/ProjectInformation.h"

#include <string>

constexpr int kMostBackups = 100; // names have two digits

/// Copies the project data, metadata and ARA data to a new backup, which gets its name when it is complete. Then
/// deletes the oldest backups beyond `keep`; 0 keeps all. Returns the name, or nothing for a dry run. Throws Failure,
/// also if the backup exists but old ones cannot be deleted.
std::string makeBackup(const ProjectInformation& project, long alternative, int keep, bool dryRun, bool quiet);
