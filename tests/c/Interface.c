/* A program that uses every function of ktfiles.h, as C99 and as C++: interface MEDIA_FOLDER [decoders] [nowait]. It
 * makes its files in a folder of its own. Valgrind wants "nowait": it stops all threads when one waits for a lock. Says
 * which check failed, and exits with 1. */
#define _POSIX_C_SOURCE 200809L
#include <ktfiles.h>

#include <pthread.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

#define EXPECT(isTrue) expect((isTrue) != 0, #isTrue, __LINE__)
#define EXPECT_STATUS(call, status) expectStatus(call, status, #call, __LINE__)
#define EXPECT_OK(call) EXPECT_STATUS(call, KTF_OK)

enum { kFrames = 3000, kHeader = 44 };

static char folder[] = "/tmp/ktfiles-c-XXXXXX";
static char paths[16][4096];
static int pathCount;
static int mayWait = 1;

static void removeFiles(void)
{
    while (pathCount > 0)
        remove(paths[--pathCount]);
    rmdir(folder);
}

static void expect(int isTrue, const char* what, int line)
{
    if (isTrue)
        return;
    fprintf(stderr, "line %d: %s; last error: %s\n", line, what, ktf_last_error());
    removeFiles();
    exit(1);
}

static void expectStatus(ktf_status status, ktf_status wanted, const char* what, int line)
{
    if (status != wanted)
        fprintf(stderr, "%d (%s), not %d\n", (int)status, ktf_status_text(status), (int)wanted);
    expect(status == wanted, what, line);
    if (status != KTF_OK) /* every failure is told of */
        expect(ktf_last_error()[0] != '\0', what, line);
}

/* A path in the test's folder, which is removed in the end. */
static const char* pathOf(const char* name)
{
    snprintf(paths[pathCount], sizeof paths[0], "%s/%s", folder, name);
    return paths[pathCount++];
}

static unsigned char* put(unsigned char* at, uint32_t number, int bytes)
{
    for (; bytes > 0; --bytes, number >>= 8)
        *at++ = (unsigned char)number;
    return at;
}

/* Left rises from the lowest value by 20, right is its half, negated. */
static int left(int frame)
{
    return -30000 + 20 * frame;
}

static int right(int frame)
{
    return -left(frame) / 2;
}

/* A WAVE file of 16-bit stereo at 8 kHz, and a chunk "note" of 5 bytes behind the samples; `bytes` of it are written.
 */
static const char* makeWave(const char* name, size_t bytes)
{
    static unsigned char wave[kHeader + 4 * kFrames + 8 + 6];
    const char* const path = pathOf(name);
    unsigned char* at = wave;
    FILE* file = NULL;
    int frame = 0;
    memcpy(at, "RIFF", 4);
    at = put(at + 4, sizeof wave - 8, 4);
    memcpy(at, "WAVEfmt ", 8);
    at = put(put(put(put(at + 8, 16, 4), 1, 2), 2, 2), 8000, 4);
    at = put(put(put(at, 32000, 4), 4, 2), 16, 2);
    memcpy(at, "data", 4);
    at = put(at + 4, 4 * kFrames, 4);
    for (; frame < kFrames; ++frame)
        at = put(put(at, (uint32_t)left(frame), 2), (uint32_t)right(frame), 2);
    memcpy(at, "note", 4);
    memcpy(put(at + 4, 5, 4), "hello", 6);
    file = fopen(path, "wb");
    bytes = bytes < sizeof wave ? bytes : sizeof wave;
    EXPECT(file != NULL && fwrite(wave, 1, bytes, file) == bytes);
    EXPECT(fclose(file) == 0);
    return path;
}

/* A copy of one of the files to try things on. */
static const char* copyOf(const char* media, const char* name)
{
    static char bytes[1 << 20];
    const char* const copy = pathOf(name);
    char path[4096];
    FILE* file = NULL;
    size_t size = 0;
    snprintf(path, sizeof path, "%s/%s", media, name);
    file = fopen(path, "rb");
    EXPECT(file != NULL);
    size = fread(bytes, 1, sizeof bytes, file);
    fclose(file);
    file = fopen(copy, "wb");
    EXPECT(file != NULL && size > 0 && size < sizeof bytes && fwrite(bytes, 1, size, file) == size);
    EXPECT(fclose(file) == 0);
    return copy;
}

