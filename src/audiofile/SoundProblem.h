// Why the sound of a file cannot be had, in terms of what the file lacks. Asked only once something has failed, since
// it looks at the file again.
#pragma once

#include "audiofile/ContainerProblem.h"

class CFileIO;

/// None for a file that GetAudioFileInfo describes, and for one that only a decoder could judge. The status of a read
/// that failed where that is what is wrong.
KT_EXPORT ContainerProblem SoundProblem(CFileIO& file);
