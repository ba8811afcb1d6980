// Describes audio files: what they are, and which chunks their containers hold. Usage: describe FILE…
#include "audiofile/CAudioFileIO.h"

#include <cstdio>
#include <filesystem>

namespace {

bool describe(const char* path)
{
    CAudioFileIO file;
    const std::string absolute = std::filesystem::absolute(path); // a CFileRef knows no working folder
    const std::int32_t status = file.Open(CFileRef(absolute.c_str(), false), 0);
    if (status != kStatusOK) {
        std::fprintf(stderr, "%s: %s\n", path, StatusText(status));
        return false;
    }
    const AudioFileInfo& info = file.Info();
    std::printf("%s: %s, %lld Hz, %d channels, %lld frames\n", path, fourCCText(info.fileType).c_str(),
                static_cast<long long>(info.sampleRate), info.channels, static_cast<long long>(info.frames));
    return file.ForEachChunk([](const ChunkEntry& chunk) {
        std::printf("  %s  %lld bytes\n", fourCCText(chunk.id).c_str(), static_cast<long long>(chunk.size));
        return true;
    }) == kStatusOK;
}

} // namespace

int main(int argc, char** argv)
{
    bool good = argc > 1;
    for (int i = 1; i < argc; ++i)
        good = describe(argv[i]) && good;
    return good ? 0 : 1;
}