static long sizeOf(const char* path)
{
    struct stat status;
    return stat(path, &status) == 0 ? (long)status.st_size : -1;
}

static void checkStatusTexts(void)
{
    char text[KTF_CODE_TEXT_SIZE];
    EXPECT(ktf_version() == KTF_VERSION);
    EXPECT(strcmp(ktf_status_text(KTF_DISK_FULL), "disk full") == 0);
    EXPECT(strcmp(ktf_status_text(KTF_WOULD_LOSE), "data would be lost") == 0);
    EXPECT(strlen(ktf_status_text(123456)) > 0);
    EXPECT(ktf_code_text(KTF_CODE('b', 'e', 'x', 't'), text) == text && strcmp(text, "bext") == 0);
    EXPECT(strcmp(ktf_code_text(0xFFFFFFFFu, text), "\\xFF\\xFF\\xFF\\xFF") == 0);
    EXPECT(ktf_code_text(0, NULL) == NULL);
    ktf_free(NULL);
    ktf_free(malloc(1));
}

static void checkInfo(const char* media, const char* wave)
{
    char path[4096];
    struct {
        ktf_info info;
        uint64_t later[4];
    } longer;
    ktf_info info;
    ktf_file* file = NULL;
    EXPECT_OK(ktf_open(wave, 0, &file));
    EXPECT_OK(ktf_get_info(file, &info, sizeof info));
    EXPECT(info.frames == kFrames && info.sample_rate == 8000 && info.channels == 2 && info.bits_per_sample == 16);
    EXPECT(info.container == KTF_CODE('R', 'I', 'F', 'F') && info.form == KTF_CODE('W', 'A', 'V', 'E'));
    EXPECT(info.coding == KTF_CODE('l', 'p', 'c', 'm') && info.data_size == 4 * kFrames && info.missing_data_size == 0);
    EXPECT(info.flags == (KTF_INFO_LINEAR_PCM | KTF_INFO_HAS_CHUNKS | KTF_INFO_TAKES_CHUNKS));
    EXPECT(info.file_size == sizeOf(wave));
    /* A caller of a later header: what this library does not know is 0. */
    memset(&longer, 0xAA, sizeof longer);
    EXPECT_OK(ktf_get_info(file, (ktf_info*)&longer, sizeof longer));
    EXPECT(longer.info.frames == kFrames && longer.later[0] == 0 && longer.later[3] == 0);
    EXPECT_STATUS(ktf_get_info(file, &info, 87), KTF_PARAMETER_ERROR);
    ktf_close(&file);

    snprintf(path, sizeof path, "%s/tone-float.wav", media);
    EXPECT_OK(ktf_open(path, 0, &file));
    EXPECT_OK(ktf_get_info(file, &info, sizeof info));
    EXPECT((info.flags & (KTF_INFO_FLOAT | KTF_INFO_BIG_ENDIAN)) == KTF_INFO_FLOAT && info.bits_per_sample == 32);
    ktf_close(&file);
    snprintf(path, sizeof path, "%s/bassline.aiff", media);
    EXPECT_OK(ktf_open(path, 0, &file));
    EXPECT_OK(ktf_get_info(file, &info, sizeof info));
    EXPECT((info.flags & KTF_INFO_LOOP) && (info.flags & KTF_INFO_BIG_ENDIAN) && info.beats > 0 && info.tempo > 20);
    ktf_close(&file);
}

