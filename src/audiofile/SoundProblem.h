// Why the sound of a file cannot be read, by what the file lacks. Asked only after a failure, since it reads the file
// again.
#pragma once

#include "audiofile/ContainerProblem.h"

class CFileIO;

/// None for a file that GetAudioFileInfo describes, and for one that only a decoder could judge. A failed read is a
/// problem of the kind `status`.
KT_EXPORT ContainerProblem SoundProblem(CFileIO& file);
