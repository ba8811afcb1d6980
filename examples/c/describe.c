/* Describes audio files: what they are, and which chunks their containers hold. Usage: describe FILE... */
#include <ktfiles.h>

#include <stdio.h>

static int print_chunk(void* context, const ktf_chunk* chunk)
{
    char id[KTF_CODE_TEXT_SIZE];
    (void)context;
    printf("  %s  %lld bytes\n", ktf_code_text(chunk->id, id), (long long)chunk->size);
    return 0; /* go on */
}

static ktf_status describe(const char* path)
{
    char container[KTF_CODE_TEXT_SIZE], coding[KTF_CODE_TEXT_SIZE];
    ktf_file* file = NULL;
    ktf_info info;
    ktf_status status = ktf_open(path, 0, &file);
    if (status == KTF_OK)
        status = ktf_get_info(file, &info, sizeof info);
    if (status == KTF_OK) {
        printf("%s: %s, %s, %g Hz, %u channels, %lld frames\n", path, ktf_code_text(info.container, container),
               ktf_code_text(info.coding, coding), info.sample_rate, (unsigned)info.channels, (long long)info.frames);
        if (info.flags & KTF_INFO_HAS_CHUNKS)
            status = ktf_each_chunk(file, print_chunk, NULL);
    }
    ktf_close(&file); /* null, and a pointer to null, are no mistake */
    return status;
}

int main(int argc, char** argv)
{
    int failed = 0;
    for (int i = 1; i < argc; ++i)
        if (describe(argv[i]) != KTF_OK) {
            fprintf(stderr, "%s\n", ktf_last_error());
            failed = 1;
        }
    return argc > 1 ? failed : 2;
}