static void checkSamples(const char* wave, int hasDecoders)
{
    static int16_t shorts[2 * kFrames];
    static int32_t longs[4 * kFrames];
    static float floats[2 * kFrames];
    int64_t count = 0;
    size_t read = 0;
    int frame = 0;
    ktf_file* file = NULL;
    EXPECT_OK(ktf_open(wave, 0, &file));
    EXPECT_OK(ktf_read(file, floats, kFrames, &read)); /* the format that nobody set */
    EXPECT(read == kFrames);
    for (frame = 0; frame < kFrames; ++frame)
        EXPECT(floats[2 * frame] == (float)left(frame) / 32768 && floats[2 * frame + 1] == (float)right(frame) / 32768);
    EXPECT_OK(ktf_read(file, floats, 1, &read));
    EXPECT(read == 0);

    EXPECT_OK(ktf_set_format(file, KTF_INT16, 0, 0));
    EXPECT_OK(ktf_seek(file, 1000));
    EXPECT_OK(ktf_read(file, shorts, kFrames, &read));
    EXPECT(read == kFrames - 1000);
    for (frame = 1000; frame < kFrames; ++frame)
        EXPECT(shorts[2 * (frame - 1000)] == left(frame) && shorts[2 * (frame - 1000) + 1] == right(frame));
    EXPECT_STATUS(ktf_seek(file, -1), KTF_BEFORE_START);
    EXPECT_OK(ktf_seek(file, (int64_t)1 << 40));
    EXPECT_OK(ktf_read(file, shorts, 1, &read));
    EXPECT(read == 0);

    EXPECT_OK(ktf_set_format(file, KTF_INT32, 8000, 4));
    EXPECT_OK(ktf_read(file, longs, 10, &read));
    EXPECT(read == 10 && longs[0] == left(0) * 65536 && longs[1] == right(0) * 65536 && longs[2] == 0 && longs[3] == 0);
    EXPECT_OK(ktf_set_format(file, KTF_INT16, 0, 1));
    EXPECT_OK(ktf_read(file, shorts, 1, &read));
    EXPECT(read == 1 && shorts[0] == (left(0) + right(0)) / 2);

    /* What fails leaves the format as it was. */
    EXPECT_STATUS(ktf_set_format(file, 0, 0, 0), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_format(file, KTF_INT16, 900000, 0), KTF_NOT_SUPPORTED);
    EXPECT_OK(ktf_read(file, shorts, 1, &read));
    EXPECT(read == 1 && shorts[0] == (left(1) + right(1)) / 2);
    EXPECT_OK(ktf_frame_count(file, &count));
    EXPECT(count == kFrames);
    if (hasDecoders) {
        EXPECT_OK(ktf_set_format(file, KTF_FLOAT32, 16000, 0));
        EXPECT_OK(ktf_frame_count(file, &count));
        EXPECT(count == 2 * kFrames);
        EXPECT_OK(ktf_seek(file, 2000));
        EXPECT_OK(ktf_read(file, floats, 1, &read));
        EXPECT(read == 1 && floats[0] > (float)left(1000) / 32768 - 0.001f &&
               floats[0] < (float)left(1000) / 32768 + 0.001f);
    }
    ktf_close(&file);
}

static void checkOverview(const char* wave)
{
    enum { kPoints = 7 };
    float values[4 * kPoints + 1];
    static float many[4 * 2 * kFrames];
    size_t read = 0;
    float sample[2];
    int point = 0;
    ktf_file* file = NULL;
    EXPECT_OK(ktf_open(wave, 0, &file));
    EXPECT_OK(ktf_seek(file, 5));
    EXPECT_OK(ktf_read(file, sample, 1, &read));
    values[4 * kPoints] = 42;
    EXPECT_OK(ktf_overview(file, 0, kFrames, kPoints, values, 4 * kPoints));
    EXPECT(values[4 * kPoints] == 42);
    for (; point < kPoints; ++point) {
        const int first = point * kFrames / kPoints, last = (point + 1) * kFrames / kPoints - 1;
        const float* const at = values + 4 * point;
        EXPECT(at[0] == (float)(left(first) < 0 ? left(first) : 0) / 32768);
        EXPECT(at[1] == (float)(left(last) > 0 ? left(last) : 0) / 32768);
        EXPECT(at[2] == (float)(right(last) < 0 ? right(last) : 0) / 32768);
        EXPECT(at[3] == (float)(right(first) > 0 ? right(first) : 0) / 32768);
    }
    EXPECT_OK(ktf_read(file, sample, 1, &read)); /* the place stays */
    EXPECT(sample[0] == (float)left(6) / 32768);

    EXPECT_OK(ktf_overview(file, 0, kFrames, 2 * kFrames, many, sizeof many / sizeof many[0])); /* more than frames */
    EXPECT(many[0] == many[4] && many[8] == (float)left(1) / 32768);
    EXPECT_OK(ktf_overview(file, kFrames, 10, 2, values, 8)); /* none there */
    EXPECT(values[0] == 0 && values[7] == 0);
    EXPECT_STATUS(ktf_overview(file, 0, kFrames, kPoints, values, 4 * kPoints - 1), KTF_NO_ROOM);
    EXPECT_STATUS(ktf_overview(file, 0, kFrames, 0, values, 4), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_overview(file, 0, kFrames, 0xFFFFFFFFu, values, 4), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_overview(file, -1, kFrames, 1, values, 4), KTF_PARAMETER_ERROR);
    ktf_close(&file);
}

