// One chunk stored for a file of any kind: in the file when it is a container, else in sidecar files beside it.
//
// There are two sidecars. The raw one is the file's name with the extension that the caller gives, and its content is
// the chunk's bytes. The metadata sidecar is the name with the extension "ktmd", an AIFF file without samples that
// carries chunks. A sidecar whose name is the file's own is none; nor is a raw one with the name of the metadata
// sidecar, or without an extension (a null pointer).
#pragma once

#include "audiofile/CChunkData.h"
#include "files/CFileRef.h"

#include <cstdint>

/// Changes the bytes on their way, in place: `reading` is 0 for a copy that is about to be written, 1 for bytes that
/// were read. Never null.
using ChunkTransform = void (*)(void* data, long size, unsigned char reading);

/// Flags of CFileUtilAddData, a bit set.
enum : long {
    kChunkDataUnlessLoop = 1, // nothing is stored in a file that is a tagged loop
};

/// Removes every older copy, then stores the chunk, in the metadata sidecar when the file is no container; a raw
/// sidecar that was there is written anew as well. kStatusFileNotFound without the file; kStatusIOError when what
/// should take the chunk is no container; kStatusParameterError for a negative size; else the status of creating or
/// opening a sidecar. Nothing is rolled back.
///
/// Kept: an add that fails inside a container is not reported.
KT_EXPORT std::int32_t CFileUtilAddData(const CFileRef& file, const CChunkData& chunk, const char* extension,
                                        long flags, ChunkTransform transform);
/// Fills the record from the first that has the chunk `chunk.id`: the metadata sidecar, the file named by `extension`
/// when it is a container, the file itself. kStatusFileNotFound without the file, -1 when none has it.
///
/// Kept: the metadata sidecar gives its whole content, whatever chunk is asked for. One of no bytes is deleted.
KT_EXPORT std::int32_t CFileUtilReadData(const CFileRef& file, CChunkData& chunk, const char* extension,
                                         ChunkTransform transform);
/// Deletes the raw sidecar and removes the chunk `chunk.id` from the file; not from the metadata sidecar. The status of
/// the removal, or of the deletion for a file that is no container.
KT_EXPORT std::int32_t CFileUtilRemoveData(const CFileRef& file, const CChunkData& chunk, const char* extension);
