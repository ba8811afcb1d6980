// Where a file is, by the path that Python gives.
#pragma once

#include "files/CFileRef.h"

#include <string>

/// Absolute; the bytes need not be UTF-8. Throws Problem for a path that is empty or no file's.
platform::URLRef locationOf(const std::string& path);

/// The same as a reference.
CFileRef referenceTo(const std::string& path);