typedef struct Seen {
    char ids[64];
    int most;
} Seen;

static int seeChunk(void* context, const ktf_chunk* chunk)
{
    Seen* const seen = (Seen*)context;
    char text[KTF_CODE_TEXT_SIZE];
    strncat(seen->ids, ktf_code_text(chunk->id, text), sizeof seen->ids - strlen(seen->ids) - 1);
    return --seen->most == 0;
}

#ifdef __cplusplus
static int throwOut(void*, const ktf_chunk*)
{
    throw "out of the callback";
}
#endif

static void checkChunks(const char* wave)
{
    const uint32_t note = KTF_CODE('n', 'o', 't', 'e');
    Seen seen = {"", 0};
    char body[16] = "";
    size_t read = 0;
    ktf_chunk chunk;
    ktf_file* file = NULL;
    EXPECT_OK(ktf_open(wave, 0, &file));
    EXPECT_OK(ktf_each_chunk(file, seeChunk, &seen));
    EXPECT(strcmp(seen.ids, "fmt datanote") == 0);
    seen.ids[0] = '\0';
    seen.most = 2;
    EXPECT_OK(ktf_each_chunk(file, seeChunk, &seen));
    EXPECT(strcmp(seen.ids, "fmt data") == 0);
#ifdef __cplusplus
    EXPECT_STATUS(ktf_each_chunk(file, throwOut, NULL), KTF_FAILED);
#endif
    EXPECT_OK(ktf_find_chunk(file, note, &chunk, sizeof chunk));
    EXPECT(chunk.id == note && chunk.size == 5 && chunk.body == chunk.offset + 8);
    EXPECT(chunk.offset == kHeader + 4 * kFrames);
    EXPECT_OK(ktf_read_chunk(file, &chunk, 0, body, sizeof body, &read));
    EXPECT(read == 5 && memcmp(body, "hello", 6) == 0);
    EXPECT_OK(ktf_read_chunk(file, &chunk, 3, body, 1, &read));
    EXPECT(read == 1 && body[0] == 'l');
    EXPECT_OK(ktf_read_chunk(file, &chunk, 5, body, 1, &read));
    EXPECT(read == 0);
    EXPECT_STATUS(ktf_read_chunk(file, &chunk, -1, body, 1, &read), KTF_PARAMETER_ERROR);
    chunk.size = INT64_MAX; /* what a damaged file, or a careless caller, may say */
    EXPECT_STATUS(ktf_read_chunk(file, &chunk, 0, body, 1, &read), KTF_PARAMETER_ERROR);
    chunk.size = 1000;
    EXPECT_STATUS(ktf_read_chunk(file, &chunk, 0, body, sizeof body, &read), KTF_END_OF_FILE);
    EXPECT(read == 6);
    EXPECT_STATUS(ktf_find_chunk(file, KTF_CODE('n', 'o', 'n', 'e'), &chunk, sizeof chunk), KTF_NOT_THERE);
    EXPECT(strstr(ktf_last_error(), wave) != NULL && strstr(ktf_last_error(), "\"none\"") != NULL);
    EXPECT_STATUS(ktf_find_chunk(file, note, &chunk, 31), KTF_PARAMETER_ERROR);
    ktf_close(&file);
}

