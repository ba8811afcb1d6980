// A project package named on the command line.
#pragma once

#include "project/ProjectDirectories.h"
#include "project/ProjectInformation.h"

#include <memory>
#include <optional>
#include <string>

/// An existing folder; throws the Failure that says why it is none.
CFileRef projectFolder(const std::string& path);

/// The package's information; throws Failure when it has none.
std::unique_ptr<ProjectInformation> openProject(const std::string& path);

/// The alternative that is meant: the one given, else the active one. Throws Failure when it has no folder.
long alternativeOf(const ProjectInformation& project, std::optional<long> given);

/// The last component of a backup's folder.
std::string backupName(const platform::URLRef& url);
