// A second copy of the library, loaded into a process that has one already.
#include "platform/FileCoordination.h"

using namespace platform;

extern "C" KT_EXPORT bool writeInCopy(const char* folder, const char* path, void (*accessor)(void*), void* context)
{
    FileCoordinator::setCoordinationFolder(folder);
    const URLRef url =
        URL::createWithFileSystemPath(String::fromFileSystemRepresentation(path), PathStyle::posix, false);
    return FileCoordinator().coordinateWriting(url, FileCoordinator::WritingOptions::none,
                                               [&](const URLRef&) { accessor(context); });
}
