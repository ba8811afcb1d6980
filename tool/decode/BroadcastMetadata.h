// What broadcast wave files say of their sound, made true of the sound that it was decoded to.
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
    bool isRecoded = true; // its samples are not those of the source, bit by bit
    bool keepsChannels = true;
};

/// The body of a "bext" (EBU Tech 3285), little-endian: the time of its first frame, moved and at the new rate; its
/// coding history with a line for what was recoded (EBU R 98); its loudness taken out where it is that of another
/// sound. The same bytes where nothing changes.
Bytes changedBroadcastExtension(BytesView body, std::endian order, const BroadcastChange& changed);

/// The body of an "iXML" with its sample rates, bit depth and times by the same rules; all else stays to the byte. What
/// it goes on saying of the source goes to `stale`, in words.
Bytes changedIXML(BytesView body, const BroadcastChange& changed, std::vector<std::string>& stale);
