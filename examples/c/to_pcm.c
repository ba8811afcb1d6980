/* Writes the samples of any audio file as raw PCM: 16 bits, interleaved, in the byte order of this machine.
 * Usage: to_pcm FILE OUT [RATE [CHANNELS]] */
#include <ktfiles.h>

#include <stdio.h>
#include <stdlib.h>

enum { kFrames = 4096, kMostChannels = 64 };

static int copy_samples(ktf_file* file, uint32_t channels, FILE* out)
{
    static int16_t samples[kFrames * kMostChannels];
    size_t frames = 0;
    for (;;) {
        if (ktf_read(file, samples, kFrames, &frames) != KTF_OK)
            return 0;
        if (frames == 0)
            return 1; /* the end */
        if (fwrite(samples, channels * sizeof samples[0], frames, out) != frames) {
            perror("writing");
            exit(1);
        }
    }
}

int main(int argc, char** argv)
{
    ktf_file* file = NULL;
    ktf_info info;
    uint32_t rate, channels;
    FILE* out;
    int done = 0;
    if (argc < 3)
        return 2;
    rate = argc > 3 ? (uint32_t)strtoul(argv[3], NULL, 10) : 0; /* 0: that of the file */
    channels = argc > 4 ? (uint32_t)strtoul(argv[4], NULL, 10) : 0;
    if (ktf_open(argv[1], 0, &file) != KTF_OK || ktf_get_info(file, &info, sizeof info) != KTF_OK ||
        ktf_set_format(file, KTF_INT16, rate, channels) != KTF_OK) {
        fprintf(stderr, "%s\n", ktf_last_error());
        ktf_close(&file);
        return 1;
    }
    if (channels == 0)
        channels = info.channels;
    out = channels <= kMostChannels ? fopen(argv[2], "wb") : NULL;
    if (out != NULL) {
        done = copy_samples(file, channels, out);
        if (!done)
            fprintf(stderr, "%s\n", ktf_last_error());
        done = fclose(out) == 0 && done;
    }
    ktf_close(&file);
    return done ? 0 : 1;
}
