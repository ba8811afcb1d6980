// Prints what `ktfiles project` has found in a package.
#pragma once

#include "project/ProjectInformation.h"
#include "tool/shared/output/Output.h"

#include <functional>
#include <string>

class JsonWriter;

/// Writes the members of a JSON object.
using ProjectMembers = std::function<void(JsonWriter& json)>;

/// Reports an edit: `members` for JSON, without the path; `sentence` for people and pipes.
void printProjectEdit(const std::string& path, const OutputOptions& options, const ProjectMembers& members,
                      const std::string& sentence);

void printProject(const std::string& path, ProjectInformation& project, const OutputOptions& options);
