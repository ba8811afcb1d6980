// Overviews stored in the audio file itself, as a chunk of its container: in AIFF and WAVE "LGWV" (read only: "ovwf"
// of older files), in CAF its own overview chunk "ovvw". Page: docs/formats/overview.md.
#pragma once

#include "files/CFileRef.h"
#include "loops/overview/OverviewBlock.h"

#include <cstdint>
#include <memory>

/// Stores `overview` in the file, in place of an earlier one; the block is unchanged in the end. `frames` is how many
/// it covers when the caller knows better than the file (compressed formats); 0 takes the file's. `stored` (may be
/// null) becomes true when a chunk was stored: for silence CAF gets none, and loses an earlier one. In CAF the old
/// one goes when the new one is there.
///
/// 0; kStatusParameterError, the file untouched, for bytes that are no block or do not fit the frames, for a file
/// that is not AIFF, WAVE or CAF, for a CAF file whose chunk "data" is open-ended (SettleContainerEnd ends it) or not
/// all there, and where bytes that are no chunk follow the last one (CAudioFileIO::PrepareToAppend); -108 when memory
/// is short; else the status of the open, or of CAudioFileIO::AddChunk.
KT_EXPORT std::int32_t WriteOverviewToAudioFile(const CFileRef& ref, KTMem* overview, long frames, bool* stored);

/// The overview stored in the file; null when there is none. `frames` as above. `status` (may be null) is 0 with an
/// overview and when none is stored; kStatusParameterError for a stored one that does not fit the frames or makes no
/// sense, and for a file of another kind; else the status of the open or the read.
KT_EXPORT std::unique_ptr<KTMem> ReadOverviewFromAudioFile(const CFileRef& ref, long frames,
                                                           std::int32_t* status = nullptr);

/// The side file of an audio file: its reference with the extension "ktmd". An overview may lie there; nothing here
/// reads or writes it.
KT_EXPORT CFileRef GetMetadataFileRefForAudioFile(const CFileRef& ref);