static void expectChunks(const char* path, const char* ids)
{
    Seen seen = {"", 0};
    ktf_file* file = NULL;
    EXPECT_OK(ktf_open(path, 0, &file));
    EXPECT_OK(ktf_each_chunk(file, seeChunk, &seen));
    EXPECT(strcmp(seen.ids, ids) == 0);
    ktf_close(&file);
}

static void checkEdits(void)
{
    const uint32_t note = KTF_CODE('n', 'o', 't', 'e');
    const char* const path = makeWave("edited.wav", (size_t)-1);
    const char* const backup = pathOf("edited.wav.bak");
    const long size = sizeOf(path);
    ktf_edit_options options = KTF_EDIT_OPTIONS;
    ktf_edit_options small = KTF_EDIT_OPTIONS;
    ktf_access* access = NULL;
    EXPECT_OK(ktf_add_chunk(path, note, "again", 5, NULL));
    expectChunks(path, "fmt datanotenote");
    options.flags = KTF_EDIT_REPLACE | KTF_EDIT_BACKUP;
    EXPECT_OK(ktf_add_chunk(path, note, NULL, 0, &options));
    expectChunks(path, "fmt datanote");
    EXPECT(sizeOf(path) == size - 6 && sizeOf(backup) == size + 14);
    EXPECT_OK(ktf_remove_chunk(path, note, NULL));
    expectChunks(path, "fmt data");
    EXPECT_STATUS(ktf_remove_chunk(path, note, NULL), KTF_NOT_THERE);
    EXPECT_STATUS(ktf_remove_chunk(path, KTF_CODE('d', 'a', 't', 'a'), NULL), KTF_WOULD_LOSE);
    EXPECT_STATUS(ktf_add_chunk(path, KTF_CODE('f', 'm', 't', ' '), "", 0, NULL), KTF_WOULD_LOSE);
    EXPECT_STATUS(ktf_add_chunk(path, 0, "", 0, NULL), KTF_PARAMETER_ERROR);
    small.size = 8;
    EXPECT_STATUS(ktf_add_chunk(path, note, "", 0, &small), KTF_PARAMETER_ERROR);
    small = options;
    small.flags = 1u << 31;
    EXPECT_STATUS(ktf_add_chunk(path, note, "", 0, &small), KTF_PARAMETER_ERROR);
    expectChunks(path, "fmt data");

    /* Who holds the file says so, or waits for himself. */
    EXPECT_OK(ktf_lock(path, KTF_LOCK_WRITE, 0, &access));
    options.flags = KTF_EDIT_IN_PLACE | KTF_EDIT_KEEP_TIMES;
    options.timeout = 0.02;
    if (mayWait)
        EXPECT_STATUS(ktf_add_chunk(path, note, "held", 4, &options), KTF_BUSY);
    options.flags |= KTF_EDIT_LOCKED;
    EXPECT_OK(ktf_add_chunk(path, note, "held", 4, &options));
    ktf_unlock(&access);
    options.flags = KTF_EDIT_FORCE;
    options.timeout = -1;
    EXPECT_OK(ktf_remove_chunk(path, KTF_CODE('d', 'a', 't', 'a'), &options));
}

