// An ADM document as JSON.
#pragma once

#include "adm/ADMDocument.h"

#include <string>
#include <vector>

class JsonWriter;

/// The keys "path", one for each kind of element, and "diagnostics" unless that is null. Times are microseconds.
/// What is not given or no number has no key. Nothing but one element is held at a time; no line break behind the
/// object.
KT_EXPORT void writeADMJson(JsonWriter& json, const std::string& path, const ADMDocument& document,
                            const std::vector<ADMDiagnostic>* diagnostics);

/// An array of objects with the keys "line", "column", "name", "elementID" and "reason".
KT_EXPORT void writeADMDiagnostics(JsonWriter& json, const std::vector<ADMDiagnostic>& diagnostics);
