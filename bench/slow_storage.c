/* Storage with latency: preloaded, each open and each read below the folder SLOW_FOLDER takes SLOW_MICROSECONDS more. At the end the most
   requests that were in flight at once are written to the file SLOW_REPORT. */
#define _GNU_SOURCE
#include <dlfcn.h>
#include <fcntl.h>
#include <stdarg.h>
#include <stdatomic.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/syscall.h>
#include <time.h>
#include <unistd.h>

enum { kDescriptors = 65536 };
static atomic_bool slow[kDescriptors];
static atomic_int inFlight, mostInFlight;
static atomic_long requests;

static void wait_as_storage(void)
{
    const char *text = getenv("SLOW_MICROSECONDS");
    const long microseconds = text != NULL ? atol(text) : 1000;
    const struct timespec time = {microseconds / 1000000, microseconds % 1000000 * 1000};
    const int now = atomic_fetch_add(&inFlight, 1) + 1;
    int most = atomic_load(&mostInFlight);
    while (most < now && !atomic_compare_exchange_weak(&mostInFlight, &most, now)) {
    }
    atomic_fetch_add(&requests, 1);
    nanosleep(&time, NULL);
    atomic_fetch_sub(&inFlight, 1);
}

static int is_slow(const char *path)
{
    const char *folder = getenv("SLOW_FOLDER");
    return path != NULL && folder != NULL && strncmp(path, folder, strlen(folder)) == 0;
}

static int opened(int descriptor, const char *path)
{
    if (descriptor >= 0 && descriptor < kDescriptors)
        atomic_store(&slow[descriptor], is_slow(path));
    return descriptor;
}

static void read_from(int descriptor)
{
    if (descriptor >= 0 && descriptor < kDescriptors && atomic_load(&slow[descriptor]))
        wait_as_storage();
}

#define NEXT(name) ((__typeof__(&name))dlsym(RTLD_NEXT, #name))
#define MODE(flags)                                                                                                    \
    mode_t mode = 0;                                                                                                   \
    if (((flags) & (O_CREAT | __O_TMPFILE)) != 0) {                                                                    \
        va_list list;                                                                                                  \
        va_start(list, flags);                                                                                         \
        mode = va_arg(list, mode_t);                                                                                   \
        va_end(list);                                                                                                  \
    }

int open(const char *path, int flags, ...)
{
    MODE(flags)
    if (is_slow(path))
        wait_as_storage();
    return opened(NEXT(open)(path, flags, mode), path);
}

int open64(const char *path, int flags, ...)
{
    MODE(flags)
    if (is_slow(path))
        wait_as_storage();
    return opened(NEXT(open64)(path, flags, mode), path);
}

int openat(int folder, const char *path, int flags, ...)
{
    MODE(flags)
    if (is_slow(path))
        wait_as_storage();
    return opened(NEXT(openat)(folder, path, flags, mode), path);
}

ssize_t read(int descriptor, void *bytes, size_t count)
{
    read_from(descriptor);
    return NEXT(read)(descriptor, bytes, count);
}

ssize_t pread(int descriptor, void *bytes, size_t count, off_t offset)
{
    read_from(descriptor);
    return NEXT(pread)(descriptor, bytes, count, offset);
}

ssize_t pread64(int descriptor, void *bytes, size_t count, off64_t offset)
{
    read_from(descriptor);
    return NEXT(pread64)(descriptor, bytes, count, offset);
}

/* The C library has no function of its own for openat2(). */
long syscall(long number, ...)
{
    va_list list;
    va_start(list, number);
    long a[6];
    for (int i = 0; i < 6; ++i)
        a[i] = va_arg(list, long);
    va_end(list);
    const char *path = number == SYS_openat2 ? (const char *)a[1] : NULL;
    if (is_slow(path))
        wait_as_storage();
    const long result = NEXT(syscall)(number, a[0], a[1], a[2], a[3], a[4], a[5]);
    if (path != NULL)
        opened((int)result, path);
    return result;
}

__attribute__((destructor)) static void report(void)
{
    const char *path = getenv("SLOW_REPORT");
    FILE *file = path != NULL ? fopen(path, "w") : NULL;
    if (file == NULL)
        return;
    fprintf(file, "%d %ld\n", atomic_load(&mostInFlight), atomic_load(&requests));
    fclose(file);
}
