// ktfiles index --records: reads files without an index, for other machines to merge.
#pragma once

#include "tool/shared/indexing/LibraryUpdate.h"
#include "tool/shared/output/Output.h"

/// Writes the records of all files, and the folders that were named, as JSON Lines to standard output, in the order in
/// which they are read. False if a file or a folder could not be read.
bool writeIndexRecords(LibraryUpdate update, OutputOptions options);
