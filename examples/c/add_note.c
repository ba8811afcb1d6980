/* Stores a text in an audio file as a chunk "note", in place of an earlier one, by a safe edit, and reads it back.
   Usage: add_note FILE TEXT */
#include <ktfiles.h>

#include <stdio.h>
#include <string.h>

enum { kMost = 4096 };

int main(int argc, char** argv)
{
    const uint32_t note = KTF_CODE('n', 'o', 't', 'e');
    ktf_edit_options options = KTF_EDIT_OPTIONS;
    ktf_file* file = NULL;
    ktf_chunk chunk;
    char text[kMost];
    size_t size = 0;
    ktf_status status;
    if (argc != 3 || strlen(argv[2]) > kMost)
        return 2;
    options.flags = KTF_EDIT_REPLACE;
    status = ktf_add_chunk(argv[1], note, argv[2], strlen(argv[2]), &options);
    if (status == KTF_OK)
        status = ktf_open(argv[1], KTF_OPEN_CONTAINER, &file);
    if (status == KTF_OK)
        status = ktf_find_chunk(file, note, &chunk, sizeof chunk);
    if (status == KTF_OK)
        status = ktf_read_chunk(file, &chunk, 0, text, sizeof text, &size);
    ktf_close(&file);
    if (status == KTF_OK)
        printf("%.*s\n", (int)size, text);
    else
        fprintf(stderr, "%s\n", ktf_last_error());
    return status == KTF_OK ? 0 : 1;
}
