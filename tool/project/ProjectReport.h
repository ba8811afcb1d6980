// What `ktfiles project` tells of a package.
#pragma once

#include "project/ProjectInformation.h"
#include "tool/shared/output/Output.h"

#include <nlohmann/json_fwd.hpp>

/// A value of a property list: data as base64, dates as ISO 8601 in UTC.
nlohmann::ordered_json projectJson(const platform::Value& value);
/// "2026-11-21T09:30:00Z".
std::string dateText(platform::Date date);

/// What an edit has done: `json` without the path; `sentence` for people and pipes alike.
void printProjectEdit(const std::string& path, const OutputOptions& options, const nlohmann::ordered_json& json,
                      const std::string& sentence);

void printProject(const std::string& path, ProjectInformation& project, const OutputOptions& options);
