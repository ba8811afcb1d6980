#include "audiofile/AudioFileCheck.h"

#include "audiofile/FileWindow.h"

std::int32_t CheckAudioFile(CFileIO& file, std::vector<platform::ContainerFinding>& findings)
{
    FileWindow window(file, file.GetEOF());
    return platform::checkContainer(window, findings);
}
