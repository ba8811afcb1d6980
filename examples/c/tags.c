/* Shows the tags of a loop, or sets some. Usage: tags FILE [NAME VALUE]... */
#include <ktfiles.h>

#include <stdio.h>

enum { kMost = 32 };

static int print_text(void* context, const char* name, const char* value)
{
    (void)context;
    printf("%s: %s\n", name, value);
    return 0; /* go on */
}

int main(int argc, char** argv)
{
    ktf_text_pair pairs[kMost];
    ktf_edit_options options = KTF_EDIT_OPTIONS;
    ktf_status status;
    size_t count = 0;
    int i;
    if (argc < 2 || argc % 2 != 0 || argc > 2 + 2 * kMost)
        return 2;
    for (i = 2; i < argc; i += 2) {
        pairs[count].name = argv[i];
        pairs[count++].value = argv[i + 1][0] != '\0' ? argv[i + 1] : NULL; /* null takes the tag away */
    }
    options.timeout = 10; /* seconds, where other programs have the file */
    status = count > 0 ? ktf_set_tags(argv[1], pairs, count, &options) : ktf_each_tag(argv[1], print_text, NULL);
    if (status != KTF_OK)
        fprintf(stderr, "%s\n", ktf_last_error());
    return status == KTF_OK ? 0 : 1;
}