static void checkLocks(const char* path)
{
    ktf_access *first = NULL, *second = NULL;
    EXPECT_OK(ktf_lock(path, KTF_LOCK_READ, 0, &first));
    EXPECT_OK(ktf_lock(path, KTF_LOCK_READ, 10, &second));
    ktf_unlock(&second);
    EXPECT(second == NULL);
    EXPECT_STATUS(ktf_lock(path, KTF_LOCK_WRITE, 0, &second), KTF_BUSY);
    EXPECT_STATUS(ktf_lock(path, KTF_LOCK_WRITE, mayWait ? 0.02 : 0, &second), KTF_BUSY);
    EXPECT(second == NULL && strstr(ktf_last_error(), path) != NULL);
    ktf_unlock(&first);
    EXPECT_OK(ktf_lock(path, KTF_LOCK_WRITE, -1, &first));
    EXPECT_STATUS(ktf_lock(path, KTF_LOCK_READ, 0, &second), KTF_BUSY);
    ktf_unlock(&first);
    ktf_unlock(&first);
    EXPECT_STATUS(ktf_lock(path, 2, 0, &first), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_lock(NULL, KTF_LOCK_READ, 0, &first), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_lock("", KTF_LOCK_READ, 0, &first), KTF_FILE_NOT_FOUND);
    EXPECT_STATUS(ktf_lock(path, KTF_LOCK_READ, 0, NULL), KTF_PARAMETER_ERROR);
    ktf_unlock(NULL);
}

typedef struct Texts {
    char all[4096]; /* "name=value;" */
    int most;
} Texts;

static int seeText(void* context, const char* name, const char* value)
{
    Texts* const texts = (Texts*)context;
    const size_t length = strlen(texts->all);
    snprintf(texts->all + length, sizeof texts->all - length, "%s=%.64s;", name, value);
    return --texts->most == 0;
}

