// KT_EXPORT marks what hosts may call; everything else in the library stays hidden.
#pragma once

#if defined(__GNUC__)
/// What hosts may call.
#define KT_EXPORT __attribute__((visibility("default")))
#else
#define KT_EXPORT
#endif
