// Checks the chunk "chna" (ITU-R BS.2088) of an audio file against its channels and its ADM document.
#pragma once

#include "adm/ADMDocument.h"
#include "adm/files/ADMSource.h"

#include <vector>

/// `document` is the source's, read to its end, or null if there is none: tracks may use only common definitions.
/// Reports tracks without a "chna" too. Throws Failure.
std::vector<ADMDiagnostic> trackProblems(ADMSource& source, const ADMDocument* document);
