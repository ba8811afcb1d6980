// Problems of an ADM document beyond those that the parser raises: duplicate IDs, unreadable times, names that are not
// taken for ADM, and tracks that the file's chunk "chna" (ITU-R BS.2088) describes differently.
#pragma once

#include "adm/ADMDocument.h"
#include "adm/files/ADMSource.h"

#include <vector>

/// Reads the source a second time. `isComplete` if the document was read to its end, without which nobody knows which
/// elements there are.
std::vector<ADMDiagnostic> checkFurther(ADMSource& source, const ADMDocument& document, bool isComplete);
