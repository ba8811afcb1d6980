// Stores a text in an audio file as a chunk "note", replacing an earlier one, and reads it back; the samples stay as
// they are. Usage: add_note FILE TEXT
#include "audiofile/CAudioFileIO.h"

#include <cstdio>
#include <cstring>

int main(int argc, char** argv)
{
    if (argc != 3)
        return 2;
    CAudioFileIO file;
    std::int32_t status = file.Open(CFileRef(argv[1], false), kFileIOReadWrite);
    if (status == kStatusOK)
        status = file.AddChunk(fourCC("note"), bytesOf(argv[2]), true) == 1 ? file.Flush() : kStatusIOError;
    if (status != kStatusOK) {
        std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(status));
        return 1;
    }
    const std::optional<Bytes> note = file.FindChunk(fourCC("note"));
    if (!note || textOf(*note) != argv[2])
        return 1;
    std::printf("%s\n", argv[2]);
    return 0;
}
