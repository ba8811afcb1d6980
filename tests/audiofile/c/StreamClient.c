/* A C program that reads an audio file through the stream interface: StreamClient AUDIO_FILE OTHER_FILE. The second is
 * a file that is no audio. Exits with the number of the check that failed. */
#include "audiofile/XStream.h"

#include <stddef.h>
#include <stdio.h>
#include <stdlib.h>

/* The layouts that C callers are compiled with. */
typedef char DescriptionHas40Bytes[sizeof(XStreamDescription) == 40 ? 1 : -1];
typedef char LayoutHas32Bytes[sizeof(XStreamChannelLayout) == 32 ? 1 : -1];
typedef char RequestHas64Bytes[sizeof(XStreamReadRequest) == 64 ? 1 : -1];
typedef char BufferIsAt56[offsetof(XStreamReadRequest, buffer) == 56 ? 1 : -1];

static int check;

static void expect(int isTrue)
{
    ++check;
    if (!isTrue) {
        fprintf(stderr, "check %d failed\n", check);
        exit(check);
    }
}

static void count(void* calls)
{
    ++*(int*)calls;
}

int main(int argc, char** argv)
{
    enum { block = 512 };
    static float samples[2 * block], again[2 * block];
    XStreamDescription file, client;
    XStreamRef stream = NULL;
    XStreamReadRequest request = {0};
    uint32_t size = sizeof file, read = 0, bytes = 0;
    int calls = 0;
    float peak = 0;

    expect(argc == 3);
    expect(XStreamOpen(argv[1], 0, 0, 0, NULL, NULL, &stream) == 0);
    expect(XStreamGetProperty(stream, 0x66666D74, &size, &file) == 0); /* "ffmt" */
    expect(file.formatId == 0x6C70636D && file.channelsPerFrame <= 2); /* "lpcm" */
    client = file;
    client.formatFlags = 9;
    client.bitsPerChannel = 32;
    client.channelsPerFrame = 2;
    client.bytesPerFrame = client.bytesPerPacket = 8;
    expect(XStreamSetProperty(stream, 0x63666D74, sizeof client, &client) == 0); /* "cfmt" */
    expect(XStreamReadFramesSync(stream, 100, block, &read, samples, &bytes) == 0);
    expect(read == block && bytes == sizeof samples);
    for (read = 0; read < 2 * block; ++read)
        peak = samples[read] > peak ? samples[read] : peak;
    expect(peak > 0.01f && peak < 1.0f);

    request.position = 101;
    request.framesRequested = block;
    request.completion = count;
    request.userPointer = &calls;
    request.completionState = &calls;
    request.buffer = again;
    expect(XStreamReadFrames(stream, &request) == 0);
    expect(calls == 1 && request.completionState == NULL && request.framesRead == block);
    for (read = 0; read < 2 * (block - 1); ++read)
        expect(again[read] == samples[read + 2]);
    expect(XStreamWriteFrames(stream, &request) == -4);
    expect(XStreamClose(stream) == 0);

    expect(XStreamOpen(argv[2], 0, 0, 0, NULL, NULL, &stream) != 0 && stream == NULL);
    expect(XStreamOpenWithFileRef(NULL, 0, 0, 0, NULL, NULL, &stream) == -50);
    return 0;
}
