// What is off in an open audio file.
#pragma once

#include "media/containers/ContainerCheck.h"

class CFileIO;

/// As platform::checkContainer, which says what is found and returned; kStatusParameterError also for a file that is
/// compressed throughout, of which AudioFileInfo::IsWhole() tells.
KT_EXPORT std::int32_t CheckAudioFile(CFileIO& file, std::vector<platform::ContainerFinding>& findings);
