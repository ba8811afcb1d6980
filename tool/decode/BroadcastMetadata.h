// Adapts the metadata of broadcast wave files to decoded sound.
#pragma once

#include "platform/core/Bytes.h"
#include "tool/decode/DecodeFormat.h"
#include "tool/shared/portable/SoundChange.h"

#include <bit>
#include <string>
#include <vector>

struct BroadcastChange {
    SoundChange change;
    DecodedSound sound;    // as it is written
    bool isRecoded = true; // samples differ from the source's in any bit
    bool keepsChannels = true;
};

/// The body of a "bext" (EBU Tech 3285), little-endian. Its time is that of the first frame, moved and at the new rate;
/// its coding history gets a line if the sound was recoded (EBU R 98); its loudness is removed if it was measured on
/// other sound. The same bytes if nothing changes.
Bytes changedBroadcastExtension(BytesView body, std::endian order, const BroadcastChange& changed);

/// The body of an "iXML" with sample rates, bit depth and times adapted likewise; everything else stays to the byte.
/// Statements that remain true of the source only are listed in `stale`, in words.
Bytes changedIXML(BytesView body, const BroadcastChange& changed, std::vector<std::string>& stale);
