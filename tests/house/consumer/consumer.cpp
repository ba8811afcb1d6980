// The smallest host: opens an audio file and describes it.
#include "audiofile/CAudioFileIO.h"

#include <cstdio>

int main(int argc, char** argv)
{
    if (argc != 2)
        return 2;
    CAudioFileIO file;
    const std::int32_t status = file.Open(CFileRef(argv[1], false), 0);
    if (status != kStatusOK || file.Info().frames == 0) {
        std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(status));
        return 1;
    }
    std::printf("%lld frames at %lld Hz\n", static_cast<long long>(file.Info().frames),
                static_cast<long long>(file.Info().sampleRate));
    return 0;
}
