// The bytes of a new audio file of the audio-file service.
#pragma once

#include "media/samples/StreamDescription.h"
#include "platform/core/Bytes.h"

namespace platform {

/// The bytes of a new file without samples, its audio data last and at offset 4096, filler ahead of it for user data to
/// come. Empty when the container cannot hold the format. Bytes per packet and frames per packet need not be given.
Bytes newAudioFile(FourCC fileType, StreamDescription format);

} // namespace platform
