// Brings an index up to date before it is asked.
#pragma once

#include "tool/shared/library/LibraryQuery.h"

#include <string>

/// Looks again at the folders that a query looks in, and makes the index if there is none; else at all that is in the
/// index. What cannot be looked at is told, and stays in the index as it was. Throws Failure.
void bringUpToDate(const std::string& path, const LibraryQuery& query, bool quiet);
