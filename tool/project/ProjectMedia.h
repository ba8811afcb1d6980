// The files that a project uses, and its folders for them.
#pragma once

#include "files/CFileRef.h"
#include "project/ProjectInformation.h"
#include "tool/shared/output/Output.h"

#include <optional>

/// For one alternative or all; each file once per kind, in byte order of the names.
void printProjectMedia(const std::string& path, ProjectInformation& project, std::optional<long> alternative,
                       bool onlyMissing, const OutputOptions& options);

/// For any kind of project, whose folder is `base`; creates the folders first if requested. Throws Failure.
void printProjectDirectories(const std::string& path, const CFileRef& base, std::optional<long> alternative,
                             bool create, const OutputOptions& options);
