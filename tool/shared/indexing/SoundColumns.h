// What a file is, in the columns of an index.
#pragma once

#include "audiofile/AudioFileInfo.h"

struct LibraryRecord;

void addSound(LibraryRecord& record, const AudioFileInfo& info);
