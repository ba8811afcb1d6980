#include "tool/shared/input/FileFacts.h"

#include "files/AudioFileNames.h"
#include "files/CFileUtilDates.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/input/StandardInput.h"

FileFacts factsOf(const std::string& path)
{
    const CFileRef file = referenceTo(path);
    return {CFileUtilFileType(file), stereoHalf(path),
            isPiped(path) ? std::nullopt : CFileUtilGetModificationDate(file)};
}
