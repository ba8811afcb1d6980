// Stores a text in an audio file as a chunk "note", in the place of an earlier one, and reads it back. Made to a copy
// that takes the file's place when all else is as it was. Usage: add_note FILE TEXT
#include "audiofile/CContainerEdit.h"
#include "audiofile/ContainerChanges.h"

#include <cstdio>
#include <filesystem>

int main(int argc, char** argv)
{
    if (argc != 3)
        return 2;
    const std::string path = std::filesystem::absolute(argv[1]); // a CFileRef knows no working folder
    const NewChunk note{.id = fourCC("note"), .body = bytesOf(argv[2]), .replaces = true};
    const auto add = [&](const std::string& copy) { return AddChunkTo(CFileRef(copy.c_str(), false), note).Status(); };
    CContainerEdit edit;
    std::int32_t status = edit.Begin(path).Status();
    if (status == kStatusOK)
        status = edit.Apply(EditScope::chunk(note.id), add).Status();
    if (status != kStatusOK) {
        std::fprintf(stderr, "%s: %s\n", argv[1], StatusText(status));
        return 1;
    }
    CAudioFileIO file(CFileRef(path.c_str(), false), 0);
    const std::optional<Bytes> found = file.FindChunk(note.id);
    if (!found || textOf(*found) != argv[2])
        return 1;
    std::printf("%s\n", argv[2]);
    return 0;
}
