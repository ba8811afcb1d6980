// The library's source of ADM documents for files that are named on the command line, with its errors as Failures.
#pragma once

#include "adm/files/ADMSource.h"

#include <memory>
#include <string>

/// As ADMSource::open; throws Failure: also for what is neither XML nor a container, and for a container without the
/// chunk.
std::unique_ptr<ADMSource> openAdm(const std::string& path,
                                   ADMSource::Document document = ADMSource::Document::isThere);
