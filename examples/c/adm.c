/* Prints the ADM document of an audio file, or of an XML file, as JSON. Usage: adm FILE */
#include <ktfiles.h>

#include <stdio.h>

int main(int argc, char** argv)
{
    char* text = NULL;
    size_t size = 0;
    ktf_status status;
    if (argc != 2)
        return 2;
    status = ktf_adm_json(argv[1], &text, &size);
    if (status == KTF_OK) {
        fwrite(text, 1, size, stdout);
        putchar('\n');
    } else {
        fprintf(stderr, "%s\n", ktf_last_error());
    }
    ktf_free(text);
    return status == KTF_OK ? 0 : 1;
}
