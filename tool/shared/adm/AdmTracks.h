// What the chunk "chna" (ITU-R BS.2088) of an audio file says of its tracks, against its channels and its ADM document.
#pragma once

#include "adm/ADMDocument.h"
#include "tool/shared/adm/AdmSource.h"

#include <vector>

/// `document` is the source's, read to its end; null where there is none: tracks may be of common definitions alone.
/// Also that there are tracks and no "chna". Throws Failure.
std::vector<ADMDiagnostic> trackProblems(AdmSource& source, const ADMDocument* document);
