/* Draws the peaks of a file's first channel as columns of text. Usage: overview FILE */
#include <ktfiles.h>

#include <stdio.h>
#include <stdlib.h>

enum { kColumns = 60, kRows = 8 };

static void draw(const float* values, uint32_t channels)
{
    int row, column;
    for (row = kRows; row > 0; --row) {
        for (column = 0; column < kColumns; ++column) {
            const float* const point = values + (size_t)column * channels * 2; /* lowest and highest of each channel */
            const float peak = point[1] > -point[0] ? point[1] : -point[0];
            putchar(peak * kRows >= (float)row - 0.5F ? '#' : ' ');
        }
        putchar('\n');
    }
}

int main(int argc, char** argv)
{
    ktf_file* file = NULL;
    ktf_info info;
    float* values = NULL;
    ktf_status status;
    if (argc != 2)
        return 2;
    status = ktf_open(argv[1], 0, &file);
    if (status == KTF_OK)
        status = ktf_get_info(file, &info, sizeof info);
    if (status == KTF_OK) {
        const size_t room = (size_t)2 * kColumns * info.channels;
        values = malloc(room * sizeof *values);
        if (values == NULL)
            status = KTF_OUT_OF_MEMORY;
        else
            status = ktf_overview(file, 0, info.frames, kColumns, values, room);
    }
    if (status == KTF_OK)
        draw(values, info.channels);
    else
        fprintf(stderr, "%s: %s\n", argv[1], ktf_status_text(status));
    free(values);
    ktf_close(&file);
    return status == KTF_OK ? 0 : 1;
}
