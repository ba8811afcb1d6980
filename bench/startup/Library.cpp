// A process that reads linear PCM through the library and ends.
#include "audiofile/XStream.h"

int main(int argc, char** argv)
{
    XStreamRef stream = nullptr;
    if (argc < 2 || XStreamOpen(argv[1], 0, 0, 0, nullptr, nullptr, &stream) != 0)
        return 1;
    char frames[512 * 16] = {};
    uint32_t done = 0;
    const int32_t status = XStreamReadFramesSync(stream, 0, 512, &done, frames, nullptr);
    XStreamClose(stream);
    return status == 0 && done > 0 ? 0 : 1;
}
