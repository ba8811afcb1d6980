// A project package named on the command line.
#pragma once

#include "project/ProjectDirectories.h"
#include "project/ProjectInformation.h"

#include <memory>
#include <optional>
#include <string>

/// The path of an existing folder with symbolic links resolved: a package reached through a link has its media beside
/// itself, not beside the link. Throws a Failure that says why it is none.
std::string resolvedFolder(const std::string& path);

/// As above, as a reference.
CFileRef projectFolder(const std::string& path);

/// The package's information; throws Failure if it has none.
std::unique_ptr<ProjectInformation> openProject(const std::string& path);

/// The given alternative, else the active one. Throws Failure if it has no folder.
long alternativeOf(const ProjectInformation& project, std::optional<long> given);

/// The last component of a backup's folder.
std::string backupName(const platform::URLRef& url);

/// The other party of an exchange that was cut short: a backup's name, or the path of a folder elsewhere; empty if its
/// record cannot be read.
std::string backupName(const InterruptedProjectExchange& interrupted, const ProjectInformation& project,
                       long alternative);

/// Throws Failure if a folder of the package is a link or lies behind one. Packages come from strangers, so nothing is
/// deleted, restored or written through links.
void requireNoLink(const std::string& package, const std::string& folder);
