// A project package named on the command line.
#pragma once

#include "project/ProjectDirectories.h"
#include "project/ProjectInformation.h"

#include <memory>
#include <optional>
#include <string>

/// The path of an existing folder, every symbolic link resolved: a package that is reached by a link has its media
/// beside itself, not beside the link. Throws the Failure that says why it is none.
std::string resolvedFolder(const std::string& path);

/// The same as a reference.
CFileRef projectFolder(const std::string& path);

/// The package's information; throws Failure when it has none.
std::unique_ptr<ProjectInformation> openProject(const std::string& path);

/// The alternative that is meant: the one given, else the active one. Throws Failure when it has no folder.
long alternativeOf(const ProjectInformation& project, std::optional<long> given);

/// The last component of a backup's folder.
std::string backupName(const platform::URLRef& url);

/// What an exchange that was cut short had to do with: a backup's name, or the path of a folder elsewhere; empty when
/// its record cannot be understood.
std::string backupName(const InterruptedProjectExchange& interrupted, const ProjectInformation& project,
                       long alternative);

/// Throws Failure for a folder in the package that is a link, or lies behind one: nothing is deleted, restored or
/// written through it, since packages come from strangers.
void requireNoLink(const std::string& package, const std::string& folder);
