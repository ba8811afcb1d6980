// Chooses the vectors of the fast roads over samples. KT_VECTORS marks each of their functions. For their .cpp files
// only.
#pragma once

#if defined(__x86_64__)

#define KT_AVX2
// Only the marked functions are compiled for AVX2; the library runs everywhere.
#define KT_VECTORS __attribute__((target("avx2")))

#elif defined(__aarch64__) && !defined(__AARCH64EB__)

#define KT_NEON
#define KT_VECTORS

#endif
