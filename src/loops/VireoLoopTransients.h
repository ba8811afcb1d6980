// Storing the frame positions of a loop's transients without the object layer; AIFF files through
// CAudioFileIO::ReplaceVireoLoopTransients.
#pragma once

#include "files/CFileRef.h"
#include "platform/core/Export.h"

#include <cstdint>

/// Stores the positions in a CAF file (CAFTransientUUIDChunkData), in place of earlier ones. 0, or a status: that of
/// opening the file for reading and writing, kStatusParameterError for a file that is no CAF and for more positions
/// than a chunk holds (357,913,938), kStatusOutOfMemory. A count below 0 counts as 0.
KT_EXPORT std::int32_t WriteCAFTransientChunk(const CFileRef& file, const std::int64_t* positions, std::int64_t count);
