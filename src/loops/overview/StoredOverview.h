// Overviews stored beside the audio: in the file itself, as a chunk of its container. AIFF and WAVE hold them in a
// chunk "LGWV" (read only: "ovwf" of older files), CAF in its own overview chunk "ovvw". Page:
// docs/formats/overview.md.
#pragma once

#include "files/CFileRef.h"
#include "loops/overview/OverviewBlock.h"

#include <cstdint>
#include <memory>

/// Stores `overview` in the file, in place, instead of one that is there; the block is unchanged in the end. `frames`
/// is the number that it covers where the caller knows better than the file (compressed formats); 0: what the file
/// says. `stored` (may be null) becomes true when a chunk was stored: of silence CAF gets none, and loses the one it
/// had. 0; kStatusParameterError, the file untouched, for a block that is none or does not fit the frames, for a file
/// that is not AIFF, WAVE or CAF, for a CAF file whose chunk "data" is open-ended (SettleContainerEnd ends it) or not
/// all there, and where bytes that are no chunk stand behind the last one (CAudioFileIO::PrepareToAppend); -108 when
/// memory is short; else the status of the open, or of CAudioFileIO::AddChunk. In CAF the old one goes when the new one
/// stands.
KT_EXPORT std::int32_t WriteOverviewToAudioFile(const CFileRef& ref, KTMem* overview, long frames, bool* stored);

/// The overview stored in the file, or none. `frames` as above. `status` (may be null): 0 with an overview, and also
/// when none is stored; kStatusParameterError for a stored one that does not fit the frames, or makes no sense, and for
/// a file of another kind; else the status of the open or the read.
KT_EXPORT std::unique_ptr<KTMem> ReadOverviewFromAudioFile(const CFileRef& ref, long frames,
                                                           std::int32_t* status = nullptr);

/// The side file of an audio file: its reference with the extension "ktmd". An overview may live there; nothing here
/// reads or writes it.
KT_EXPORT CFileRef GetMetadataFileRefForAudioFile(const CFileRef& ref);
