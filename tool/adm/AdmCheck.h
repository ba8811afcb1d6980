// What a check of an ADM document finds beside what the parser raises: IDs that come twice, times that cannot be read,
// names that are not taken for ADM, and tracks that the file's chunk "chna" (ITU-R BS.2088) tells otherwise.
#pragma once

#include "adm/ADMDocument.h"
#include "tool/shared/adm/AdmSource.h"

#include <vector>

/// Reads the source a second time. `isComplete` when the document went through to its end: only then is known which
/// elements there are.
std::vector<ADMDiagnostic> checkFurther(AdmSource& source, const ADMDocument& document, bool isComplete);
