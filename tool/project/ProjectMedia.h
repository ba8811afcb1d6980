// The files that a project uses, and the folders that it has for them.
#pragma once

#include "files/CFileRef.h"
#include "project/ProjectInformation.h"
#include "tool/shared/output/Output.h"

#include <optional>

/// Of one alternative, or of all; each file once for each kind, in the order of the names' bytes.
void printProjectMedia(const std::string& path, ProjectInformation& project, std::optional<long> alternative,
                       bool onlyMissing, const OutputOptions& options);

/// Of any kind of project, whose folder is `base`; created first where that is asked for. Throws Failure.
void printProjectDirectories(const std::string& path, const CFileRef& base, std::optional<long> alternative,
                             bool create, const OutputOptions& options);