static void checkTags(const char* media, const char* wave)
{
    const ktf_text_pair pairs[] = {{"beatCount", "3"},     {"midiRootNote", "F#"},   {"title", "A test"},
                                   {"descriptors", "Dry"}, {"descriptors", "Clean"}, {"descriptors", "Dry"},
                                   {"genre", NULL}};
    const ktf_text_pair unknown = {"beats", "4"}, impossible = {"beatCount", "many"}, nameless = {NULL, "4"};
    const ktf_text_pair twice[] = {{"title", "A"}, {"title", "B"}};
    const char* const loop = copyOf(media, "bassline.aiff");
    Texts texts = {"", 0};
    ktf_chunk chunk;
    ktf_file* file = NULL;
    char title[7] = "";
    size_t read = 0;
    EXPECT_OK(ktf_set_tags(loop, pairs, sizeof pairs / sizeof pairs[0], NULL));
    EXPECT_OK(ktf_each_tag(loop, seeText, &texts));
    EXPECT(strstr(texts.all, ";beatCount=3;") && strstr(texts.all, ";key=F#;") && strstr(texts.all, ";title=A test;"));
    EXPECT(strstr(texts.all, ";descriptors=Clean;descriptors=Dry;") && strstr(texts.all, "genre") == NULL);
    EXPECT_OK(ktf_open(loop, 0, &file));
    EXPECT_OK(ktf_find_chunk(file, KTF_CODE('N', 'A', 'M', 'E'), &chunk, sizeof chunk));
    EXPECT_OK(ktf_read_chunk(file, &chunk, 0, title, 6, &read));
    EXPECT(chunk.size == 6 && strcmp(title, "A test") == 0);
    ktf_close(&file);
    texts.all[0] = '\0';
    texts.most = 1;
    EXPECT_OK(ktf_each_tag(loop, seeText, &texts));
    EXPECT(strcmp(texts.all, "fileType=AIFF;") == 0);

    EXPECT_STATUS(ktf_set_tags(loop, &unknown, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(loop, &impossible, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(loop, &nameless, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(loop, twice, 2, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(loop, NULL, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(NULL, pairs, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_tags(wave, pairs, 1, NULL), KTF_NOT_SUPPORTED);
    EXPECT_OK(ktf_remove_tags(loop, NULL));
    texts.all[0] = '\0';
    EXPECT_OK(ktf_each_tag(loop, seeText, &texts));
    EXPECT(strstr(texts.all, "beatCount") == NULL && strstr(texts.all, "title") == NULL);
    EXPECT_STATUS(ktf_remove_tags(NULL, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_tag(loop, NULL, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_tag(NULL, seeText, &texts), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_tag("nowhere.wav", seeText, &texts), KTF_FILE_NOT_FOUND);
}

static void checkFields(const char* media, const char* notAudio)
{
    char path[4096];
    Texts texts = {"", 0};
    snprintf(path, sizeof path, "%s/kick-24-rf64.wav", media);
    EXPECT_OK(ktf_each_field(path, seeText, &texts));
    EXPECT(strstr(texts.all, "bext.description=Kick and click;") != NULL);
    EXPECT_STATUS(ktf_each_field(notAudio, seeText, &texts), KTF_NOT_SUPPORTED);
    EXPECT_STATUS(ktf_each_field("nowhere.wav", seeText, &texts), KTF_FILE_NOT_FOUND);
    EXPECT_STATUS(ktf_each_field(NULL, seeText, &texts), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_field(path, NULL, NULL), KTF_PARAMETER_ERROR);
}

static void checkDocuments(const char* media, const char* wave)
{
    char path[4096];
    char* text = NULL;
    size_t size = 1;
    snprintf(path, sizeof path, "%s/harbour-bw64.wav", media);
    EXPECT_OK(ktf_adm_json(path, &text, &size));
    EXPECT(text[0] == '{' && strlen(text) == size && strstr(text, "\"programmes\":") != NULL);
    ktf_free(text);
    EXPECT_STATUS(ktf_adm_json(wave, &text, &size), KTF_NOT_THERE);
    EXPECT(text == NULL && size == 0);
    snprintf(path, sizeof path, "%s/harbour.xml", media);
    EXPECT_OK(ktf_adm_json(path, &text, NULL));
    ktf_free(text);
    EXPECT_STATUS(ktf_adm_json("nowhere.xml", &text, NULL), KTF_FILE_NOT_FOUND);
    EXPECT_STATUS(ktf_adm_json(NULL, &text, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_adm_json(path, NULL, NULL), KTF_PARAMETER_ERROR);
}

static void checkNulls(const char* wave)
{
    ktf_file* file = NULL;
    ktf_info info;
    ktf_chunk chunk;
    int64_t count = 1;
    size_t read = 1;
    float sample[2];
    EXPECT_STATUS(ktf_open(NULL, 0, &file), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_open(wave, 0, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_open(wave, 0x80, &file), KTF_PARAMETER_ERROR);
    EXPECT(file == NULL);
    EXPECT_STATUS(ktf_add_chunk(NULL, 1, "", 0, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_add_chunk(wave, 1, NULL, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_remove_chunk(NULL, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_OK(ktf_open(wave, 0, &file));
    EXPECT_STATUS(ktf_get_info(file, NULL, sizeof info), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_chunk(file, NULL, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_find_chunk(file, 1, NULL, sizeof chunk), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_read_chunk(file, NULL, 0, sample, 1, &read), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_frame_count(file, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_read(file, NULL, 1, &read), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_read(file, sample, 1, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_overview(file, 0, 1, 1, NULL, 4), KTF_PARAMETER_ERROR);
    ktf_close(&file);
    EXPECT(file == NULL); /* so that what is closed is null */
    ktf_close(&file);
    ktf_close(NULL);
    EXPECT_STATUS(ktf_get_info(file, &info, sizeof info), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_each_chunk(file, seeChunk, NULL), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_find_chunk(file, 1, &chunk, sizeof chunk), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_read_chunk(file, &chunk, 0, sample, 1, &read), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_set_format(file, KTF_INT16, 0, 0), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_frame_count(file, &count), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_seek(file, 0), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_read(file, sample, 1, &read), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_overview(file, 0, 1, 1, sample, 2), KTF_PARAMETER_ERROR);
    EXPECT(count == 0 && read == 0);
}

static void checkDamaged(void)
{
    static int16_t samples[2 * kFrames];
    const char* const missing = pathOf("missing.wav");
    const char* const cut = makeWave("cut.wav", kHeader + 4001);
    const char* const whole = makeWave("tail.wav", (size_t)-1);
    const char* const headless = makeWave("headless.wav", 30);
    const char* const text = makeWave("text.txt", 0);
    FILE* tail = NULL;
    long size = 0;
    size_t read = 0;
    ktf_info info;
    ktf_file* file = NULL;
    EXPECT_STATUS(ktf_open(missing, 0, &file), KTF_FILE_NOT_FOUND);
    EXPECT(strstr(ktf_last_error(), missing) == ktf_last_error() && file == NULL);
    EXPECT_STATUS(ktf_add_chunk(missing, 1, "", 0, NULL), KTF_FILE_NOT_FOUND);
    EXPECT_STATUS(ktf_open(folder, 0, &file), KTF_PARAMETER_ERROR);
    EXPECT_STATUS(ktf_open("/dev/null", 0, &file), KTF_NOT_A_FILE);
    EXPECT_STATUS(ktf_open("", 0, &file), KTF_FILE_NOT_FOUND);

    EXPECT_OK(ktf_open(cut, 0, &file));
    EXPECT_OK(ktf_get_info(file, &info, sizeof info));
    EXPECT((info.flags & KTF_INFO_INCOMPLETE) && info.frames == 1000 && info.missing_data_size > 0);
    EXPECT_OK(ktf_set_format(file, KTF_INT16, 0, 0));
    EXPECT_OK(ktf_read(file, samples, kFrames, &read));
    EXPECT(read == 1000 && samples[1998] == left(999));
    ktf_close(&file);
    tail = fopen(whole, "ab"); /* a recording that nobody finished */
    EXPECT(tail != NULL && fwrite(samples, 1, 100, tail) == 100 && fclose(tail) == 0);
    size = sizeOf(whole);
    EXPECT_STATUS(ktf_add_chunk(whole, KTF_CODE('n', 'o', 't', 'e'), "", 0, NULL), KTF_WOULD_LOSE);
    EXPECT(sizeOf(whole) == size);

    EXPECT_STATUS(ktf_open(headless, 0, &file), KTF_NOT_SUPPORTED);
    EXPECT_OK(ktf_open(headless, KTF_OPEN_CONTAINER, &file));
    EXPECT_OK(ktf_get_info(file, &info, sizeof info));
    EXPECT(info.frames == 0 && (info.flags & KTF_INFO_HAS_CHUNKS));
    EXPECT(ktf_read(file, samples, 1, &read) != KTF_OK && read == 0);
    ktf_close(&file);
    EXPECT_STATUS(ktf_open(text, KTF_OPEN_CONTAINER, &file), KTF_NOT_SUPPORTED);
    EXPECT_STATUS(ktf_remove_chunk(text, 1, NULL), KTF_NOT_SUPPORTED);
}

static void* lookAtError(void* wasEmpty)
{
    *(int*)wasEmpty = ktf_last_error()[0] == '\0';
    ktf_seek(NULL, 0);
    return NULL;
}

static void checkThreads(void)
{
    pthread_t thread;
    int wasEmpty = 0;
    ktf_file* file = NULL;
    EXPECT_STATUS(ktf_open("nowhere.wav", 0, &file), KTF_FILE_NOT_FOUND);
    EXPECT(pthread_create(&thread, NULL, lookAtError, &wasEmpty) == 0 && pthread_join(thread, NULL) == 0);
    EXPECT(wasEmpty);
    EXPECT(strcmp(ktf_last_error(), "nowhere.wav: file not found") == 0);
}

int main(int argc, char** argv)
{
    const char* wave = NULL;
    mayWait = strcmp(argv[argc - 1], "nowait") != 0;
    EXPECT(argc >= 2 && ktf_last_error()[0] == '\0' && mkdtemp(folder) != NULL);
    wave = makeWave("ramp.wav", (size_t)-1);
    checkStatusTexts();
    checkInfo(argv[1], wave);
    checkSamples(wave, argc > 2 && strcmp(argv[2], "decoders") == 0);
    checkOverview(wave);
    checkChunks(wave);
    checkEdits();
    checkLocks(wave);
    checkTags(argv[1], wave);
    checkFields(argv[1], makeWave("empty.txt", 0));
    checkDocuments(argv[1], wave);
    checkNulls(wave);
    checkDamaged();
    checkThreads();
    removeFiles();
    return 0;
}
